# The sources of the page of a library, built into the command.
set(page_web ${CMAKE_CURRENT_LIST_DIR}/web)
file(GLOB page_files CONFIGURE_DEPENDS ${page_web}/*)
set(page_sources ${CMAKE_CURRENT_BINARY_DIR}/PageSources.cpp)
add_custom_command(OUTPUT ${page_sources}
    COMMAND ${CMAKE_COMMAND} -DOUT=${page_sources} -DFOLDER=${page_web} -P ${CMAKE_CURRENT_LIST_DIR}/embed.cmake
    DEPENDS ${page_files} ${CMAKE_CURRENT_LIST_DIR}/embed.cmake
    VERBATIM)
target_sources(ktfiles PRIVATE ${page_sources})
