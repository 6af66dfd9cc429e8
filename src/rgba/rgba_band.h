// SPDX-License-Identifier: Apache-2.0
// What the packed and the letterboxed RGBA paths share of the band record.
#pragma once

#include <ovrinresize.h>

#include "quarter/sampler.h"

namespace ovrin {

constexpr int32_t kRgbaBytes = 4;

// The lengths in which the two paths differ, in pixels.
struct RgbaRows {
    int32_t src_pixels;  // from one source row to the next
    int32_t dst_pixels;  // from one destination row to the next
    int32_t dst_x;       // from the start of a destination row to the picture
};

// Moves the record from one band to the next.
void advance_rgba_band(ovrin_rgba_band& band, int32_t src_h, int32_t dst_h, const RgbaRows& rows);

// Takes the band's rows to the destination and reports the band done.
void run_rgba_band(ovrin_rgba_band& band, const RgbaRows& rows, BandRows whole_rows);

// Clears the destination row that is open where the band starts.
void clear_open_row(const ovrin_rgba_band& band, const RgbaRows& rows);

// What the band driver asks of every format; `advance` is what the two paths do differently.
struct RgbaBands {
    using Band = ovrin_rgba_band;

    static void end_where_next_begins(Band& previous, const Band& next) {
        previous.rows_to_do = next.rows_to_do;
    }

    static bool take_rest(Band& last, const Band& previous) {
        const int32_t end = previous.start_row + previous.rows_to_do;
        if (last.src_h <= end) return false;
        last.rows_to_do = last.src_h - end;
        return true;
    }

    static bool shares_row(const Band& band) { return band.di_11 != band.di_31; }
};

}  // namespace ovrin
