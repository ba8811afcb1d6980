# How all of our own code is compiled: warnings, sanitizers, a compiler cache where there is one.

option(KTFILES_UNITY "Compile sources of a target together" OFF)

add_library(ktfiles_options INTERFACE)
target_compile_options(ktfiles_options INTERFACE
    -Wall -Wextra -Wconversion -Wsign-conversion -Wnon-virtual-dtor -Woverloaded-virtual -Wold-style-cast
    $<$<BOOL:${KTFILES_WERROR}>:-Werror>)
# g++ 12 warns of overlaps that cannot be, in the library's own string concatenation (GCC bug 105651).
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13)
    target_compile_options(ktfiles_options INTERFACE -Wno-restrict)
endif()

# Sources that are compiled together do not shadow what a neighbour named, and are no headers, whose classes must not be over those of an
# anonymous namespace.
if(KTFILES_UNITY AND CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    target_compile_options(ktfiles_options INTERFACE -Wshadow=local -Wno-subobject-linkage)
elseif(NOT KTFILES_UNITY)
    target_compile_options(ktfiles_options INTERFACE -Wshadow)
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

# Sources of a target are compiled some thirty at a time, which takes a quarter of the time: most of the work is in the headers that
# they share. Those that have a name of their own that a neighbour has too are compiled by themselves.
set(KTFILES_LOT 30)

# kt_unity(TARGET [ALONE REGEX...]): what is compiled by itself is named from the target's folder.
function(kt_unity target)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" ALONE)
    if(NOT KTFILES_UNITY)
        return()
    endif()
    get_target_property(sources ${target} SOURCES)
    list(FILTER sources INCLUDE REGEX "[.]cpp$")
    list(SORT sources)
    list(TRANSFORM sources REPLACE "^${CMAKE_CURRENT_SOURCE_DIR}/" "")
    list(JOIN arg_ALONE "|" alone)
    if(arg_ALONE)
        list(FILTER sources EXCLUDE REGEX "^(${alone})[.]cpp$")
    endif()
    # Lots of one size, so that no processor is left with the largest.
    list(LENGTH sources all)
    math(EXPR lots "(${all} + ${KTFILES_LOT} - 1) / ${KTFILES_LOT}")
    set(count 0)
    foreach(source IN LISTS sources)
        math(EXPR lot "${count} * ${lots} / ${all}")
        math(EXPR count "${count} + 1")
        set_source_files_properties(${source} PROPERTIES UNITY_GROUP ${target}_${lot})
    endforeach()
    set_target_properties(${target} PROPERTIES UNITY_BUILD ON UNITY_BUILD_MODE GROUP)
endfunction()
