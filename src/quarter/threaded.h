// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "bands/pool.h"
#include "quarter/sampler.h"

namespace ovrin {

// Several threads that share the bands of a picture, plane by plane. A band is a run of source
// rows, with the destination rows whose cells begin in it, so that no two bands have one in
// common.
struct BandedPlanes {
    const QuarterPlane* planes;
    int32_t count;
    int32_t bands;  // at least 1
};

// As sample_plane for all planes. False when there is no memory; nothing has been written then.
bool sample_in_bands(const BandedPlanes& picture);

// As sample_plane for all planes, on a pool that is ready.
void sample_in_bands(const BandedPlanes& picture, BandPool& pool);

}  // namespace ovrin
