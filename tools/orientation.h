// SPDX-License-Identifier: Apache-2.0
// How a picture lies in its file, and how to set it upright.
#pragma once

#include "picture.h"
#include "placement.h"

namespace tool {

// The values of EXIF's tag: what to do with the stored picture to see it upright. Turns are
// clockwise, and come after mirroring.
enum class Orientation {
    kUpright = 1,
    kMirrored = 2,  // left and right swapped
    kTurned180 = 3,
    kMirroredTurned180 = 4,
    kMirroredTurned270 = 5,
    kTurned90 = 6,
    kMirroredTurned90 = 7,
    kTurned270 = 8
};

// Whether width and height are swapped.
bool lies_on_its_side(Orientation orientation);

// The upright picture's size from the stored one's, and the other way round.
Size turned(Size size, Orientation orientation);

// The stored picture set upright. RGBA, or planes that as well cover it with its sides swapped:
// 4:2:0 (I420), 4:4:4 or gray.
Picture turned(const Picture& stored, Orientation orientation);

// Where the stored picture goes on a stored canvas, so that both turned are as `upright` says.
Placement stored_placement(const Placement& upright, Orientation orientation);

}  // namespace tool
