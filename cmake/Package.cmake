# `cpack -G DEB`: libktfiles0, libktfiles-dev, ktfiles; libktfiles-ffmpeg, libktfiles-taglib, libktfiles-ebur128 and python3-ktfiles where
# their modules are built.

set(CPACK_PACKAGE_NAME ktfiles)
set(CPACK_PACKAGE_VENDOR "KTFiles")
set(CPACK_PACKAGE_CONTACT "KTFiles maintainers <maintainers@ktfiles.invalid>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY ${PROJECT_DESCRIPTION})
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_COMPONENTS_ALL runtime development command)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_STRIP_FILES ON)
# So that the command's dependency on the library is found among what is being packaged.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${PROJECT_BINARY_DIR}/src)

set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME libktfiles${PROJECT_VERSION_MAJOR})
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_CONTROL_EXTRA ${PROJECT_SOURCE_DIR}/cmake/triggers)
set(CPACK_COMPONENT_RUNTIME_DESCRIPTION "The shared library")

if(TARGET ktfiles_decoders)
    list(APPEND CPACK_COMPONENTS_ALL decoders)
    list(APPEND recommended libktfiles-ffmpeg)
    set(CPACK_DEBIAN_DECODERS_PACKAGE_NAME libktfiles-ffmpeg)
    set(CPACK_DEBIAN_DECODERS_PACKAGE_SECTION libs)
    set(CPACK_DEBIAN_DECODERS_PACKAGE_DEPENDS "libktfiles${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION})")
    set(CPACK_COMPONENT_DECODERS_DESCRIPTION "Decoders of compressed audio for the shared library")
endif()

if(TARGET ktfiles_tags)
    list(APPEND CPACK_COMPONENTS_ALL tags)
    list(APPEND recommended libktfiles-taglib)
    set(CPACK_DEBIAN_TAGS_PACKAGE_NAME libktfiles-taglib)
    set(CPACK_DEBIAN_TAGS_PACKAGE_SECTION libs)
    set(CPACK_DEBIAN_TAGS_PACKAGE_DEPENDS "libktfiles${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION})")
    set(CPACK_COMPONENT_TAGS_DESCRIPTION "Tags of compressed audio for the shared library")
endif()

if(TARGET ktfiles_loudness)
    list(APPEND CPACK_COMPONENTS_ALL loudness)
    list(APPEND recommended libktfiles-ebur128)
    set(CPACK_DEBIAN_LOUDNESS_PACKAGE_NAME libktfiles-ebur128)
    set(CPACK_DEBIAN_LOUDNESS_PACKAGE_SECTION libs)
    set(CPACK_DEBIAN_LOUDNESS_PACKAGE_DEPENDS "libktfiles${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION})")
    set(CPACK_COMPONENT_LOUDNESS_DESCRIPTION "Measuring loudness by EBU R 128 for the shared library")
endif()
list(JOIN recommended ", " CPACK_DEBIAN_RUNTIME_PACKAGE_RECOMMENDS)

if(TARGET ktfiles_python)
    list(APPEND CPACK_COMPONENTS_ALL python)
    set(CPACK_DEBIAN_PYTHON_PACKAGE_NAME python3-ktfiles)
    set(CPACK_DEBIAN_PYTHON_PACKAGE_SECTION python)
    # The compiled part is of one version of Python, whose name Debian's python3 has an interval for.
    math(EXPR next_minor "${KTFILES_PYTHON_MINOR} + 1")
    set(CPACK_DEBIAN_PYTHON_PACKAGE_DEPENDS 
        "libktfiles${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION}), python3 (>= 3.${KTFILES_PYTHON_MINOR}~), python3 (<< 3.${next_minor}), python3-numpy")
    set(CPACK_COMPONENT_PYTHON_DESCRIPTION "The Python package ktfiles")
endif()

set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME libktfiles-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "libktfiles${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION})")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "Headers, CMake package and pkg-config file")

set(CPACK_DEBIAN_COMMAND_PACKAGE_NAME ktfiles)
set(CPACK_DEBIAN_COMMAND_PACKAGE_SECTION sound)
set(CPACK_DEBIAN_COMMAND_PACKAGE_DEPENDS "libktfiles${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION})")
set(CPACK_COMPONENT_COMMAND_DESCRIPTION "The command ktfiles")

include(CPack)
