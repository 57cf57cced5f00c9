# Cross-compiling vexil for 32-bit Windows with Debian's mingw-w64 (posix thread model).
# Binaries link the C and C++ runtimes statically, so they import only system DLLs; wine runs them.
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR i686)
set(VEXIL_MINGW_TRIPLET i686-w64-mingw32)
set(CMAKE_C_COMPILER ${VEXIL_MINGW_TRIPLET}-gcc-posix)
set(CMAKE_CXX_COMPILER ${VEXIL_MINGW_TRIPLET}-g++-posix)
set(CMAKE_RC_COMPILER ${VEXIL_MINGW_TRIPLET}-windres)
set(CMAKE_MC_COMPILER ${VEXIL_MINGW_TRIPLET}-windmc)

# Only the target's own tree and the sysroot of cross-built dependencies are searched:
# never /usr/include, whose headers belong to the build machine.
set(CMAKE_FIND_ROOT_PATH /usr/${VEXIL_MINGW_TRIPLET} ${VEXIL_WINDOWS_SYSROOT})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)

set(CMAKE_EXE_LINKER_FLAGS_INIT "-static -static-libgcc -static-libstdc++")
set(CMAKE_SHARED_LINKER_FLAGS_INIT "-static -static-libgcc -static-libstdc++")
set(CMAKE_CROSSCOMPILING_EMULATOR wine)
