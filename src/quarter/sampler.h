// SPDX-License-Identifier: Apache-2.0
// The quarter-point sampler, shared by every format. A target sample is the sum of four source
// samples, each shifted right by 2: those at the quarter and the three-quarter point of its source
// cell in each direction.
#pragma once

#include <stddef.h>

#include "bands/turns.h"
#include "quarter/scan.h"

namespace ovrin {

// One plane to sample. The extents set the ratio of either axis in any unit that both sides share;
// interleaved chroma counts bytes where its samples are pairs.
struct QuarterPlane {
    const uint8_t* src;    // first byte of the first source row
    ptrdiff_t src_pitch;   // bytes from one source row to the next
    int32_t src_columns;   // source extent of a row
    int32_t src_rows;      // source extent of a column
    uint8_t* dst;          // first byte of the first target row
    ptrdiff_t dst_pitch;   // bytes from one target row to the next
    int32_t dst_columns;   // target extent of a row
    int32_t dst_rows;      // target extent of a column
    int32_t rows;          // target rows to sample, from the first on
    int32_t samples;       // target samples in a row
    int32_t src_samples;   // source samples in a row
    int32_t sample_bytes;  // 1 to 4
};

// Stores every target sample of the plane; zeros when the source is empty.
void sample_plane(const QuarterPlane& plane);

// As sample_plane, by several threads at once, each of which calls this with a way of its own
// through the same turns: one pass, in which every band is a share of the target rows.
void sample_plane_in_turns(const QuarterPlane& plane, TurnTaker& turns);

// Adds the samples of `rows` source rows to the target, from a state between two rows. plane.src is
// the first of these rows; the state's indices count `index_bytes` from plane.dst.
void add_band(const QuarterPlane& plane, const ScanState& state, int32_t rows, int32_t index_bytes);

}  // namespace ovrin
