# What a program needs to build with libtarn: its headers, libtarn.pc and find_package(tarn).
include(CMakePackageConfigHelpers)
set(package_folder ${CMAKE_INSTALL_LIBDIR}/cmake/tarn)

set_target_properties(tarn_client PROPERTIES EXPORT_NAME client)
install(TARGETS tarn_client EXPORT tarn DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(DIRECTORY ${PROJECT_SOURCE_DIR}/client/libtarn/include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
install(EXPORT tarn NAMESPACE tarn:: FILE tarnConfig.cmake DESTINATION ${package_folder})
write_basic_package_version_file(tarnConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/tarnConfigVersion.cmake DESTINATION ${package_folder})

# Relative, so that an installation can be moved as a whole.
file(RELATIVE_PATH TARN_PREFIX_FROM_PKGCONFIG /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
configure_file(libtarn.pc.in libtarn.pc @ONLY)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/libtarn.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
