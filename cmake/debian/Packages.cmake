# SPDX-License-Identifier: Apache-2.0
# Debian packages by CPack: the library, what programs are compiled with, the tool, and the Python
# package. For a build whose folders are Debian's, which the preset "deb" sets.
set(library_package libovrinresize${PROJECT_VERSION_MAJOR})
# Debian's own packages of this version would begin with 1, and replace these.
set(CPACK_DEBIAN_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_DEBIAN_PACKAGE_RELEASE 0upstream1)
set(debian_version ${CPACK_DEBIAN_PACKAGE_VERSION}-${CPACK_DEBIAN_PACKAGE_RELEASE})

set(OVRINRESIZE_MAINTAINER "libovrinresize maintainers <maintainers@ovrinresize.invalid>" CACHE STRING
  "Who made the packages")
set(CPACK_PACKAGE_CONTACT ${OVRINRESIZE_MAINTAINER})
set(CPACK_PACKAGE_NAME ovrinresize)
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "") # each package has its own as its first line
set(CPACK_PACKAGE_DIRECTORY ${PROJECT_BINARY_DIR}/packages)
set(CPACK_GENERATOR DEB)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_GROUPING ONE_PER_GROUP)
set(CPACK_COMPONENTS_ALL runtime development tool python)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SOURCE ovrinresize)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)

set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME ${library_package})
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SECTION libs)
set(CPACK_COMPONENT_RUNTIME_DESCRIPTION "resizing of raw pictures in memory
This library resizes pictures that lie in memory as RGBA8888, RGB888, planar
YUV 4:2:0 (I420) or NV21, with a quarter-point, a bilinear, a Lanczos or a
nearest-neighbour resampler. The same input gives the same bytes on every
processor. It has a C interface and needs nothing but the C library.")
set(CPACK_DEBIAN_RUNTIME_PACKAGE_CONTROL_EXTRA
  ${PROJECT_BINARY_DIR}/debian/shlibs ${CMAKE_CURRENT_LIST_DIR}/triggers)

set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME libovrinresize-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "${library_package} (= ${debian_version}), libc6-dev")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "resizing of raw pictures in memory - development files
This package has what programs that use libovrinresize are compiled with: the
headers for C and for C++17, the static library, files for CMake and
pkg-config, and the documents.")

set(CPACK_DEBIAN_TOOL_PACKAGE_NAME ovrinresize)
set(CPACK_DEBIAN_TOOL_PACKAGE_SECTION graphics)
set(CPACK_DEBIAN_TOOL_PACKAGE_SHLIBDEPS ON)
set(CPACK_COMPONENT_TOOL_DESCRIPTION "resize pictures and video frames
This package has the command ovrinresize, which resizes PNG and JPEG pictures,
PPM, Y4M video and raw frames with the resamplers of libovrinresize. It turns
photographs upright, keeps their colour profile and metadata, and takes many
files at once.")

# Its module is of one version of the interpreter, and has the library in it.
set(CPACK_DEBIAN_PYTHON_PACKAGE_NAME python3-ovrinresize)
set(CPACK_DEBIAN_PYTHON_PACKAGE_SECTION python)
set(CPACK_DEBIAN_PYTHON_PACKAGE_SHLIBDEPS ON)
find_package(Python REQUIRED COMPONENTS Interpreter)
math(EXPR next_minor "${Python_VERSION_MINOR} + 1")
set(CPACK_DEBIAN_PYTHON_PACKAGE_DEPENDS "python3-numpy, python3 (<< 3.${next_minor}), \
python3 (>= 3.${Python_VERSION_MINOR}~)")
set(CPACK_DEBIAN_PYTHON_PACKAGE_CONTROL_EXTRA
  ${CMAKE_CURRENT_LIST_DIR}/python/postinst ${CMAKE_CURRENT_LIST_DIR}/python/prerm)
set(CPACK_COMPONENT_PYTHON_DESCRIPTION "resizing of raw pictures in memory - Python 3
This package has the module ovrinresize, which resizes pictures in numpy arrays
with the resamplers of libovrinresize: RGBA, RGB, I420 and NV21. It checks all
that it is given, and releases the interpreter's lock while it works.")
install(TARGETS ovrinresize_python
  LIBRARY DESTINATION lib/python3/dist-packages/ovrinresize COMPONENT python)
install(DIRECTORY bindings/python/src/ovrinresize DESTINATION lib/python3/dist-packages
  COMPONENT python PATTERN __pycache__ EXCLUDE)

# What a program needs that was linked with this library.
file(WRITE ${PROJECT_BINARY_DIR}/debian/shlibs
  "libovrinresize ${PROJECT_VERSION_MAJOR} ${library_package} (>= ${PROJECT_VERSION})\n")
string(TIMESTAMP debian_date "%a, %d %b %Y %H:%M:%S +0000" UTC)
configure_file(${CMAKE_CURRENT_LIST_DIR}/changelog.in ${PROJECT_BINARY_DIR}/debian/changelog @ONLY)
foreach(component RUNTIME DEVELOPMENT TOOL PYTHON)
  string(TOLOWER ${component} name)
  set(folder ${CMAKE_INSTALL_DATADIR}/doc/${CPACK_DEBIAN_${component}_PACKAGE_NAME})
  install(FILES ${CMAKE_CURRENT_LIST_DIR}/copyright DESTINATION ${folder} COMPONENT ${name})
  install(FILES ${PROJECT_BINARY_DIR}/debian/changelog DESTINATION ${folder} COMPONENT ${name}
    RENAME changelog.Debian)
  install(FILES CHANGELOG.md DESTINATION ${folder} COMPONENT ${name} RENAME changelog)
endforeach()
set(CPACK_PRE_BUILD_SCRIPTS ${CMAKE_CURRENT_LIST_DIR}/Stage.cmake)
include(CPack)
