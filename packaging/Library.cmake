# What a program needs to build with libtarn: its headers, libtarn.pc and find_package(tarn).
include(CMakePackageConfigHelpers)
set(package_folder ${CMAKE_INSTALL_LIBDIR}/cmake/tarn)

set_target_properties(tarn_client PROPERTIES EXPORT_NAME client)
install(TARGETS tarn_client EXPORT tarn
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT library NAMELINK_COMPONENT development)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/client/libtarn/include/
    DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT development)
install(EXPORT tarn NAMESPACE tarn:: FILE tarnConfig.cmake DESTINATION ${package_folder} COMPONENT development)
install(FILES ${PROJECT_SOURCE_DIR}/proto/velmo.proto ${PROJECT_SOURCE_DIR}/proto/transport.proto
    DESTINATION ${CMAKE_INSTALL_DATADIR}/tarn/proto COMPONENT development)
write_basic_package_version_file(tarnConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/tarnConfigVersion.cmake
    DESTINATION ${package_folder} COMPONENT development)

# Relative, so that an installation can be moved as a whole.
file(RELATIVE_PATH TARN_PREFIX_FROM_PKGCONFIG /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
configure_file(libtarn.pc.in libtarn.pc @ONLY)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/libtarn.pc
    DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)
