// SPDX-License-Identifier: Apache-2.0
// Bands of 4:2:0 pictures: what the records of planar and interleaved pictures have in common.
#pragma once

#include <ovrinresize.h>
#include <string.h>

#include "quarter/sampler.h"
#include "yuv420/layout.h"

namespace ovrin {

struct PlaneState {
    int32_t start_row;  // source rows before the band
    ScanState scan;
};

// The running state; both kinds of record begin with it.
struct BandState {
    PlaneState luma;
    PlaneState chroma;
};

template <class Band>
BandState load_state(const Band& band) {
    BandState state;
    memcpy(&state, &band, sizeof state);
    return state;
}

template <class Band>
void store_state(Band& band, const BandState& state) {
    memcpy(static_cast<void*>(&band), &state, sizeof state);
}

// Walks one plane, row by row as far as wanted.
class PlaneWalk {
public:
    PlaneWalk(PlaneState& plane, const ScanAxis& axis);

    void walk(int32_t rows);

    // Some destination row has its top samples but not yet its bottom samples.
    bool ends_in_open_row() const { return row_is_open(plane_.scan); }
    int32_t rows() const { return walked_; }
    // Rows of the source plane behind the walk; negative once it has passed the end.
    int64_t rows_left() const { return int64_t{axis_.src_rows} - start_row_ - walked_; }

    // Rows of the walk that a band processes: none of a luma band that runs past the plane, those
    // inside the plane of a chroma band.
    int32_t rows_or_none() const { return rows_left() >= 0 ? walked_ : 0; }
    int32_t rows_inside() const;

private:
    PlaneState& plane_;
    ScanAxis axis_;
    int32_t start_row_;
    int32_t walked_ = 0;
};

// The planes of a band's walk. Indices move by one row of the grid.
ScanAxis luma_axis(ChromaLayout chroma, int32_t src_height, int32_t dst_width, int32_t dst_height);
ScanAxis chroma_axis(ChromaLayout chroma, int32_t src_height, int32_t dst_width,
                     int32_t dst_height);

// Chroma rows that a band has at least: a quarter of its luma rows, rounded up.
int32_t least_chroma_rows(int32_t band_rows);

// One band as its task runs it.
struct BandWork {
    Yuv420Source source;  // planes and rows of the whole picture
    int32_t width;        // size of the scaled picture
    int32_t height;
    uint8_t* target;      // grid that takes the samples
    int32_t luma_offset;  // from the source planes to the band's first rows
    int32_t chroma_offset;
    int32_t luma_rows;
    int32_t chroma_rows;
};

// Adds the band's samples to its target.
void add_yuv420_band(const BandWork& work, const BandState& state);

// Runs one band and reports it done. Without a target there is nowhere to go.
template <class Band>
void run_yuv420_band(Band& band, const Yuv420Source& source, uint8_t* target, int32_t chroma_offset,
                     int32_t chroma_rows) {
    if (target != nullptr) {
        add_yuv420_band({source, band.dst_width, band.dst_height, target, band.src_y_offset,
                         chroma_offset, band.y_rows, chroma_rows},
                        load_state(band));
    }
    __atomic_store_n(&band.done, 1, __ATOMIC_RELEASE);
}

// Where a task of a contiguous source adds its samples, and where one of separate planes does:
// null when a work buffer is needed and missing.
template <class Band>
uint8_t* contiguous_target(const Band& band) {
    return is_grid_size(band.dst_width) && is_grid_size(band.dst_height) ? band.dst : band.work;
}

template <class Band>
uint8_t* separate_target(const Band& band) {
    return band.work != nullptr ? band.work : contiguous_target(band);
}

}  // namespace ovrin
