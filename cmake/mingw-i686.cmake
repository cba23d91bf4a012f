# The 32-bit Windows plug-in.
set(CAIRN_MINGW_ARCH i686)
include(${CMAKE_CURRENT_LIST_DIR}/mingw.cmake)
