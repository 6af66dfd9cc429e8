# SPDX-License-Identifier: Apache-2.0
# The library itself: the objects, which white-box tests link too, the shared and the static library.
if(ANDROID OR CMAKE_SYSTEM_PROCESSOR STREQUAL "wasm32")
  set(OVRINRESIZE_THREADS "") # a part of Android's libc; WebAssembly has none
else()
  find_package(Threads REQUIRED)
  set(OVRINRESIZE_THREADS Threads::Threads)
endif()

add_library(ovrinresize_objects OBJECT
  src/bilinear/plan.cpp
  src/bilinear/progressive.cpp
  src/bilinear/rows.cpp
  src/bilinear/single.cpp
  src/bilinear/threaded.cpp
  src/canvas/paint.cpp
  src/canvas/placement.cpp
  src/dispatch/wrappers.cpp
  src/kernels/bilinear_scalar.cpp
  src/kernels/cpu.cpp
  src/kernels/lanczos_scalar.cpp
  src/kernels/copy_scalar.cpp
  src/kernels/quarter_scalar.cpp
  src/kernels/select.cpp
  src/lanczos/rows.cpp
  src/lanczos/threaded.cpp
  src/lanczos/transform.cpp
  src/lanczos/weights.cpp
  src/nv21/nv21.cpp
  src/nv21/nv21_bands.cpp
  src/quarter/sampler.cpp
  src/quarter/scan.cpp
  src/quarter/threaded.cpp
  src/rgba/nearest.cpp
  src/rgba/rgb888.cpp
  src/rgba/rgba8888.cpp
  src/rgba/rgba_band.cpp
  src/rgba/rgba_keep_ratio.cpp
  src/yuv/planar.cpp
  src/yuv/planar_bands.cpp
  src/yuv420/bands.cpp
  src/yuv420/place.cpp
  src/yuv420/resize.cpp
  src/yuv420/work_buffer.cpp)
if(CMAKE_SYSTEM_PROCESSOR STREQUAL "wasm32")
  target_sources(ovrinresize_objects PRIVATE src/bands/pool_without_threads.cpp
    src/kernels/lanczos_wasm.cpp)
  if(OVRINRESIZE_SIMD128)
    target_sources(ovrinresize_objects PRIVATE src/kernels/bilinear_neon.cpp
      src/kernels/quarter_neon.cpp src/kernels/quarter_ratios_wasm.cpp)
  endif()
else()
  # The layout of records is given for 64-bit platforms.
  target_sources(ovrinresize_objects PRIVATE src/bands/pool.cpp src/bands/sleep.cpp
    src/dispatch/records.cpp src/pool/threadpool.cpp)
endif()
if(CMAKE_SYSTEM_PROCESSOR MATCHES "aarch64|arm64")
  target_sources(ovrinresize_objects PRIVATE src/kernels/bilinear_neon.cpp
    src/kernels/copy_neon.cpp src/kernels/lanczos_neon.cpp src/kernels/quarter_neon.cpp
    src/kernels/quarter_ratios_neon.cpp)
  # Otherwise atomics may call helpers of the compiler's run-time library.
  target_compile_options(ovrinresize_objects PRIVATE -mno-outline-atomics)
elseif(CMAKE_SYSTEM_PROCESSOR MATCHES "x86_64|AMD64")
  set(avx2_sources src/kernels/bilinear_avx2.cpp src/kernels/copy_avx2.cpp
    src/kernels/lanczos_avx2.cpp src/kernels/quarter_avx2.cpp
    src/kernels/quarter_ratios_avx2.cpp)
  set(avx512_sources src/kernels/bilinear_avx512.cpp
    src/kernels/lanczos_avx512.cpp src/kernels/quarter_avx512.cpp)
  target_sources(ovrinresize_objects PRIVATE ${avx2_sources} ${avx512_sources})
  set_source_files_properties(${avx2_sources} PROPERTIES COMPILE_OPTIONS "-mavx2;-mfma")
  set_source_files_properties(${avx512_sources} PROPERTIES COMPILE_OPTIONS
    "-mavx2;-mfma;-mavx512f;-mavx512bw;-mavx512dq;-mavx512vl;-mavx512vbmi")
endif()
set(OVRINRESIZE_KERNELS "" CACHE STRING
  "For tests: the only kernels to use (scalar, avx2, avx512, neon); empty: the processor's best")
if(OVRINRESIZE_KERNELS)
  set_source_files_properties(src/kernels/select.cpp PROPERTIES COMPILE_DEFINITIONS
    OVRIN_KERNELS="${OVRINRESIZE_KERNELS}")
endif()
set_target_properties(ovrinresize_objects PROPERTIES
  POSITION_INDEPENDENT_CODE ON
  UNITY_BUILD OFF # files have internal names in common
  CXX_VISIBILITY_PRESET hidden
  VISIBILITY_INLINES_HIDDEN ON)
target_include_directories(ovrinresize_objects
  PUBLIC ${PROJECT_SOURCE_DIR}/include
  PRIVATE ${PROJECT_SOURCE_DIR}/src)
