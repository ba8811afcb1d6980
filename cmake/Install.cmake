# What `make install` puts where: the library, its headers by room, the CMake package, the pkg-config file, the command.
# Components, which are also the packages: runtime, development, command; decoders, tags, loudness and server where the modules are built.

include(CMakePackageConfigHelpers)

install(TARGETS KTFiles EXPORT KTFilesTargets
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT development)

# Beside the library, where it looks for the modules.
if(TARGET ktfiles_decoders)
    install(TARGETS ktfiles_decoders LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}/ktfiles COMPONENT decoders)
endif()

if(TARGET ktfiles_tags)
    install(TARGETS ktfiles_tags LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}/ktfiles COMPONENT tags)
endif()

if(TARGET ktfiles_loudness)
    install(TARGETS ktfiles_loudness LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}/ktfiles COMPONENT loudness)
endif()

if(TARGET ktfiles_server)
    install(TARGETS ktfiles_server LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}/ktfiles COMPONENT server)
endif()

# The headers of implementations (platform/posix/ and the like) are nobody's business.
foreach(room platform/core platform files loops/tagging audiofile audiofile/fields audiofile/metadata files/registry loops loops/overview
        loops/tags adm adm/files coordination project)
    file(GLOB headers CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/src/${room}/*.h)
    install(FILES ${headers} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/KTFiles/${room} COMPONENT development)
endforeach()
# The interface for C has a name of its own in front of the rooms.
install(FILES ${PROJECT_SOURCE_DIR}/c/ktfiles.h DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT development)
# Of what knows sound, the services and the types that they speak in; the test house.arrows reads this list too.
set(media_headers
    media/samples/SampleConversion.h media/samples/SampleExtremes.h media/samples/SoundFacts.h
    media/samples/StreamDescription.h
    media/containers/AudioHandle.h media/containers/ByteSource.h media/containers/ContainerHeaders.h
    media/containers/ContainerCheck.h media/containers/ContainerTraits.h media/containers/HeaderWindow.h
    media/containers/StoredFormat.h
    media/packets/FileEnds.h media/packets/PacketTable.h
    media/decoding/CompressedAudio.h media/decoding/ConvertingReader.h
    media/loudness/LoudnessMeter.h
    media/tags/EmbeddedTags.h
    media/userdata/AudioFileService.h)
foreach(header IN LISTS media_headers)
    cmake_path(GET header PARENT_PATH room)
    install(FILES ${PROJECT_SOURCE_DIR}/src/${header} DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/KTFiles/${room}
        COMPONENT development)
endforeach()

set(package_folder ${CMAKE_INSTALL_LIBDIR}/cmake/KTFiles)
install(EXPORT KTFilesTargets NAMESPACE KTFiles:: DESTINATION ${package_folder} COMPONENT development)
configure_package_config_file(cmake/KTFilesConfig.cmake.in ${PROJECT_BINARY_DIR}/KTFilesConfig.cmake
    INSTALL_DESTINATION ${package_folder})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/KTFilesConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${PROJECT_BINARY_DIR}/KTFilesConfig.cmake ${PROJECT_BINARY_DIR}/KTFilesConfigVersion.cmake
    DESTINATION ${package_folder} COMPONENT development)

file(RELATIVE_PATH prefix_from_pc /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
string(REGEX REPLACE "/$" "" prefix_from_pc ${prefix_from_pc})
configure_file(cmake/KTFiles.pc.in ${PROJECT_BINARY_DIR}/KTFiles.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/KTFiles.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)

file(RELATIVE_PATH library_from_command ${CMAKE_INSTALL_FULL_BINDIR} ${CMAKE_INSTALL_FULL_LIBDIR})
set_target_properties(ktfiles PROPERTIES INSTALL_RPATH "$ORIGIN/${library_from_command}")
install(TARGETS ktfiles RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT command)
install(FILES tool/ktfiles.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT command)
file(GLOB schemas CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/docs/schemas/*.json)
install(FILES ${schemas} DESTINATION ${CMAKE_INSTALL_DATADIR}/ktfiles/schemas COMPONENT command)
install(FILES tool/ktfiles.bash DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions RENAME ktfiles
    COMPONENT command)
# The files that the examples of the man page name.
install(DIRECTORY examples/media/ DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/ktfiles/examples COMPONENT command USE_SOURCE_PERMISSIONS)
