# The Debian packages: cpack -G DEB --config <build folder>/CPackConfig.cmake
get_target_property(soversion tarn_client SOVERSION)
set(package_service tarnd)
set(package_tool tarnctl)
set(package_library libtarn${soversion})
set(package_development libtarn-dev)
set(package_python python3-tarn)
set(package_documentation tarn-doc)

# The changes of the program, and those of its packages, which are made anew from every version.
set(CPACK_PACKAGE_NAME tarn)
set(CPACK_PACKAGE_CONTACT "tarn developers <tarn@packages.invalid>")
set(CPACK_DEBIAN_PACKAGE_RELEASE 0tarn1) # older than any package of this version that Debian may come to have
set(package_version ${PROJECT_VERSION}-${CPACK_DEBIAN_PACKAGE_RELEASE})
string(TIMESTAMP package_date "%a, %d %b %Y %H:%M:%S +0000" UTC)
configure_file(debian/changelog.in changelog.Debian)
add_custom_command(OUTPUT changelog.gz changelog.Debian.gz VERBATIM
    DEPENDS ${PROJECT_SOURCE_DIR}/CHANGELOG.md ${CMAKE_CURRENT_BINARY_DIR}/changelog.Debian
    COMMAND gzip -9nc ${PROJECT_SOURCE_DIR}/CHANGELOG.md > changelog.gz
    COMMAND gzip -9nc changelog.Debian > changelog.Debian.gz)
add_custom_target(tarn_changelog ALL DEPENDS changelog.gz)

set(CPACK_COMPONENTS_ALL service tool library development python documentation)
foreach(part IN LISTS CPACK_COMPONENTS_ALL)
    install(FILES copyright ${CMAKE_CURRENT_BINARY_DIR}/changelog.gz ${CMAKE_CURRENT_BINARY_DIR}/changelog.Debian.gz
        DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/${package_${part}} COMPONENT ${part})
    string(TOUPPER ${part} PART)
    set(CPACK_DEBIAN_${PART}_PACKAGE_NAME ${package_${part}})
endforeach()

set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "") # each part has its own
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_GENERATOR DEB)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)

set(CPACK_COMPONENT_SERVICE_DESCRIPTION "background audio service
It plays audio files on behalf of other programs: without gaps, on behind a
closed screen, pausing for calls, and shown in the media controls. It starts
when the first program connects.")
set(CPACK_DEBIAN_SERVICE_PACKAGE_SECTION sound)
set(CPACK_DEBIAN_SERVICE_PACKAGE_RECOMMENDS "pipewire-pulse | pulseaudio, default-dbus-session-bus | dbus-session-bus")
set(CPACK_DEBIAN_SERVICE_PACKAGE_SUGGESTS tarnctl)
set(CPACK_DEBIAN_SERVICE_PACKAGE_CONTROL_EXTRA
    "${CMAKE_CURRENT_SOURCE_DIR}/debian/postinst;${CMAKE_CURRENT_SOURCE_DIR}/debian/prerm;${CMAKE_CURRENT_SOURCE_DIR}/debian/postrm")

set(CPACK_COMPONENT_TOOL_DESCRIPTION "plays audio files through tarnd from a terminal
It plays files with keys for pause, next, seek and rate, tells what the service
reads of a file, and sends it any command.")
set(CPACK_DEBIAN_TOOL_PACKAGE_SECTION sound)
set(CPACK_DEBIAN_TOOL_PACKAGE_RECOMMENDS tarnd)

set(CPACK_COMPONENT_LIBRARY_DESCRIPTION "client library of the background audio service tarnd
Programs in C++ play through the service with it.")
set(CPACK_DEBIAN_LIBRARY_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_LIBRARY_PACKAGE_RECOMMENDS tarnd)
configure_file(debian/libtarn.lintian-overrides.in ${package_library} @ONLY)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/${package_library}
    DESTINATION ${CMAKE_INSTALL_DATADIR}/lintian/overrides COMPONENT library)
file(WRITE ${CMAKE_CURRENT_BINARY_DIR}/shlibs "libtarn ${soversion} ${package_library} (>= ${package_version})\n")
set(CPACK_DEBIAN_LIBRARY_PACKAGE_CONTROL_EXTRA
    "${CMAKE_CURRENT_BINARY_DIR}/shlibs;${CMAKE_CURRENT_SOURCE_DIR}/debian/triggers")

set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "what programs that play through tarnd are built with
The headers of libtarn, its pkg-config and CMake package files, and the
messages of the service as .proto files for other languages.")
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "${package_library} (= ${package_version})")
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SUGGESTS tarn-doc)

set(CPACK_COMPONENT_PYTHON_DESCRIPTION "client library of the background audio service tarnd for Python
Programs in Python play through the service with it, blocking or on asyncio.
Their objects outlast a crash or an update of the service.")
set(CPACK_DEBIAN_PYTHON_PACKAGE_SECTION python)
set(CPACK_DEBIAN_PYTHON_PACKAGE_ARCHITECTURE all)
set(CPACK_DEBIAN_PYTHON_PACKAGE_DEPENDS "python3 (>= 3.11)")
set(CPACK_DEBIAN_PYTHON_PACKAGE_RECOMMENDS tarnd)

set(CPACK_COMPONENT_DOCUMENTATION_DESCRIPTION "documentation of the background audio service tarnd
The protocol, how to integrate the service, what the media controls see, what
to do when something does not play, and examples in C++, C and Python.")
set(CPACK_DEBIAN_DOCUMENTATION_PACKAGE_SECTION doc)
set(CPACK_DEBIAN_DOCUMENTATION_PACKAGE_ARCHITECTURE all)
include(CPack)
