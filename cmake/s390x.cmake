# Debian's s390x, which is big-endian.
set(KTFILES_CROSS s390x)
set(CMAKE_SYSTEM_PROCESSOR s390x)
include(${CMAKE_CURRENT_LIST_DIR}/Cross.cmake)
