# Cross build of vantrel.dll for 32-bit Windows with MinGW-w64 (Debian: g++-mingw-w64-i686-posix).
#   cmake -S . -B build-win32 -DCMAKE_TOOLCHAIN_FILE=cmake/mingw-w64-i686.cmake
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR i686)

set(VANTREL_MINGW_TRIPLE i686-w64-mingw32)
# The posix-thread flavour is the one Debian installs as the default; take it by name when present.
find_program(VANTREL_MINGW_GCC NAMES ${VANTREL_MINGW_TRIPLE}-gcc-posix ${VANTREL_MINGW_TRIPLE}-gcc REQUIRED)
find_program(VANTREL_MINGW_GXX NAMES ${VANTREL_MINGW_TRIPLE}-g++-posix ${VANTREL_MINGW_TRIPLE}-g++ REQUIRED)
find_program(VANTREL_MINGW_WINDRES NAMES ${VANTREL_MINGW_TRIPLE}-windres REQUIRED)
set(CMAKE_C_COMPILER ${VANTREL_MINGW_GCC})
set(CMAKE_CXX_COMPILER ${VANTREL_MINGW_GXX})
set(CMAKE_RC_COMPILER ${VANTREL_MINGW_WINDRES})

set(CMAKE_FIND_ROOT_PATH /usr/${VANTREL_MINGW_TRIPLE})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)

# Doubles in SSE2 registers, as on x86-64, so that both builds round alike (x87 keeps 80-bit
# intermediates). Windows hosts may call in with a stack aligned to 4 bytes only: functions
# that need more realign it themselves.
set(CMAKE_C_FLAGS_INIT "-msse2 -mfpmath=sse -mincoming-stack-boundary=2")
set(CMAKE_CXX_FLAGS_INIT "-msse2 -mfpmath=sse -mincoming-stack-boundary=2")
