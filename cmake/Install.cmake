# SPDX-License-Identifier: Apache-2.0
# Headers, libraries, CMake package, pkg-config file, licence and documents.
include(CMakePackageConfigHelpers)

set(package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/ovrinresize)

set(libraries "")
foreach(target ovrinresize ovrinresize_static)
  if(TARGET ${target})
    list(APPEND libraries ${target})
  endif()
endforeach()
install(TARGETS ${libraries} EXPORT ovrinresizeTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT development
  ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT development
  INCLUDES DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
install(FILES ${PROJECT_SOURCE_DIR}/include/ovrinresize.h
  ${PROJECT_SOURCE_DIR}/include/ovrinresize.hpp
  DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT development)
install(EXPORT ovrinresizeTargets NAMESPACE ovrinresize:: DESTINATION ${package_dir}
  FILE ovrinresizeTargets.cmake COMPONENT development)

configure_package_config_file(cmake/ovrinresizeConfig.cmake.in
  ${PROJECT_BINARY_DIR}/ovrinresizeConfig.cmake INSTALL_DESTINATION ${package_dir})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/ovrinresizeConfigVersion.cmake
  COMPATIBILITY SameMajorVersion)
install(FILES
  ${PROJECT_BINARY_DIR}/ovrinresizeConfig.cmake
  ${PROJECT_BINARY_DIR}/ovrinresizeConfigVersion.cmake
  DESTINATION ${package_dir} COMPONENT development)

# Relative folders are found from where the pkg-config file lies, so that an installed tree can be
# moved; absolute ones stay where they are.
if(IS_ABSOLUTE ${CMAKE_INSTALL_LIBDIR})
  set(pc_prefix ${CMAKE_INSTALL_PREFIX})
else()
  file(RELATIVE_PATH pc_to_prefix
    ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
  set(pc_prefix "\${pcfiledir}/${pc_to_prefix}")
endif()
foreach(folder LIBDIR INCLUDEDIR)
  if(IS_ABSOLUTE ${CMAKE_INSTALL_${folder}})
    set(pc_${folder} ${CMAKE_INSTALL_${folder}})
  else()
    set(pc_${folder} "\${prefix}/${CMAKE_INSTALL_${folder}}")
  endif()
endforeach()
# What a static library needs, everybody must be told when there is no other.
if(TARGET ovrinresize)
  set(pc_libs "")
  set(pc_libs_private "-pthread -lm")
else()
  set(pc_libs " -pthread -lm")
  set(pc_libs_private "")
endif()
configure_file(cmake/ovrinresize.pc.in ${PROJECT_BINARY_DIR}/ovrinresize.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/ovrinresize.pc
  DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)

install(FILES LICENSE README.md CHANGELOG.md SECURITY.md
  DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT development)
install(DIRECTORY docs DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT development)
install(DIRECTORY examples DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT development
  FILES_MATCHING PATTERN "*.c" PATTERN batch EXCLUDE)

if(OVRINRESIZE_IS_TOP)
  add_custom_target(uninstall
    COMMAND ${CMAKE_COMMAND} -DMANIFEST=${PROJECT_BINARY_DIR}/install_manifest.txt
      -P ${PROJECT_SOURCE_DIR}/cmake/Uninstall.cmake
    VERBATIM)
endif()
