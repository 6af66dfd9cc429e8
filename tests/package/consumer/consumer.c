/* SPDX-License-Identifier: Apache-2.0 */
#include <ovrinresize.h>
#include <stdio.h>
#include <string.h>

int main(void) {
    uint8_t white[2 * 2 * 4];
    uint32_t pixel = 0;
    memset(white, 255, sizeof white);
    ovrin_resize_rgba8888(white, &pixel, 2, 2, 1, 1);
    printf("2x2 white pixels give %08x\n", (unsigned)pixel);
    return pixel == 0xFCFCFCFC ? 0 : 1;
}
