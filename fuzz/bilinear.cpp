// SPDX-License-Identifier: Apache-2.0
// The bilinear engine on the calling thread.
#include "bilinear_support.h"

using namespace fuzz;

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    const uint8_t entry = in.byte() % 4;
    const Sizes s = sizes(in);
    const BilinearCall call = bilinear_call(in, s);
    // Below 1024 destination rows both entries are one, and so is the third where nothing is
    // halved.
    const bool halves =
        !reference::halvings(call.src_w, call.src_h, call.dst_w, call.dst_h).empty();
    check_bilinear(call,
                   entry == 3              ? ov_bilinear
                   : entry == 2 && !halves ? ov_bilinear_ex
                                           : ov_bilinear_sg,
                   in, [&](reference::BilinearSource& src, std::vector<uint8_t>& canvas) {
                       reference::bilinear_single(call.g, call.src_w, call.src_h, call.dst_w,
                                                  call.dst_h, src, canvas);
                   });
    return 0;
}
