# Debian's arm64.
set(KTFILES_CROSS arm64)
set(CMAKE_SYSTEM_PROCESSOR aarch64)
include(${CMAKE_CURRENT_LIST_DIR}/Cross.cmake)
