/* SPDX-License-Identifier: Apache-2.0 */
/* Shrinks a picture in memory to a quarter of its width and height. */
#include <ovrinresize.h>
#include <stdio.h>
#include <stdlib.h>

int main(void) {
    const int32_t w = 1600, h = 1200, small_w = 400, small_h = 300;
    uint8_t* picture = calloc((size_t)w * h, 4); /* R, G, B, A per pixel */
    uint32_t* small = malloc((size_t)small_w * small_h * 4);
    if (picture == NULL || small == NULL) return 1;
    for (int32_t i = 0; i < w * h; ++i) picture[(size_t)4 * i] = (uint8_t)(255 * (i % w) / w);

    ovrin_resize_rgba8888(picture, small, w, h, small_w, small_h);

    printf("red from %d to %d\n", *(uint8_t*)small, *(uint8_t*)(small + small_w - 1));
    free(picture);
    free(small);
    return 0;
}
