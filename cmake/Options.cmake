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

# Sources of one folder are compiled eight at a time, which takes a third of the time: most of the work is in the headers that they
# share. Those that have a name of their own that a neighbour has too are compiled by themselves.
option(KTFILES_UNITY "Compile sources of a folder together" OFF)
set(KTFILES_LOT 8)

# kt_unity(TARGET [ALONE REGEX...]): what is compiled by itself is named from the target's folder.
function(kt_unity target)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" ALONE)
    if(NOT KTFILES_UNITY)
        return()
    endif()
    get_target_property(sources ${target} SOURCES)
    list(FILTER sources INCLUDE REGEX "[.]cpp$")
    list(SORT sources)
    list(JOIN arg_ALONE "|" alone)
    set(former "")
    foreach(source IN LISTS sources)
        cmake_path(RELATIVE_PATH source OUTPUT_VARIABLE relative)
        if(arg_ALONE AND relative MATCHES "^(${alone})[.]cpp$")
            continue()
        endif()
        cmake_path(GET relative PARENT_PATH folder)
        if(NOT folder STREQUAL former)
            set(count 0)
            set(former "${folder}")
        endif()
        math(EXPR lot "${count} / ${KTFILES_LOT}")
        math(EXPR count "${count} + 1")
        string(MAKE_C_IDENTIFIER "${folder}_${lot}" group)
        set_source_files_properties(${source} PROPERTIES UNITY_GROUP ${group})
    endforeach()
    set_target_properties(${target} PROPERTIES UNITY_BUILD ON UNITY_BUILD_MODE GROUP)
endfunction()
