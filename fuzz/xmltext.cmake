# kt_add_xmltext(TARGET): XML that is edited as text, which belongs to the command and not to a room.
function(kt_add_xmltext target)
    find_package(fmt REQUIRED)
    target_sources(${target} PRIVATE ${PROJECT_SOURCE_DIR}/tool/meta/XMLText.cpp)
    target_include_directories(${target} PRIVATE ${PROJECT_SOURCE_DIR})
    target_link_libraries(${target} PRIVATE fmt::fmt)
endfunction()
