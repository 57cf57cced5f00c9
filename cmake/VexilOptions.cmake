# Compiler warnings and the sanitizer switch, applied to every target of the project.
# VEXIL_SANITIZE takes the -fsanitize= list: "address,undefined" or "thread".

if(VEXIL_SANITIZE)
  add_compile_options(-fsanitize=${VEXIL_SANITIZE} -fno-omit-frame-pointer -fno-sanitize-recover=undefined)
  add_link_options(-fsanitize=${VEXIL_SANITIZE})
endif()

function(vexil_apply_warnings target)
  if(CMAKE_CXX_COMPILER_ID MATCHES "GNU|Clang")
    target_compile_options(${target} PRIVATE -Wall -Wextra -Wpedantic -Wno-unused-parameter)
  elseif(MSVC)
    target_compile_options(${target} PRIVATE /W4)
  endif()
endfunction()
