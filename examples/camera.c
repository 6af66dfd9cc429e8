/* SPDX-License-Identifier: Apache-2.0 */
/*
 * A preview of a camera's frame. Cameras deliver luma and chroma in planes apart, and rows that are
 * longer than their pixels. The functions with a target record take that: the picture fills a
 * canvas of its own size.
 */
#include <ovrinresize.h>
#include <stdio.h>
#include <string.h>

enum { W = 1600, H = 1200, STRIDE = 1664, PREVIEW_W = 400, PREVIEW_H = 300 };
enum { PREVIEW_LUMA = PREVIEW_W * PREVIEW_H };

/* As a camera might fill them: NV21, which has a V and a U for every four pixels. Rows of chroma
   are as long as those of luma, because src_stride says both. */
static uint8_t luma[STRIDE * H];
static uint8_t chroma[STRIDE * H / 2];

/* NV21 again, packed: a plane of luma, then one of pairs. */
static uint8_t preview[PREVIEW_LUMA * 3 / 2];

/* Luma grows to the right and V downwards, U is the same everywhere; 255 behind each row's pixels.
 */
static void expose(void) {
    memset(luma, 255, sizeof luma);
    memset(chroma, 255, sizeof chroma);
    for (int y = 0; y < H; ++y) {
        for (int x = 0; x < W; ++x) luma[y * STRIDE + x] = (uint8_t)(x * 200 / W);
    }
    for (int y = 0; y < H / 2; ++y) {
        for (int x = 0; x < W; x += 2) {
            chroma[y * STRIDE + x] = (uint8_t)(y * 200 / (H / 2));
            chroma[y * STRIDE + x + 1] = 100;
        }
    }
}

static void print_five(const char* name, const uint8_t* sample, int step) {
    printf("%s", name);
    for (int i = 0; i < 5; ++i, sample += step) printf(" %3d", *sample);
    putchar('\n');
}

int main(void) {
    ovrin_resize_target target = {0};
    target.src_width = W;
    target.src_height = H;
    target.src_stride = STRIDE;
    target.dst = preview;
    target.dst_width = target.canvas_width = PREVIEW_W;
    target.dst_height = target.canvas_height = PREVIEW_H;

    expose();
    ovrin_resize_y_nv21_keep_ratio(luma, chroma, W, H, &target);

    const uint8_t* pairs = preview + PREVIEW_LUMA;
    print_five("luma, to the right", preview, (PREVIEW_W - 1) / 4);
    print_five("V, downwards      ", pairs, PREVIEW_W * ((PREVIEW_H / 2 - 1) / 4));
    print_five("U, downwards      ", pairs + 1, PREVIEW_W * ((PREVIEW_H / 2 - 1) / 4));
    return 0;
}
