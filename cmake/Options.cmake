# How all of our own code is compiled: warnings, sanitizers, a compiler cache where there is one.

add_library(ktfiles_options INTERFACE)
target_compile_options(ktfiles_options INTERFACE
    -Wall -Wextra -Wshadow -Wconversion -Wsign-conversion -Wnon-virtual-dtor -Woverloaded-virtual -Wold-style-cast
    $<$<BOOL:${KTFILES_WERROR}>:-Werror>)
# g++ 12 warns of overlaps that cannot be, in the library's own string concatenation (GCC bug 105651).
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13)
    target_compile_options(ktfiles_options INTERFACE -Wno-restrict)
endif()

if(KTFILES_SANITIZE)
    target_compile_options(ktfiles_options INTERFACE
        -fsanitize=${KTFILES_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    target_link_options(ktfiles_options INTERFACE -fsanitize=${KTFILES_SANITIZE})
endif()

find_program(KTFILES_CCACHE ccache)
if(KTFILES_CCACHE AND NOT CMAKE_CXX_COMPILER_LAUNCHER)
    set(CMAKE_CXX_COMPILER_LAUNCHER ${KTFILES_CCACHE})
endif()
