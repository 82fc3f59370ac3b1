# Installs the libraries with their headers, a package config and a pkg-config file. Nothing that is installed names
# the prefix, so the tree can be moved as a whole.
include(CMakePackageConfigHelpers)

set(packageFolder ${CMAKE_INSTALL_LIBDIR}/cmake/VeldrinGeometry)

install(TARGETS VeldrinPlatform VeldrinGeometry
  EXPORT VeldrinGeometryTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
  FILE_SET HEADERS DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
install(EXPORT VeldrinGeometryTargets
  NAMESPACE Veldrin::
  DESTINATION ${packageFolder})

configure_package_config_file(
  ${CMAKE_CURRENT_LIST_DIR}/VeldrinGeometryConfig.cmake.in
  ${CMAKE_CURRENT_BINARY_DIR}/VeldrinGeometryConfig.cmake
  INSTALL_DESTINATION ${packageFolder})
write_basic_package_version_file(
  ${CMAKE_CURRENT_BINARY_DIR}/VeldrinGeometryConfigVersion.cmake
  COMPATIBILITY SameMinorVersion)
install(FILES
  ${CMAKE_CURRENT_BINARY_DIR}/VeldrinGeometryConfig.cmake
  ${CMAKE_CURRENT_BINARY_DIR}/VeldrinGeometryConfigVersion.cmake
  DESTINATION ${packageFolder})

# The .pc file finds its prefix from where it lies itself.
file(RELATIVE_PATH VELDRIN_PC_PREFIX
  ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
string(REGEX REPLACE "/$" "" VELDRIN_PC_PREFIX "${VELDRIN_PC_PREFIX}")
configure_file(
  ${CMAKE_CURRENT_LIST_DIR}/veldrin-geometry.pc.in
  ${CMAKE_CURRENT_BINARY_DIR}/veldrin-geometry.pc
  @ONLY)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/veldrin-geometry.pc
  DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
