# What a panel needs to build against the installed liblumeris: lumeris.pc for pkg-config and a
# CMake package for find_package(Lumeris). The library and its headers are installed by their areas;
# all of it is the install component "panel-sdk" (cmake --install <build> --component panel-sdk).
include(CMakePackageConfigHelpers)
file(RELATIVE_PATH LUMERIS_PC_TO_PREFIX "/prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig" "/prefix")
configure_file(${CMAKE_CURRENT_LIST_DIR}/lumeris.pc.in ${CMAKE_CURRENT_BINARY_DIR}/lumeris.pc @ONLY)
set(LUMERIS_CMAKE_PACKAGE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/Lumeris)
configure_package_config_file(${CMAKE_CURRENT_LIST_DIR}/LumerisConfig.cmake.in
  ${CMAKE_CURRENT_BINARY_DIR}/LumerisConfig.cmake
  INSTALL_DESTINATION ${LUMERIS_CMAKE_PACKAGE_DIR}
  PATH_VARS CMAKE_INSTALL_LIBDIR CMAKE_INSTALL_INCLUDEDIR)
write_basic_package_version_file(${CMAKE_CURRENT_BINARY_DIR}/LumerisConfigVersion.cmake
  VERSION ${PROJECT_VERSION} COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/lumeris.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT panel-sdk)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/LumerisConfig.cmake ${CMAKE_CURRENT_BINARY_DIR}/LumerisConfigVersion.cmake
  DESTINATION ${LUMERIS_CMAKE_PACKAGE_DIR} COMPONENT panel-sdk)
