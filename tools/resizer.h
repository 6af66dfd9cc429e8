// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "engine.h"
#include "orientation.h"
#include "picture.h"
#include "placement.h"

namespace tool {

// What happens to the pixels of every frame of a job.
class Resizer {
public:
    // placement: of the upright picture. Throws Error when the engine cannot do that.
    Resizer(Engine engine, const Placement& placement, PixelFormat format, Orientation orientation);

    // May use up *frame. *result is empty or holds the one before.
    void operator()(Picture* frame, Picture* result) const;

private:
    void resize_into(const Picture& frame, const Placement& placement, Picture* result) const;
    void turn_and_resize(Picture* frame, Picture* result) const;

    Engine engine_;
    Placement placement_;
    Orientation orientation_;
};

}  // namespace tool