# No C++ run-time library: no exceptions, no RTTI, no guarded statics.
target_compile_options(ovrinresize_objects PRIVATE
  -fno-exceptions -fno-rtti -fno-threadsafe-statics)
# The same bytes wherever it is built: debug information names files by their place in the project.
# Debug builds, and coverage with them, keep full names.
set(OVRINRESIZE_PREFIX_MAPS
  -ffile-prefix-map=${PROJECT_SOURCE_DIR}=. -ffile-prefix-map=${PROJECT_BINARY_DIR}=build)
target_compile_options(ovrinresize_objects PRIVATE
  "$<$<NOT:$<CONFIG:Debug>>:${OVRINRESIZE_PREFIX_MAPS}>")
target_link_libraries(ovrinresize_objects PRIVATE ovrinresize_warnings ${OVRINRESIZE_THREADS})

# BUILD_SHARED_LIBS chooses one of the two libraries; without it there are both. ovrinresize::ovrinresize
# is the shared one, where there is one.
if(NOT DEFINED BUILD_SHARED_LIBS OR NOT BUILD_SHARED_LIBS)
  # Names that are not the interface's are hidden, and in namespace ovrin: what links the library does
  # not export them.
  add_library(ovrinresize_static STATIC $<TARGET_OBJECTS:ovrinresize_objects>)
  add_library(ovrinresize::ovrinresize_static ALIAS ovrinresize_static)
  set_target_properties(ovrinresize_static PROPERTIES
    LINKER_LANGUAGE CXX
    OUTPUT_NAME ovrinresize
    ARCHIVE_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR})
  target_include_directories(ovrinresize_static INTERFACE
    $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>)
  target_link_libraries(ovrinresize_static PRIVATE ${OVRINRESIZE_THREADS} m)
endif()
if(DEFINED BUILD_SHARED_LIBS AND NOT BUILD_SHARED_LIBS)
  add_library(ovrinresize::ovrinresize ALIAS ovrinresize_static)
  return()
endif()

# The version script lists the functions that the public header declares, and nothing else.
set(OVRINRESIZE_HEADER ${PROJECT_SOURCE_DIR}/include/ovrinresize.h)
set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${OVRINRESIZE_HEADER})
file(STRINGS ${OVRINRESIZE_HEADER} declarations REGEX "^OVRIN_API .*\\(")
set(OVRINRESIZE_EXPORTS "")
set(OVRINRESIZE_FUNCTIONS "")
foreach(declaration IN LISTS declarations)
  string(REGEX MATCH "([A-Za-z_0-9]+)\\(" ignored "${declaration}")
  string(APPEND OVRINRESIZE_EXPORTS "        ${CMAKE_MATCH_1};\n")
  list(APPEND OVRINRESIZE_FUNCTIONS ${CMAKE_MATCH_1})
endforeach()
if(CMAKE_SYSTEM_PROCESSOR STREQUAL "wasm32")
  return() # cmake/Wasm.cmake makes a module of it instead
endif()
# Android's loader knows symbol versions only from API 23 on, and installs no file whose name does not
# end in .so: there, neither the functions nor the file have a version.
if(ANDROID)
  set(OVRINRESIZE_VERSION_NODE "")
else()
  set(OVRINRESIZE_VERSION_NODE "OVRINRESIZE_${PROJECT_VERSION_MAJOR} ")
endif()
configure_file(cmake/exports.map.in ${PROJECT_BINARY_DIR}/exports.map @ONLY)

add_library(ovrinresize SHARED $<TARGET_OBJECTS:ovrinresize_objects>)
add_library(ovrinresize::ovrinresize ALIAS ovrinresize)
set_target_properties(ovrinresize PROPERTIES
  LINKER_LANGUAGE CXX
  LINK_DEPENDS ${PROJECT_BINARY_DIR}/exports.map
  LIBRARY_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR})
if(NOT ANDROID)
  set_target_properties(ovrinresize PROPERTIES
    VERSION ${PROJECT_VERSION}
    SOVERSION ${PROJECT_VERSION_MAJOR})
endif()
target_include_directories(ovrinresize INTERFACE
  $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>)
# as-needed leaves out the C++ run-time library that the compiler driver would add. 16 KB pages:
# current Android devices refuse smaller alignment.
target_link_options(ovrinresize PRIVATE
  -Wl,--as-needed
  -Wl,-Bsymbolic-functions
  -Wl,--version-script=${PROJECT_BINARY_DIR}/exports.map
  -Wl,-z,relro,-z,now,-z,noexecstack
  -Wl,-z,max-page-size=16384,-z,common-page-size=16384)
if(ANDROID)
  # The older of the two hash tables is the only one that API 21 and 22 understand.
  target_link_options(ovrinresize PRIVATE -Wl,--hash-style=both)
endif()
if(NOT CMAKE_CXX_FLAGS MATCHES "-fsanitize")
  target_link_options(ovrinresize PRIVATE -Wl,--no-undefined)
endif()
target_link_libraries(ovrinresize PRIVATE ${OVRINRESIZE_THREADS} m)
