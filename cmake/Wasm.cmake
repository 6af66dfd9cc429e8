# SPDX-License-Identifier: Apache-2.0
# The library as a WebAssembly module, for bindings/js. It exports those functions of the header that
# touch pixels, and the C library's malloc and free; it imports nothing.
set(native_dir ${PROJECT_SOURCE_DIR}/bindings/js/native)

# The NEON intrinsics' header lies among those of the host, which must not be found.
file(MAKE_DIRECTORY ${PROJECT_BINARY_DIR}/include)
file(CREATE_LINK /usr/include/simde ${PROJECT_BINARY_DIR}/include/simde SYMBOLIC)
target_include_directories(ovrinresize_objects SYSTEM PUBLIC
  ${native_dir} ${PROJECT_BINARY_DIR}/include)
target_sources(ovrinresize_objects PRIVATE ${native_dir}/usleep.cpp ${native_dir}/no_pool.cpp)
set_source_files_properties(src/pool/threadpool.cpp PROPERTIES COMPILE_DEFINITIONS
  ovrin_threadpool_init=replaced_threadpool_init)
set_target_properties(ovrinresize_objects PROPERTIES POSITION_INDEPENDENT_CODE OFF)
# Offsets are computed in 64 bits; those of pictures in memory fit the 32 bits of addresses.
target_compile_options(ovrinresize_warnings INTERFACE -Wno-shorten-64-to-32)

# Every browser that has WebAssembly's vectors has had these instructions for longer. Small code,
# except where that costs a quarter of the time.
target_compile_options(ovrinresize_objects PRIVATE -Os -flto
  -mbulk-memory -mnontrapping-fptoint -msign-ext)
set(fast_sources src/kernels/bilinear_neon.cpp)
if(OVRINRESIZE_SIMD128)
  target_compile_options(ovrinresize_objects PRIVATE -msimd128)
else()
  set(fast_sources src/kernels/bilinear_scalar.cpp src/kernels/quarter_scalar.cpp)
endif()
set_source_files_properties(${fast_sources} PROPERTIES COMPILE_OPTIONS -O2)

set(exports malloc free ${OVRINRESIZE_FUNCTIONS})
list(FILTER exports EXCLUDE REGEX "threadpool|ov_sleep")
list(TRANSFORM exports PREPEND -Wl,--export=)
add_executable(ovrinresize $<TARGET_OBJECTS:ovrinresize_objects>)
# The stack lies first, so that one too small traps.
target_link_options(ovrinresize PRIVATE ${exports} -Os -flto -mexec-model=reactor -nostdlib++
  -Wl,--strip-all,--stack-first,-z,stack-size=262144,--max-memory=4294967296)

if(OVRINRESIZE_BUILD_TESTS)
  # A second module, which runs the golden cases on the first one, in the memory of that.
  # create_lanczos_lookup's memory goes back to where it came from.
  set(golden_dir ${PROJECT_SOURCE_DIR}/tests/golden)
  add_executable(golden ${PROJECT_SOURCE_DIR}/tests/web/golden/golden.cpp
    ${golden_dir}/bilinear_cases.cpp ${golden_dir}/cases.cpp ${golden_dir}/content.cpp
    ${golden_dir}/lanczos_cases.cpp ${golden_dir}/packed_cases.cpp ${golden_dir}/plane_cases.cpp)
  target_include_directories(golden PRIVATE ${PROJECT_SOURCE_DIR}/include
    ${PROJECT_SOURCE_DIR}/tests)
  target_include_directories(golden SYSTEM PRIVATE ${native_dir})
  target_compile_definitions(golden PRIVATE free=library_free)
  target_compile_options(golden PRIVATE -fno-exceptions)
  target_link_libraries(golden PRIVATE ovrinresize_warnings)
  target_link_options(golden PRIVATE -mexec-model=reactor -Wl,--strip-all,--import-memory
    -Wl,--export=golden_lines,--allow-undefined,--global-base=33554432,-z,stack-size=1048576)
endif()
