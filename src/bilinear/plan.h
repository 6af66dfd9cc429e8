// SPDX-License-Identifier: Apache-2.0
// What a bilinear call needs to know before it looks at pixels.
#pragma once

#include <ovrinresize.h>
#include <stddef.h>
#include <stdlib.h>

#include "canvas/yuv420_layout.h"

namespace ovrin {

enum class BilinearLayout { kPixels, kPlanar, kSemiPlanar, kUnknown };

BilinearLayout bilinear_layout(int32_t format);

inline int32_t bytes_per_pixel(BilinearLayout layout) {
    return layout == BilinearLayout::kPixels ? 4 : 1;
}

// The source and the canvas, whether a target describes them or the arguments do.
struct BilinearGeometry {
    BilinearLayout layout;
    int32_t format;
    int32_t src_width;
    int32_t src_height;
    int32_t src_stride;  // pixels
    const uint8_t* src;
    const uint8_t* src_chroma[2];
    uint8_t* canvas;
    int32_t canvas_width;
    int32_t canvas_height;
    int32_t dst_x;
    int32_t dst_y;

    Yuv420Layout canvas_planes() const;
};

// The arguments that ov_bilinear_sg and ov_bilinear share.
struct BilinearCall {
    const uint8_t* src;
    uint8_t* dst;
    int32_t src_w;
    int32_t src_h;
    int32_t dst_w;
    int32_t dst_h;
    int32_t format;
    const ovrin_resize_target* target;
};

BilinearGeometry geometry_of(const BilinearCall& call);

// A known format and a source with pixels.
inline bool is_supported(const BilinearGeometry& geometry) {
    return geometry.layout != BilinearLayout::kUnknown && geometry.src_width > 0 &&
           geometry.src_height > 0;
}

// Per destination column and row: the sample to its left or above, and the weight of the next one
// with 12 fractional bits. They may belong to a caller's band record.
struct BilinearAxes {
    const int32_t* col_index;
    const int32_t* col_weight;
    const int32_t* row_index;
    const int32_t* row_weight;
};

// Axes of a picture with memory of their own.
class BilinearTables : public BilinearAxes {
public:
    BilinearTables(int32_t w, int32_t h);
    ~BilinearTables() { free(memory_); }
    BilinearTables(const BilinearTables&) = delete;
    BilinearTables& operator=(const BilinearTables&) = delete;

    bool ready() const { return memory_ != nullptr; }
    void fill(const BilinearGeometry& geometry);

    int32_t dst_w;
    int32_t dst_h;

private:
    int32_t* memory_;
};

// The part of the scaled picture that lies inside the canvas, and how many of its last columns and
// rows are not blended in one direction.
struct BilinearExtent {
    int32_t columns;
    int32_t rows;
    int32_t edge_cols;
    int32_t edge_rows;
};

BilinearExtent extent_of(const BilinearGeometry& geometry, const BilinearTables& tables);

// Paints what the rows of the extent do not: nothing, or the whole canvas.
void clear_canvas(const BilinearGeometry& geometry, const BilinearExtent& extent);

}  // namespace ovrin
