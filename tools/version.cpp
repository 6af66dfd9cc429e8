// SPDX-License-Identifier: Apache-2.0
#include "version.h"

#include <ovrinresize.h>

#include "kernels/kernels.h"

namespace tool {

namespace {

const char* kernels() {
    ovrin::NamedKernels sets[ovrin::kMaxSets];
    int32_t number = ovrin::available_kernels(sets) - 1;
    while (sets[number].kernels != &ovrin::kernels()) --number;
    return sets[number].name;
}

}  // namespace

std::string version_text() {
    return std::string("ovrinresize " OVRINRESIZE_VERSION "\nlibovrinresize " OVRINRESIZE_VERSION
                       ", kernels: ") +
           kernels();
}

}  // namespace tool
