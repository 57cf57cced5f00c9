# Script (cmake -P): fails naming every header under INCLUDE_DIR/vexil that vexil/vexil.h
# does not include.
file(READ "${INCLUDE_DIR}/vexil/vexil.h" umbrella)
file(GLOB_RECURSE headers RELATIVE "${INCLUDE_DIR}" "${INCLUDE_DIR}/vexil/*.h")
set(missing "")
foreach(header IN LISTS headers)
  string(FIND "${umbrella}" "#include \"${header}\"" at)
  if(at EQUAL -1 AND NOT header STREQUAL "vexil/vexil.h")
    list(APPEND missing "${header}")
  endif()
endforeach()
if(missing)
  message(FATAL_ERROR "vexil/vexil.h does not include: ${missing}")
endif()
