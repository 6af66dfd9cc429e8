// SPDX-License-Identifier: Apache-2.0
// Single bands of the Lanczos engine, with its own weights and with any.
#include <cstring>

#include "reference/lanczos.h"
#include "support.h"

using namespace fuzz;

namespace {

// What _resize_lanczos_tp draws for rows [first, first + rows).
std::vector<uint8_t> definition(const uint8_t* src, const Sizes& s, int32_t bytes, int32_t first,
                                int32_t rows, const reference::LanczosAxis& down,
                                const reference::LanczosAxis& across) {
    std::vector<uint8_t> dst;
    const int64_t slot = (int64_t{s.src_w} + 6) * bytes;
    for (int32_t y = first; y < first + rows; ++y) {
        const auto row = static_cast<size_t>(y);
        const auto cache = reference::row_cache(src, s.src_w, s.src_h, bytes, down.at[row]);
        for (size_t x = 0; x < static_cast<size_t>(s.dst_w); ++x) {
            for (int32_t k = 0; k < bytes; ++k) {
                double sum = 0.0;
                for (size_t r = 0; r < 7; ++r) {
                    const int64_t at =
                        static_cast<int64_t>(r) * slot + int64_t{across.at[x]} * bytes + k;
                    for (size_t i = 0; i < 7; ++i) {
                        const auto tap = static_cast<size_t>(at + static_cast<int64_t>(i) * bytes);
                        const double weight = down.taps[row][r] * across.taps[x][i];
                        sum = reference::fused_step(weight, cache[tap], sum);
                    }
                }
                dst.push_back(reference::clip_to_byte(sum));
            }
        }
    }
    return dst;
}

// Weights that no kernel has: any fraction, and up to `limit`.
void scramble(reference::LanczosAxis& axis, Pixels& bits, double limit) {
    for (auto& taps : axis.taps) {
        for (double& tap : taps) {
            int64_t number;
            bits.fill(reinterpret_cast<uint8_t*>(&number), sizeof number);
            tap = limit * (static_cast<double>(number) / 9223372036854775808.0);
        }
    }
}

Buffer table(const reference::LanczosAxis& axis) {
    Buffer buffer(axis.taps.size() * sizeof(reference::LanczosTaps), Flush::kEnd);
    memcpy(buffer.data(), axis.taps.data(), buffer.size());
    return buffer;
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const std::vector<float> weights = reference::lanczos_table();
    begin_run();
    Input in(data, size);
    const int32_t bytes = in.between(1, 5);
    const Sizes s = short_sizes(in);
    const int32_t first = in.between(0, s.dst_h);
    const int32_t rows = in.between(0, s.dst_h - first);
    reference::LanczosAxis down = reference::lanczos_rows(weights, s.src_h, s.dst_h);
    reference::LanczosAxis across = reference::lanczos_columns(weights, s.src_w, s.dst_w);
    const uint8_t kind = in.byte() % 6;
    Pixels pixels(in);
    if (kind == 1 || kind == 3) scramble(down, pixels, in.pick({0.25, 0.4, 1.0, 100.0, 1e6}));
    if (kind == 2 || kind == 3) scramble(across, pixels, in.pick({0.25, 0.4, 1.0, 100.0, 1e6}));

    const Flush where = flush(in);
    const Buffer src = source(pixels, int64_t{s.src_w} * s.src_h * bytes, where);
    const Buffer row_weights = table(down);
    const Buffer column_weights = table(across);
    ovrin_lanczos_band band = {};
    band.src_w = s.src_w;
    band.src_h = s.src_h;
    band.dst_w = s.dst_w;
    band.dst_h = s.dst_h;
    band.src = src.data();
    band.bytes_per_pixel = bytes;
    band.first_row = first;
    band.rows = rows;
    band.table = weights.data();
    band.column_weights = reinterpret_cast<const double*>(column_weights.data());
    band.row_weights = reinterpret_cast<const double*>(row_weights.data());
    check_drawing(definition(src.data(), s, bytes, first, rows, down, across), where, in.byte(),
                  [&](const Buffer& dst, const char* set) {
                      ovrin_lanczos_band passed = band;
                      passed.dst = dst.data();
                      _resize_lanczos_tp(&passed);
                      src.check_unchanged(set);
                  });
    return 0;
}
