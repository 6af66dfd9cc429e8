// SPDX-License-Identifier: Apache-2.0
// Single bands of the bilinear engine, and its large reductions.
#include "bilinear_support.h"

using namespace fuzz;

namespace {

// The tables and the record of one band. The library reads them from buffers of their exact size.
class Band {
public:
    Band(const BilinearCall& call, const reference::BilinearPlan& plan, int32_t first, int32_t end)
        : tables_{table(plan.columns.weight), table(plan.rows.weight), table(plan.columns.index),
                  table(plan.rows.index)} {
        const int32_t bpp = reference::is_four_channel(call.g.format) ? 4 : 1;
        record.src_width = call.g.src_width;
        record.src_height = call.g.src_height;
        record.dst_w = plan.dst_w;
        record.dst_h = plan.dst_h;
        record.format = call.g.format;
        record.col_weight = entries(0);
        record.row_weight = entries(1);
        record.col_index = entries(2);
        record.row_index = entries(3);
        record.first_row = first;
        record.end_row = end;
        record.canvas_width = call.g.canvas_width;
        record.src_pitch = call.g.src_stride * bpp;
        record.bpp = bpp;
        record.edge_cols = plan.edge_cols;
        record.edge_rows = plan.edge_rows;
    }

    ovrin_bilinear_band record = {};

private:
    static Buffer table(const std::vector<int32_t>& content) {
        Buffer buffer(content.size() * sizeof(int32_t), Flush::kEnd);
        memcpy(buffer.data(), content.data(), buffer.size());
        return buffer;
    }
    const int32_t* entries(int i) const {
        return reinterpret_cast<const int32_t*>(tables_[i].data());
    }

    Buffer tables_[4];
};

void one_band(Input& in, const BilinearCall& call) {
    const auto plan = reference::bilinear_plan(call.g, call.dst_w, call.dst_h);
    const int32_t rows = std::max(plan.dst_h, 0);
    const int32_t first = in.between(0, rows);
    const int32_t end = in.between(first, rows);
    const auto definition = [&](reference::BilinearSource& src, std::vector<uint8_t>& canvas) {
        for (int32_t r = first; r < end; ++r) {
            for (int32_t c = 0; c < plan.dst_w; ++c) {
                reference::draw(plan, reference::Kernel::kTopLeft, c, r, src, canvas);
            }
        }
    };
    const uint8_t fill = in.byte();
    std::vector<uint8_t> expected(canvas_bytes(call.g), fill);
    reference::BilinearSource read;
    definition(read, expected);
    Pixels pixels(in);
    const Flush where = flush(in);
    const BilinearBuffers buffers = bilinear_buffers(call, read, pixels, where);
    reference::BilinearSource view = buffers.source();
    definition(view, expected);

    Band band(call, plan, first, end);
    const ovrin_resize_target target = buffers.target();
    band.record.src = buffers.src();
    band.record.target = call.with_target ? &target : nullptr;
    check_drawing(expected, where, fill, [&](const Buffer& dst, const char* set) {
        ovrin_bilinear_band passed = band.record;
        passed.dst = dst.data();
        _ov_bilinear_tp(&passed);
        check_unchanged(buffers, set);
    });
}

void reduction(Input& in) {
    const int32_t ratio_w = in.between(4, 20);
    const int32_t ratio_h = in.between(4, 20);
    const int32_t dst_w = in.between(1, 12);
    const int32_t dst_h = in.between(1, 8);
    const Sizes s = {dst_w * ratio_w + in.between(0, 5), dst_h * ratio_h + in.between(0, 5), dst_w,
                     dst_h};
    const int32_t format = in.pick({2, 7, 8, 18, 19});
    const BilinearCall call = call_without_target(format, s.src_w, s.src_h, s.dst_w, s.dst_h);
    check_bilinear(call, ov_bilinear_ex, in,
                   [&](reference::BilinearSource& src, std::vector<uint8_t>& canvas) {
                       reference::bilinear_ex(s.src_w, s.src_h, s.dst_w, s.dst_h, format, src,
                                              canvas);
                   });
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    if (in.byte() % 4 == 3) {
        reduction(in);
    } else {
        const Sizes s = sizes(in);
        BilinearCall call = bilinear_call(in, s);
        // A record has the picture's size itself.
        if (call.with_target) {
            call.src_w = call.g.src_width;
            call.src_h = call.g.src_height;
        }
        one_band(in, call);
    }
    return 0;
}
