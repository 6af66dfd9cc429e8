/* SPDX-License-Identifier: Apache-2.0 */
/* Shrinks a picture in memory to a quarter of its width and height. */
#include <ovrinresize.h>
#include <stdio.h>

enum { W = 1600, H = 1200, SMALL_W = 400, SMALL_H = 300 };

static uint8_t picture[W * H * 4]; /* R, G, B, A per pixel */
static uint32_t small[SMALL_W * SMALL_H];

int main(void) {
    for (size_t i = 0; i < sizeof(picture); i += 4) picture[i] = (uint8_t)(i / 4 % W * 255 / W);

    ovrin_resize_rgba8888(picture, small, W, H, SMALL_W, SMALL_H);

    printf("red from %d to %d\n", *(uint8_t*)&small[0], *(uint8_t*)&small[SMALL_W - 1]);
    return 0;
}
