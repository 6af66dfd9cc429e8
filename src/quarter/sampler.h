// SPDX-License-Identifier: Apache-2.0
// The quarter-point sampler, shared by every format. A destination sample is the sum of four source
// samples, each shifted right by 2: those at the quarter and the three-quarter point of its share
// of the source in each direction.
#pragma once

#include <stddef.h>

#include "bands/turns.h"
#include "quarter/scan.h"

namespace ovrin {

// One plane to sample. Source and destination columns and rows set the ratio of either axis; of the
// destination's, only the first may be wanted.
struct QuarterPlane {
    const uint8_t* src;    // first byte of the first source row
    ptrdiff_t src_pitch;   // bytes from one source row to the next
    int32_t src_columns;   // samples in a source row
    int32_t src_rows;      // source rows
    uint8_t* dst;          // first byte of the first destination row
    ptrdiff_t dst_pitch;   // bytes from one destination row to the next
    int32_t dst_columns;   // samples in a whole destination row
    int32_t dst_rows;      // rows of the whole destination
    int32_t columns;       // destination samples wanted in a row
    int32_t rows;          // destination rows wanted
    int32_t sample_bytes;  // 1 to 4
};

// Stores every wanted sample of the plane; zeros when the source is empty.
void sample_plane(const QuarterPlane& plane);

// As sample_plane, by several threads at once, each of which calls this with a way of its own
// through the same turns: one pass, in which every band is a share of the destination rows.
void sample_plane_in_turns(const QuarterPlane& plane, TurnTaker& turns);

// Adds the samples of `band_rows` source rows to the destination, from a state between two rows.
// plane.src is the first of these rows; the state's indices count `index_bytes` from plane.dst.
void add_band(const QuarterPlane& plane, const ScanState& state, int32_t band_rows,
              int32_t index_bytes);

}  // namespace ovrin
