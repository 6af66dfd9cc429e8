# SPDX-License-Identifier: Apache-2.0
# Cross build for 64-bit Arm Linux with clang, for the fuzzers. clang's own folder for that target, with the
# fuzzing engine, is made by fuzz/aarch64_runtime.sh.
include(${CMAKE_CURRENT_LIST_DIR}/aarch64-linux-gnu.cmake)
set(CMAKE_C_COMPILER clang)
set(CMAKE_CXX_COMPILER clang++)
set(CMAKE_C_COMPILER_TARGET aarch64-linux-gnu)
set(CMAKE_CXX_COMPILER_TARGET aarch64-linux-gnu)
# Only what is linked comes from there.
foreach(kind EXE SHARED)
  set(CMAKE_${kind}_LINKER_FLAGS_INIT "-resource-dir ${CMAKE_CURRENT_LIST_DIR}/../build/clang-aarch64")
endforeach()
