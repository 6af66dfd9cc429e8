# SPDX-License-Identifier: Apache-2.0
# Stands in for the NDK's file of this name, so that the android-arm64 preset can be configured and its
# library linked where there is no NDK: the system's clang and lld, our own headers, and libraries
# that are nothing but names (tests/android/sysroot.sh). What comes out is for verification only.

# The settings by which the NDK's file chooses. Try-compile projects get them too.
set(settings ANDROID_ABI ANDROID_PLATFORM ANDROID_STL)
list(APPEND CMAKE_TRY_COMPILE_PLATFORM_VARIABLES ${settings})
set(recorded "")
foreach(setting IN LISTS settings)
  string(APPEND recorded "${setting}=${${setting}}\n")
endforeach()
file(WRITE ${CMAKE_BINARY_DIR}/ndk-settings.txt "${recorded}")
if(NOT ANDROID_ABI STREQUAL "arm64-v8a" OR NOT ANDROID_PLATFORM MATCHES "^android-([0-9]+)$")
  message(FATAL_ERROR "these stubs know arm64-v8a and android-NN only, got:\n${recorded}")
endif()

# CMake's own rules for the system name Android refuse to work without an NDK.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR aarch64)
set(ANDROID TRUE)
get_filename_component(sysroot ${CMAKE_CURRENT_LIST_DIR}/../../sysroot ABSOLUTE)

set(CMAKE_CXX_COMPILER clang++)
set(CMAKE_CXX_COMPILER_TARGET aarch64-linux-android${CMAKE_MATCH_1})
# An executable would need crt objects.
set(CMAKE_TRY_COMPILE_TARGET_TYPE STATIC_LIBRARY)
# What the NDK adds to every compilation and could show in the result.
set(CMAKE_CXX_FLAGS_INIT "-nostdlibinc -isystem ${sysroot}/include -g -DANDROID -fdata-sections \
-ffunction-sections -funwind-tables -fstack-protector-strong -D_FORTIFY_SOURCE=2")
set(CMAKE_SHARED_LINKER_FLAGS_INIT "-nostdlib -fuse-ld=lld -L${sysroot}/lib -Wl,--build-id=sha1 \
-Wl,--fatal-warnings -Qunused-arguments")
set(CMAKE_CXX_STANDARD_LIBRARIES "-lc")
