# What an installed tree offers to builds that use it: a CMake package and a pkg-config file.
include(CMakePackageConfigHelpers)

set(package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/bt_service)
install(EXPORT bt_service NAMESPACE bt_service:: FILE bt_serviceTargets.cmake DESTINATION ${package_dir})
configure_package_config_file(cmake/bt_serviceConfig.cmake.in ${PROJECT_BINARY_DIR}/bt_serviceConfig.cmake
  INSTALL_DESTINATION ${package_dir})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/bt_serviceConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/bt_serviceConfig.cmake ${PROJECT_BINARY_DIR}/bt_serviceConfigVersion.cmake
  DESTINATION ${package_dir})

file(RELATIVE_PATH prefix_from_pkgconfig /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
string(REGEX REPLACE "/$" "" prefix_from_pkgconfig "${prefix_from_pkgconfig}")
configure_file(cmake/bt_service.pc.in ${PROJECT_BINARY_DIR}/bt_service.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/bt_service.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
