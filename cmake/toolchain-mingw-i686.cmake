# Cross build of the shipped 32-bit Windows DLL with Debian's mingw-w64.
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR i686)
set(HV_TRIPLE i686-w64-mingw32)
# The posix thread model, as in the 64-bit build: GoogleTest needs std::mutex.
find_program(CMAKE_C_COMPILER ${HV_TRIPLE}-gcc-posix REQUIRED)
find_program(CMAKE_CXX_COMPILER ${HV_TRIPLE}-g++-posix REQUIRED)
find_program(CMAKE_RC_COMPILER ${HV_TRIPLE}-windres REQUIRED)
set(CMAKE_FIND_ROOT_PATH /usr/${HV_TRIPLE})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
