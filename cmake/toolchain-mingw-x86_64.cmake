# Cross build of the 64-bit Windows module and programs, run under Wine, with Debian's mingw-w64.
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR x86_64)
set(HV_TRIPLE x86_64-w64-mingw32)
# The posix thread model: GoogleTest needs std::mutex, which the win32 model lacks.
find_program(CMAKE_C_COMPILER ${HV_TRIPLE}-gcc-posix REQUIRED)
find_program(CMAKE_CXX_COMPILER ${HV_TRIPLE}-g++-posix REQUIRED)
find_program(CMAKE_RC_COMPILER ${HV_TRIPLE}-windres REQUIRED)
set(CMAKE_FIND_ROOT_PATH /usr/${HV_TRIPLE})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
