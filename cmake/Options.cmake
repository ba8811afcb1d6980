# How all of our own code is compiled: warnings, sanitizers, a compiler cache where there is one.

add_library(ktfiles_options INTERFACE)
target_compile_options(ktfiles_options INTERFACE
    -Wall -Wextra -Wshadow -Wconversion -Wsign-conversion -Wnon-virtual-dtor -Woverloaded-virtual -Wold-style-cast
    $<$<BOOL:${KTFILES_WERROR}>:-Werror>)

if(KTFILES_SANITIZE)
    target_compile_options(ktfiles_options INTERFACE
        -fsanitize=${KTFILES_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    target_link_options(ktfiles_options INTERFACE -fsanitize=${KTFILES_SANITIZE})
endif()

find_program(KTFILES_CCACHE ccache)
if(KTFILES_CCACHE AND NOT CMAKE_CXX_COMPILER_LAUNCHER)
    set(CMAKE_CXX_COMPILER_LAUNCHER ${KTFILES_CCACHE})
endif()
