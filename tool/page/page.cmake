# The sources of the page of a library, built into the command.
set(page_web ${CMAKE_CURRENT_LIST_DIR}/web)
file(GLOB page_files CONFIGURE_DEPENDS ${page_web}/*)
set(page_sources ${CMAKE_CURRENT_BINARY_DIR}/PageSources.cpp)
add_custom_command(OUTPUT ${page_sources}
    COMMAND ${CMAKE_COMMAND} -DOUT=${page_sources} -DFOLDER=${page_web} -P ${CMAKE_CURRENT_LIST_DIR}/embed.cmake
    DEPENDS ${page_files} ${CMAKE_CURRENT_LIST_DIR}/embed.cmake
    VERBATIM)
target_sources(ktfiles PRIVATE ${page_sources})

# The server, which the command loads when it is asked to serve a page.
if(KTFILES_WITH_SERVER)
    file(GLOB server_sources CONFIGURE_DEPENDS ${CMAKE_CURRENT_LIST_DIR}/server/*.cpp)
    add_library(ktfiles_server MODULE ${server_sources})
    target_include_directories(ktfiles_server PRIVATE ${PROJECT_SOURCE_DIR})
    target_link_libraries(ktfiles_server PRIVATE ktfiles_options ktfiles_headers PkgConfig::httplib Threads::Threads)
    target_link_options(ktfiles_server PRIVATE -Wl,--as-needed)
    set_target_properties(ktfiles_server PROPERTIES OUTPUT_NAME ktfiles-server
        LIBRARY_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/src/ktfiles)
    add_dependencies(ktfiles ktfiles_server)
endif()
