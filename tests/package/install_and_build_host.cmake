# Script of the packaging test (cmake -P): builds the Debian packages, extracts them with
# dpkg-deb into a scratch root, and builds and runs the example host against that root
# twice: through the CMake package, and with pkg-config under another language standard.
function(run)
  execute_process(COMMAND ${ARGN} RESULT_VARIABLE status OUTPUT_VARIABLE output ERROR_VARIABLE errors)
  if(NOT status EQUAL 0)
    message(FATAL_ERROR "failed: ${ARGN}\n${output}\n${errors}")
  endif()
  set(output "${output}" PARENT_SCOPE)
endfunction()

# main.cpp line 15, column 18: the call of shapes::Clamp. Run from the example's directory
# with a relative path, as a person would.
function(expect_hover host)
  get_filename_component(example_dir "${EXAMPLE}" DIRECTORY)
  get_filename_component(example_name "${EXAMPLE}" NAME)
  execute_process(COMMAND "${host}" "${example_name}" 15 18 WORKING_DIRECTORY "${example_dir}"
    RESULT_VARIABLE status OUTPUT_VARIABLE output ERROR_VARIABLE errors)
  if(NOT status EQUAL 0 OR NOT output MATCHES "int Clamp\\(int value, int low, int high\\)")
    message(FATAL_ERROR "${host}: the hover of Clamp does not show its declaration:\n${output}\n${errors}")
  endif()
endfunction()

file(REMOVE_RECURSE "${WORK}")
run(cpack --config "${BUILD_DIR}/CPackConfig.cmake" -B "${WORK}/debs")
file(GLOB debs "${WORK}/debs/*.deb")
list(LENGTH debs count)
if(NOT count EQUAL 3)
  message(FATAL_ERROR "expected three packages, found: ${debs}")
endif()
foreach(deb IN LISTS debs)
  run(dpkg-deb -x "${deb}" "${WORK}/root")
endforeach()
set(usr "${WORK}/root/usr")

# A host built without the library's sanitizer could not load the instrumented library.
set(flags "")
if(SANITIZE)
  set(flags "-fsanitize=${SANITIZE}")
endif()
run("${CMAKE_COMMAND}" -S "${HOST_SOURCE}" -B "${WORK}/host" -G "${GENERATOR}" "-DCMAKE_CXX_COMPILER=${CXX}"
    "-DCMAKE_PREFIX_PATH=${usr}" "-DCMAKE_CXX_FLAGS=${flags}" "-DCMAKE_EXE_LINKER_FLAGS=${flags}")
run("${CMAKE_COMMAND}" --build "${WORK}/host")
expect_hover("${WORK}/host/vexil_host")

# pkg-config imposes no language standard; the library is found at run time through the
# rpath given at link time, as the README says.
set(ENV{PKG_CONFIG_PATH} "${usr}/lib/pkgconfig")
run(pkg-config --cflags --libs vexil)
separate_arguments(pkg_flags UNIX_COMMAND "${output}")
if(output MATCHES "-std=")
  message(FATAL_ERROR "pkg-config imposes a language standard: ${output}")
endif()
run("${CXX}" -std=c++20 ${flags} "${HOST_SOURCE}/host.cpp" -o "${WORK}/host-pc" ${pkg_flags} "-Wl,-rpath,${usr}/lib")
expect_hover("${WORK}/host-pc")

set(ENV{LD_LIBRARY_PATH} "${usr}/lib")
run("${usr}/bin/vexil" --version)
if(NOT output MATCHES "^vexil ")
  message(FATAL_ERROR "the packaged vexil says: ${output}")
endif()
