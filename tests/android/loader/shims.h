// SPDX-License-Identifier: Apache-2.0
// What a library for Android imports, on top of Linux's C library.
#pragma once

namespace loader {

// The address of the function that a library for Android gets for this name, or null.
void* find_shim(const char* name);

// Code for Android compares the stack's canary with the word 0x28 bytes behind the thread pointer.
// Whether this program keeps that word free.
bool has_room_for_canary();

}  // namespace loader
