# Compiler warnings and the sanitizer switches, applied to every target of the project.
# VEXIL_SANITIZE takes the -fsanitize= list: "address,undefined" or "thread". VEXIL_FUZZ
# (clang only) builds tests/fuzz as libFuzzer programs, so everything gets the coverage
# instrumentation they steer by.

if(VEXIL_SANITIZE)
  add_compile_options(-fsanitize=${VEXIL_SANITIZE} -fno-omit-frame-pointer -fno-sanitize-recover=undefined)
  add_link_options(-fsanitize=${VEXIL_SANITIZE})
endif()

option(VEXIL_COVERAGE "Instrument every target for gcov line and branch coverage (gcc)" OFF)
if(VEXIL_COVERAGE)
  # Atomic counters: the library's threads run the same code at once, and racing updates
  # leave counts gcovr cannot read (a branch "taken -2").
  add_compile_options(--coverage -O0 -fprofile-update=atomic)
  add_link_options(--coverage)
endif()

option(VEXIL_FUZZ "Build the fuzz targets with libFuzzer (clang)" OFF)
if(VEXIL_FUZZ)
  # RapidJSON's parse stack does arithmetic on its null start; that one check reports and
  # goes on, so tests/fuzz/ubsan.supp can silence it for RapidJSON alone.
  add_compile_options(-fsanitize=fuzzer-no-link -fsanitize-recover=pointer-overflow)
endif()

function(vexil_apply_warnings target)
  if(CMAKE_CXX_COMPILER_ID MATCHES "GNU|Clang")
    target_compile_options(${target} PRIVATE -Wall -Wextra -Wpedantic -Wno-unused-parameter)
  elseif(MSVC)
    target_compile_options(${target} PRIVATE /W4)
  endif()
endfunction()
