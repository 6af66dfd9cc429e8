# SPDX-License-Identifier: Apache-2.0
# Headers, library, CMake package and pkg-config file.
include(CMakePackageConfigHelpers)

set(package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/ovrinresize)

install(TARGETS ovrinresize EXPORT ovrinresizeTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(FILES ${PROJECT_SOURCE_DIR}/include/ovrinresize.h
  ${PROJECT_SOURCE_DIR}/include/ovrinresize.hpp
  DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
install(EXPORT ovrinresizeTargets NAMESPACE ovrinresize:: DESTINATION ${package_dir}
  FILE ovrinresizeTargets.cmake)

configure_package_config_file(cmake/ovrinresizeConfig.cmake.in
  ${PROJECT_BINARY_DIR}/ovrinresizeConfig.cmake INSTALL_DESTINATION ${package_dir})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/ovrinresizeConfigVersion.cmake
  COMPATIBILITY SameMajorVersion)
install(FILES
  ${PROJECT_BINARY_DIR}/ovrinresizeConfig.cmake
  ${PROJECT_BINARY_DIR}/ovrinresizeConfigVersion.cmake
  DESTINATION ${package_dir})

# The prefix is found from where the file lies, so that an installed tree can be moved.
file(RELATIVE_PATH pc_to_prefix
  ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
configure_file(cmake/ovrinresize.pc.in ${PROJECT_BINARY_DIR}/ovrinresize.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/ovrinresize.pc
  DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
