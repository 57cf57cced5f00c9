# What differs between the native Linux build and the cross-built Windows one: where
# RapidJSON and GoogleTest come from, and where binaries land so the DLL sits beside them.

# RapidJSON is header-only; the cross build gets a private copy of its headers so that
# the build machine's /usr/include never reaches the cross compiler.
function(vexil_rapidjson_include out)
  if(NOT CMAKE_CROSSCOMPILING)
    set(${out} "" PARENT_SCOPE)
    return()
  endif()
  set(private "${CMAKE_BINARY_DIR}/private-include")
  if(NOT EXISTS "${private}/rapidjson/rapidjson.h")
    file(COPY /usr/include/rapidjson DESTINATION "${private}")
  endif()
  set(${out} "${private}" PARENT_SCOPE)
endfunction()

# GoogleTest: the installed package natively, Debian's sources built for the target otherwise.
macro(vexil_find_gtest)
  if(CMAKE_CROSSCOMPILING)
    set(INSTALL_GTEST OFF CACHE BOOL "" FORCE)
    add_subdirectory(/usr/src/googletest "${CMAKE_BINARY_DIR}/googletest" EXCLUDE_FROM_ALL)
    foreach(lib gtest gtest_main gmock)
      if(NOT TARGET GTest::${lib})
        add_library(GTest::${lib} ALIAS ${lib})
      endif()
    endforeach()
  else()
    find_package(GTest REQUIRED)
  endif()
endmacro()

if(WIN32)
  # Windows finds DLLs beside the executable: keep every binary in one directory.
  set(CMAKE_RUNTIME_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/bin")
  set(CMAKE_LIBRARY_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/bin")
endif()

# Under an emulator, tests are listed when ctest runs rather than after each link.
if(CMAKE_CROSSCOMPILING)
  set(VEXIL_DISCOVERY_MODE PRE_TEST)
else()
  set(VEXIL_DISCOVERY_MODE POST_BUILD)
endif()
