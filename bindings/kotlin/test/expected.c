/* SPDX-License-Identifier: Apache-2.0 */
/*
 * What the library makes of the pictures of KnownResults.kt, called from C: one line per case, the
 * case's numbers and then the hash of the destination.
 */
#include <inttypes.h>
#include <ovrinresize.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

struct sizes {
    int32_t src_w, src_h, stride, dst_w, dst_h, canvas_w, canvas_h, x, y;
};

/* A slope with noise on it. Longer pictures begin as shorter ones do. */
static uint8_t* new_picture(size_t bytes) {
    uint8_t* picture = malloc(bytes);
    uint32_t noise = 1;
    if (picture == NULL) abort();
    for (size_t i = 0; i < bytes; ++i) {
        noise = noise * 1664525U + 1013904223U;
        picture[i] = (uint8_t)(i / 5 + (noise >> 27));
    }
    return picture;
}

static size_t half(int32_t luma) {
    return (size_t)(luma + 1) / 2;
}

static size_t result_bytes(const char* name, struct sizes s) {
    const int32_t w = s.canvas_w, h = s.canvas_h;
    const size_t pixels = (size_t)w * (size_t)h;
    if (strstr(name, "rgba") || strstr(name, "nearest") || !strcmp(name, "lanczos")) {
        return 4 * pixels;
    }
    if (strstr(name, "rgb") || strstr(name, "Chroma")) return 3 * pixels;
    if (strstr(name, "components")) return 2 * pixels;
    return pixels + 2 * half(w) * half(h);
}

static ovrin_resize_target target_of(struct sizes s, uint8_t* dst) {
    ovrin_resize_target target;
    memset(&target, 0, sizeof target);
    target.src_width = s.src_w;
    target.src_height = s.src_h;
    target.src_stride = s.stride;
    target.src_buffer_height = s.src_h;
    target.dst = dst;
    target.dst_width = s.dst_w;
    target.dst_height = s.dst_h;
    target.canvas_width = s.canvas_w;
    target.canvas_height = s.canvas_h;
    target.dst_x = s.x;
    target.dst_y = s.y;
    return target;
}

static void resize(const char* name, struct sizes s, const uint8_t* src, uint8_t* dst) {
    const int32_t sw = s.src_w, sh = s.src_h, dw = s.dst_w, dh = s.dst_h;
    const uint8_t* chroma = src + (size_t)s.stride * (size_t)sh;
    const uint8_t* v = chroma + half(s.stride) * half(sh);
    ovrin_resize_target target = target_of(s, dst);
    if (!strcmp(name, "rgba")) ovrin_resize_rgba8888(src, (uint32_t*)dst, sw, sh, dw, dh);
    if (!strcmp(name, "rgb")) ovrin_resize_rgb888(src, dst, sw, sh, dw, dh);
    if (!strcmp(name, "nearest")) {
        ovrin_resize_nearest_rgba8888((const uint32_t*)src, (uint32_t*)dst, sw, sh, dw, dh);
    }
    if (!strcmp(name, "i420")) ovrin_resize_yuv420(src, dst, sw, sh, dw, dh);
    if (!strcmp(name, "nv21")) ovrin_resize_nv21(src, dst, sw, sh, dw, dh);
    if (!strcmp(name, "rgbaInCanvas")) ovrin_resize_rgba8888_keep_ratio(src, sw, sh, &target);
    if (!strcmp(name, "i420InCanvas") || !strcmp(name, "i420PlanesInCanvas")) {
        ovrin_resize_y_u_v_keep_ratio(src, chroma, v, sw, sh, &target);
    }
    if (!strcmp(name, "nv21InCanvas") || !strcmp(name, "nv21PlanesInCanvas")) {
        ovrin_resize_y_nv21_keep_ratio(src, chroma, sw, sh, &target);
    }
    if (!strcmp(name, "blended_rgba")) ov_bilinear_sg(src, dst, sw, sh, dw, dh, 8, NULL);
    if (!strcmp(name, "blended_i420")) ov_bilinear_sg(src, dst, sw, sh, dw, dh, 2, NULL);
    if (!strcmp(name, "blended_nv21")) ov_bilinear_sg(src, dst, sw, sh, dw, dh, 19, NULL);
    if (!strcmp(name, "threaded_rgba")) ov_bilinear(src, dst, sw, sh, dw, dh, 7, NULL);
    if (!strcmp(name, "threaded_i420")) ov_bilinear(src, dst, sw, sh, dw, dh, 2, NULL);
    if (!strcmp(name, "threaded_nv21")) ov_bilinear(src, dst, sw, sh, dw, dh, 18, NULL);
    if (!strcmp(name, "halving_rgba")) ov_bilinear_ex(src, dst, sw, sh, dw, dh, 7, NULL);
    if (!strcmp(name, "halving_i420")) ov_bilinear_ex(src, dst, sw, sh, dw, dh, 2, NULL);
    if (!strcmp(name, "halving_nv21")) ov_bilinear_ex(src, dst, sw, sh, dw, dh, 18, NULL);
    if (!strcmp(name, "lanczos")) ov_lanczos(src, sw, sh, dst, dw, dh, 4);
    if (!strcmp(name, "lanczos_components")) ov_lanczos(src, sw, sh, dst, dw, dh, 2);
    if (!strcmp(name, "lanczosFullChroma")) ov_lanczos_nv(src, sw, sh, dst, dw, dh);
}

