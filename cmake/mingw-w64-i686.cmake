# Cross-builds the module for 32-bit Windows with MinGW-w64:
#   cmake -S . -B build/win32 --toolchain cmake/mingw-w64-i686.cmake
# The generator still runs with the build machine's python3.
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR i686)

set(RNSAP_MINGW_TRIPLE i686-w64-mingw32)
set(CMAKE_C_COMPILER ${RNSAP_MINGW_TRIPLE}-gcc)
set(CMAKE_CXX_COMPILER ${RNSAP_MINGW_TRIPLE}-g++)
set(CMAKE_RC_COMPILER ${RNSAP_MINGW_TRIPLE}-windres)

# Headers and libraries from the MinGW sysroot, programs from the build machine.
set(CMAKE_FIND_ROOT_PATH /usr/${RNSAP_MINGW_TRIPLE})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
