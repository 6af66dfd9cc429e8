/* SPDX-License-Identifier: Apache-2.0 */
/* Puts a picture into a canvas of another shape: as large as it goes, in the middle, black around.
 */
#include <ovrinresize.h>
#include <stdio.h>

enum { W = 320, H = 240, CANVAS_W = 60, CANVAS_H = 12 };

static uint8_t picture[W * H * 4]; /* R, G, B, A per pixel */
static uint32_t canvas[CANVAS_W * CANVAS_H];

/* A bright disc on a darker ground. */
static void draw_picture(void) {
    uint8_t* pixel = picture;
    for (int y = 0; y < H; ++y) {
        for (int x = 0; x < W; ++x, pixel += 4) {
            const int dx = x - W / 2, dy = y - H / 2;
            pixel[0] = pixel[1] = pixel[2] = dx * dx + dy * dy < 100 * 100 ? 240 : 80;
            pixel[3] = 255;
        }
    }
}

/* part of whole, of which `size` is to be kept; at least 1. Products of two sizes need 64 bits. */
static int32_t scaled(int32_t size, int32_t part, int32_t whole) {
    const int64_t result = (int64_t)size * part / whole;
    return result < 1 ? 1 : (int32_t)result;
}

/* The largest rectangle of the source's shape in the middle of the canvas. */
static void fit(ovrin_resize_target* t) {
    const int64_t across = (int64_t)t->src_width * t->canvas_height;
    const int64_t down = (int64_t)t->src_height * t->canvas_width;
    t->dst_width = t->canvas_width;
    t->dst_height = t->canvas_height;
    if (across < down) {
        t->dst_width = scaled(t->src_width, t->canvas_height, t->src_height);
    } else {
        t->dst_height = scaled(t->src_height, t->canvas_width, t->src_width);
    }
    t->dst_x = (t->canvas_width - t->dst_width) / 2;
    t->dst_y = (t->canvas_height - t->dst_height) / 2;
}

int main(void) {
    ovrin_resize_target target = {0};
    target.src_width = W;
    target.src_height = H;
    target.src_stride = W; /* also where rows are packed: 0 would repeat the first row */
    target.dst = canvas;
    target.canvas_width = CANVAS_W;
    target.canvas_height = CANVAS_H;
    fit(&target);

    draw_picture();
    ovrin_resize_rgba8888_keep_ratio(picture, W, H, &target);

    printf("%dx%d at (%d, %d)\n", (int)target.dst_width, (int)target.dst_height, (int)target.dst_x,
           (int)target.dst_y);
    for (int y = 0; y < CANVAS_H; ++y) {
        for (int x = 0; x < CANVAS_W; ++x) {
            const int red = *(const uint8_t*)&canvas[y * CANVAS_W + x];
            putchar(red == 0 ? '#' : red < 160 ? '.' : 'o');
        }
        putchar('\n');
    }
    return 0;
}
