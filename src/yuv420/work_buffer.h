// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "canvas/yuv420_layout.h"

namespace ovrin {

// A buffer for one grid. It takes twice the luma, a third more than the planes need.
class WorkBuffer {
public:
    explicit WorkBuffer(const Yuv420Layout& grid);
    ~WorkBuffer();

    WorkBuffer(const WorkBuffer&) = delete;
    WorkBuffer& operator=(const WorkBuffer&) = delete;

    uint8_t* data() const { return data_; }  // null when there was no memory

private:
    uint8_t* data_;
};

}  // namespace ovrin
