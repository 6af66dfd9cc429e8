/* SPDX-License-Identifier: Apache-2.0 */
/* Resizes a picture with two engines; the results are those of every build and processor. */
#include <ovrinresize.h>
#include <stdio.h>

enum { W = 61, H = 47, SMALL_W = 23, SMALL_H = 17 };

static uint8_t picture[W * H * 4];
static uint32_t quarter[SMALL_W * SMALL_H], lanczos[SMALL_W * SMALL_H];

/* FNV-1a. */
static uint32_t hash_of(const void* data, size_t count) {
    const uint8_t* bytes = data;
    uint32_t hash = 2166136261u;
    for (size_t i = 0; i < count; ++i) hash = (hash ^ bytes[i]) * 16777619u;
    return hash;
}

int main(void) {
    uint32_t state = 1;
    for (size_t i = 0; i < sizeof picture; ++i) {
        state = state * 1664525u + 1013904223u;
        picture[i] = (uint8_t)(state >> 24);
    }
    ovrin_resize_rgba8888(picture, quarter, W, H, SMALL_W, SMALL_H);
    ovrin_resize_lanczos(picture, (uint8_t*)lanczos, W, H, SMALL_W, SMALL_H, 4);
    const uint32_t hashes[] = {hash_of(quarter, sizeof quarter), hash_of(lanczos, sizeof lanczos)};
    printf("%08x %08x\n", (unsigned)hashes[0], (unsigned)hashes[1]);
    return hashes[0] == 0xac2b5fea && hashes[1] == 0x1207fc02 ? 0 : 1;
}