static uint64_t hash_of(const uint8_t* bytes, size_t count) {
    uint64_t hash = 0xCBF29CE484222325U;
    for (size_t i = 0; i < count; ++i) hash = (hash ^ bytes[i]) * 0x100000001B3U;
    return hash;
}

static void print_case(const char* name, struct sizes s) {
    /* Room for any format, and for what the bilinear engine reads behind the picture. */
    uint8_t* src = new_picture(4 * (size_t)s.stride * (size_t)(s.src_h + 2) + 64);
    const size_t bytes = result_bytes(name, s);
    uint8_t* dst = malloc(bytes);
    if (dst == NULL) abort();
    memset(dst, 0x5A, bytes);
    resize(name, s, src, dst);
    printf("%s %d %d %d %d %d %d %d %d %d %016" PRIx64 "\n", name, s.src_w, s.src_h, s.stride,
           s.dst_w, s.dst_h, s.canvas_w, s.canvas_h, s.x, s.y, hash_of(dst, bytes));
    free(src);
    free(dst);
}

int main(void) {
    static const char* const plain[] = {"rgba",
                                        "rgb",
                                        "nearest",
                                        "i420",
                                        "nv21",
                                        "blended_rgba",
                                        "blended_i420",
                                        "blended_nv21",
                                        "threaded_rgba",
                                        "threaded_i420",
                                        "threaded_nv21",
                                        "halving_rgba",
                                        "halving_i420",
                                        "halving_nv21",
                                        "lanczos",
                                        "lanczos_components",
                                        "lanczosFullChroma"};
    static const char* const packed[] = {"rgbaInCanvas", "i420InCanvas", "nv21InCanvas"};
    static const char* const strided[] = {"rgbaInCanvas", "i420PlanesInCanvas",
                                          "nv21PlanesInCanvas"};
    /* Shrinking, enlarging, odd sizes, one pixel; heights that make the library use threads. */
    static const int32_t sizes[][4] = {{64, 48, 16, 12},    {61, 47, 13, 29}, {16, 12, 40, 31},
                                       {1, 1, 3, 2},        {33, 17, 33, 17}, {90, 1100, 21, 130},
                                       {37, 211, 30, 1050}, {80, 70, 9, 7}};
    for (size_t i = 0; i < sizeof sizes / sizeof *sizes; ++i) {
        const int32_t* z = sizes[i];
        const struct sizes s = {z[0], z[1], z[0], z[2], z[3], z[2], z[3], 0, 0};
        const struct sizes in_canvas = {z[0], z[1], z[0], z[2], z[3], z[2] + 9, z[3] + 6, 5, 2};
        struct sizes wide = in_canvas;
        wide.stride += 7;
        for (size_t j = 0; j < sizeof plain / sizeof *plain; ++j) print_case(plain[j], s);
        for (size_t j = 0; j < sizeof packed / sizeof *packed; ++j)
            print_case(packed[j], in_canvas);
        for (size_t j = 0; j < sizeof strided / sizeof *strided; ++j) print_case(strided[j], wide);
    }
    return 0;
}
