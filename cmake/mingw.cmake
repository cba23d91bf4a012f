# Cross-compiles the Windows plug-in with Debian's mingw-w64 toolchain for
# CAIRN_MINGW_ARCH (i686 or x86_64), set by the toolchain file that includes
# this one.
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR ${CAIRN_MINGW_ARCH})
# The POSIX thread model: the plug-in guards its open archives with
# std::mutex, which the win32 model of this toolchain lacks. winpthreads is
# linked in statically.
set(CMAKE_C_COMPILER ${CAIRN_MINGW_ARCH}-w64-mingw32-gcc-posix)
set(CMAKE_CXX_COMPILER ${CAIRN_MINGW_ARCH}-w64-mingw32-g++-posix)
set(CMAKE_RC_COMPILER ${CAIRN_MINGW_ARCH}-w64-mingw32-windres)
set(CMAKE_FIND_ROOT_PATH /usr/${CAIRN_MINGW_ARCH}-w64-mingw32)
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
