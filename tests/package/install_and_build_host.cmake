# Script of the packaging test (cmake -P): install, build the example host against the
# installed package, run it, and check what the pkg-config file says.
function(run)
  execute_process(COMMAND ${ARGN} RESULT_VARIABLE status OUTPUT_VARIABLE output ERROR_VARIABLE errors)
  if(NOT status EQUAL 0)
    message(FATAL_ERROR "failed: ${ARGN}\n${output}\n${errors}")
  endif()
  set(output "${output}" PARENT_SCOPE)
endfunction()

file(REMOVE_RECURSE "${PREFIX}" "${WORK}")
run("${CMAKE_COMMAND}" --install "${BUILD_DIR}" --prefix "${PREFIX}")

# A host built without the library's sanitizer could not load the instrumented library.
set(flags "")
if(SANITIZE)
  set(flags "-fsanitize=${SANITIZE}")
endif()
run("${CMAKE_COMMAND}" -S "${HOST_SOURCE}" -B "${WORK}" -G "${GENERATOR}" "-DCMAKE_CXX_COMPILER=${CXX}"
    "-DCMAKE_PREFIX_PATH=${PREFIX}" "-DCMAKE_CXX_FLAGS=${flags}" "-DCMAKE_EXE_LINKER_FLAGS=${flags}")
run("${CMAKE_COMMAND}" --build "${WORK}")

# main.cpp line 15, column 18: the call of shapes::Clamp.
run("${WORK}/vexil_host" "${EXAMPLE}" 15 18)
if(NOT output MATCHES "int Clamp\\(int value, int low, int high\\)")
  message(FATAL_ERROR "the hover of Clamp does not show its declaration:\n${output}")
endif()

file(GLOB_RECURSE pc_files "${PREFIX}/*/vexil.pc")
list(GET pc_files 0 pc_file)
get_filename_component(pc_dir "${pc_file}" DIRECTORY)
set(ENV{PKG_CONFIG_PATH} "${pc_dir}")
run(pkg-config --cflags --libs vexil)
if(NOT output MATCHES "-I[^ ]*/include" OR NOT output MATCHES "-lvexil")
  message(FATAL_ERROR "pkg-config gives: ${output}")
endif()
run(pkg-config --variable=includedir vexil)
string(STRIP "${output}" includedir)
if(NOT EXISTS "${includedir}/vexil/vexil.h")
  message(FATAL_ERROR "pkg-config's includedir ${includedir} holds no vexil/vexil.h")
endif()
