// SPDX-License-Identifier: Apache-2.0
// Bands of 4:2:0 pictures: what the records of both formats have in common.
#pragma once

#include <ovrinresize.h>
#include <string.h>

#include "quarter/sampler.h"
#include "yuv420/grid.h"
#include "yuv420/source.h"

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

// The fields of a record that its format names after its chroma.
struct ChromaFields {
    int32_t& offset;  // from the source planes to the band's first chroma rows, in bytes
    int32_t& rows;
};

// ---- Walking from band to band ----------------------------------------------------------------

// Walks one plane, row by row as far as wanted.
class PlaneWalk {
public:
    PlaneWalk(PlaneState& plane, const ScanAxis& axis);

    void walk(int32_t rows);

    // Some destination row has its top samples but not yet its bottom samples.
    bool ends_in_open_row() const { return row_is_open(plane_.scan); }
    int32_t rows() const { return walked_; }
    // Rows of the source plane after the walk; negative once it has passed the end.
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

// The planes of a picture. Indices move by one row of the grid.
ScanAxis luma_axis(const Yuv420Layout& picture, int32_t src_height);
ScanAxis chroma_axis(const Yuv420Layout& picture, int32_t src_height);

// Chroma rows that a band has at least: a quarter of its luma rows, rounded up.
int32_t min_chroma_rows(int32_t band_rows);

// Moves a record to the next band: walks the luma rows of the present one and the least of its
// chroma rows; its format walks on until no chroma row is open.
template <class Band>
class BandWalk {
public:
    BandWalk(Band& band, const Yuv420Layout& picture, int32_t src_height)
        : band_(band),
          state_(load_state(band)),
          luma_(state_.luma, luma_axis(picture, src_height)),
          chroma_(state_.chroma, chroma_axis(picture, src_height)) {
        luma_.walk(band.band_rows);
        chroma_.walk(min_chroma_rows(band.band_rows));
    }

    PlaneWalk& chroma() { return chroma_; }

    void finish(const ChromaFields& fields, int64_t chroma_bytes) {
        store_state(band_, state_);
        const int64_t luma_bytes = int64_t{luma_.rows()} * band_.src_row_bytes;
        band_.src_y_offset = wrapping_add(band_.src_y_offset, luma_bytes);
        band_.y_rows = luma_.rows_or_none();
        fields.offset = wrapping_add(fields.offset, chroma_bytes);
        fields.rows = chroma_.rows_inside();
    }

private:
    Band& band_;
    BandState state_;
    PlaneWalk luma_;
    PlaneWalk chroma_;
};

// ---- Running a band ---------------------------------------------------------------------------

// One band as its task runs it.
struct BandWork {
    Yuv420Source source;  // planes and rows of the whole picture
    Yuv420Layout picture;
    uint8_t* dst;         // grid that takes the samples
    int32_t luma_offset;  // from the source planes to the band's first rows, in bytes
    int32_t chroma_offset;
    int32_t luma_rows;
    int32_t chroma_rows;
};

// Adds the band's samples to its destination.
void add_yuv420_band(const BandWork& work, const BandState& state);

// Runs one band and reports it done. Without a destination there is nowhere to go.
template <class Band>
void run_band(Band& band, const Yuv420Source& source, const ChromaFields& chroma, uint8_t* dst) {
    if (dst != nullptr) {
        BandWork work = {};
        work.source = source;
        work.picture = {source.format, band.dst_width, band.dst_height};
        work.dst = dst;
        work.luma_offset = band.src_y_offset;
        work.luma_rows = band.y_rows;
        work.chroma_offset = chroma.offset;
        work.chroma_rows = chroma.rows;
        add_yuv420_band(work, load_state(band));
    }
    __atomic_store_n(&band.done, 1, __ATOMIC_RELEASE);
}

// Where a task of a contiguous source adds its samples, and where one of separate planes does:
// null when a work buffer is needed and missing.
template <class Band>
uint8_t* contiguous_destination(const Band& band) {
    return is_grid_size(band.dst_width) && is_grid_size(band.dst_height) ? band.dst : band.work;
}

template <class Band>
uint8_t* separate_destination(const Band& band) {
    return band.work != nullptr ? band.work : contiguous_destination(band);
}

}  // namespace ovrin
