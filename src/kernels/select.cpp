// SPDX-License-Identifier: Apache-2.0
#include "kernels/kernels.h"

namespace ovrin {

const Kernels& kernels() {
    return scalar_kernels;
}

}  // namespace ovrin
