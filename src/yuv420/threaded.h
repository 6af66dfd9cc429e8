// SPDX-License-Identifier: Apache-2.0
// Resizing of 4:2:0 pictures in bands: one driver for every format and destination.
#pragma once

#include <string.h>

#include "dispatch/banded_run.h"
#include "yuv420/place.h"
#include "yuv420/planes.h"
#include "yuv420/work_buffer.h"

namespace ovrin {

// Where a threaded call puts its picture.
struct BandDestination {
    uint8_t* dst;
    int32_t width;
    int32_t height;
    const ovrin_resize_target* target;  // null: dst takes the picture itself
};

inline BandDestination in_canvas(const ovrin_resize_target& target) {
    return {static_cast<uint8_t*>(target.dst), target.dst_width, target.dst_height, &target};
}

// The vertical position is compared with the wrong side on purpose: callers rely on a picture that
// starts below the canvas giving a black canvas.
inline bool threaded_canvas_is_rejected(const ovrin_resize_target& target) {
    return target.canvas_width < target.dst_x || target.canvas_height < target.dst_x ||
           target.dst_height == 0;
}

// Bytes from one source luma row to the next.
inline int32_t threaded_row_bytes(const ovrin_resize_target* target, int32_t src_width) {
    return target != nullptr && target->src_stride > 0 ? target->src_stride : src_width;
}

// A band record counts bytes and indices in 32 bits.
inline bool fits_band_record(const Yuv420Source& source, const Yuv420Layout& picture) {
    return has_grid(picture) && grid_of(picture).bytes() <= INT32_MAX &&
           int64_t{source.row_bytes} * source.height <= INT32_MAX;
}

// The fields of the first band that all formats fill alike.
template <class Band>
Band first_band(const Yuv420Source& source, const BandDestination& to) {
    const bool has_rows = to.target != nullptr && to.target->src_buffer_height > 0;
    Band band = {};
    band.src_width = source.width;
    band.src_height = source.height;
    band.src_row_bytes = source.row_bytes;
    band.src_rows = has_rows ? to.target->src_buffer_height : source.height;
    band.dst_width = to.width;
    band.dst_height = to.height;
    band.src = source.luma;
    band.dst = to.dst;
    return band;
}

// Samples straight into the destination.
template <class Format>
bool run_bands_in_place(const typename Format::Band& first, const BandSplit& split) {
    BandedRun<Format> bands(first, split);
    if (!bands.ready()) return false;
    bands.run();
    return true;
}

// Samples into a work buffer, then copies.
template <class Format>
bool run_bands_by_work_buffer(typename Format::Band first, const BandSplit& split,
                              const Yuv420Layout& picture, const BandDestination& to) {
    const WorkBuffer work(grid_of(picture));
    if (work.data() == nullptr) return false;
    first.work = work.data();
    BandedRun<Format> bands(first, split);
    if (!bands.ready()) return false;
    if (first.src_width < 1) memset(work.data(), 0, static_cast<size_t>(grid_of(picture).bytes()));
    bands.run();
    if (to.target != nullptr) {
        place_in_canvas(work.data(), picture, *to.target);
    } else {
        cut_out(work.data(), picture, to.dst);
    }
    return true;
}

// False when the picture does not make two bands, or memory or threads are missing; nothing has
// been written then, and the caller takes its single-threaded way. Format as in BandedRun, with
//     static Band first(source, destination)   the first band's record, but for `work`
template <class Format>
bool resize_yuv420_in_bands(const Yuv420Source& source, const BandDestination& to) {
    const BandSplit split = split_into_bands(source.height, to.height);
    if (split.count < 2) return false;
    // There is nothing to sample, however many rows there are to walk.
    if (to.target == nullptr && source.width < 1) return false;
    const Yuv420Layout picture = {source.chroma, to.width, to.height};
    if (picture.is_empty() && to.target != nullptr) {
        paint_canvas(source.chroma, *to.target);
        return true;
    }
    if (!fits_band_record(source, picture)) return false;
    const typename Format::Band first = Format::first(source, to);
    return to.target == nullptr && is_own_grid(picture)
               ? run_bands_in_place<Format>(first, split)
               : run_bands_by_work_buffer<Format>(first, split, picture, to);
}

}  // namespace ovrin
