# Cross-compiles for 64-bit Windows with Debian's MinGW-w64 (package g++-mingw-w64-x86-64-posix).
# The POSIX thread model is the one whose libstdc++ has std::thread and std::mutex.
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR x86_64)

set(PINFORGE_MINGW_PREFIX x86_64-w64-mingw32)
set(CMAKE_C_COMPILER ${PINFORGE_MINGW_PREFIX}-gcc-posix)
set(CMAKE_CXX_COMPILER ${PINFORGE_MINGW_PREFIX}-g++-posix)
set(CMAKE_RC_COMPILER ${PINFORGE_MINGW_PREFIX}-windres)

set(CMAKE_FIND_ROOT_PATH /usr/${PINFORGE_MINGW_PREFIX})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)

# Test binaries run under Wine on the build machine.
find_program(PINFORGE_WINE NAMES wine wine64)
if(PINFORGE_WINE)
  set(CMAKE_CROSSCOMPILING_EMULATOR ${PINFORGE_WINE})
endif()
