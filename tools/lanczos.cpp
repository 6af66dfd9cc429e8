// SPDX-License-Identifier: Apache-2.0
#include "lanczos.h"

#include <ovrinresize.h>

#include <algorithm>
#include <atomic>
#include <cmath>
#include <cstdlib>
#include <memory>
#include <new>
#include <system_error>
#include <thread>
#include <vector>

namespace tool {

namespace {

constexpr int32_t kTaps = 7;
constexpr int32_t kMiddle = 3;
constexpr int32_t kBandRows = 32;

using FilterTable = std::unique_ptr<float, decltype(&free)>;

FilterTable new_filter_table() {
    FilterTable table(create_lanczos_lookup(), free);
    if (table == nullptr) throw std::bad_alloc();
    return table;
}

// The filter at distances of i / 4000 samples. Sines take long, so it is made once; where there was
// no memory for it, the next call tries again.
const float* filter_table() {
    static const FilterTable table = new_filter_table();
    return table.get();
}

// The positions of the samples of an axis, as band tasks count them: columns as a running sum, rows
// as multiples, which round differently.
std::vector<double> columns_at(int32_t from, int32_t to) {
    const double step = static_cast<double>(from) / to;
    std::vector<double> positions;
    positions.reserve(static_cast<size_t>(to));
    double sum = 0;
    for (int32_t i = 0; i < to; ++i, sum += step) positions.push_back(sum);
    return positions;
}

std::vector<double> rows_at(int32_t from, int32_t to) {
    const double step = static_cast<double>(from) / to;
    std::vector<double> positions;
    positions.reserve(static_cast<size_t>(to));
    for (int32_t i = 0; i < to; ++i) positions.push_back(step * i);
    return positions;
}

// For each position the weights of the taps around it, in the library's own order of rounding: the
// bytes are those of a call for the whole picture. scale: a reduction stretches the filter.
std::vector<double> weights_of(const std::vector<double>& positions, float scale) {
    constexpr double kStepsPerSample = 4000;
    constexpr int32_t kLastStep = 15999;
    const float* const table = filter_table();
    std::vector<double> weights;
    weights.reserve(positions.size() * kTaps);
    for (const double position : positions) {
        const double fraction = position - std::floor(position);
        double taps[kTaps];
        double sum = 0;
        for (int32_t tap = kTaps - 1; tap >= 0; --tap) {
            double distance = std::abs(fraction + (kMiddle - tap));
            if (scale < 1) distance *= static_cast<double>(scale);
            const auto entry = static_cast<int32_t>(distance * kStepsPerSample);
            taps[tap] = static_cast<double>(table[std::min(entry, kLastStep)]);
            sum += taps[tap];
        }
        for (const double tap : taps) weights.push_back(tap / sum);
    }
    return weights;
}

float scale_of(int32_t from, int32_t to) {
    return static_cast<float>(to) / static_cast<float>(from);
}

// What the threads share.
class Bands {
public:
    Bands(const ovrin_lanczos_band& whole, const TakeRows& take) : whole_(whole), take_(take) {}

    int32_t count() const { return (whole_.dst_h + kBandRows - 1) / kBandRows; }

    // Takes one band after the other until there are none. room: for the samples of one.
    void work(uint8_t* room) {
        for (int32_t i = next_++; i < count(); i = next_++) {
            ovrin_lanczos_band band = whole_;
            band.dst = room;
            band.first_row = i * kBandRows;
            band.rows = std::min(kBandRows, whole_.dst_h - band.first_row);
            _resize_lanczos_tp(&band);
            take_(band.first_row, band.rows, room);
        }
    }

private:
    const ovrin_lanczos_band& whole_;
    const TakeRows& take_;
    std::atomic<int32_t> next_ = 0;
};

}  // namespace

void lanczos_in_bands(const uint8_t* src, Size from, Size to, int32_t channels, int32_t threads,
                      const TakeRows& take) {
    const std::vector<double> columns =
        weights_of(columns_at(from.width, to.width), scale_of(from.width, to.width));
    const std::vector<double> rows =
        weights_of(rows_at(from.height, to.height), scale_of(from.height, to.height));
    ovrin_lanczos_band whole = {};
    whole.src_w = from.width;
    whole.src_h = from.height;
    whole.dst_w = to.width;
    whole.dst_h = to.height;
    whole.src = src;
    whole.bytes_per_pixel = channels;
    whole.table = filter_table();
    whole.column_weights = columns.data();
    whole.row_weights = rows.data();
    Bands bands(whole, take);

    const int32_t workers = std::min(threads, bands.count()) - 1;
    const size_t room = Size{to.width, kBandRows}.pixels() * static_cast<size_t>(channels);
    std::vector<uint8_t> rooms(room * static_cast<size_t>(workers + 1));
    std::vector<std::thread> others;
    others.reserve(static_cast<size_t>(workers));
    try {
        for (int32_t i = 0; i < workers; ++i) {
            uint8_t* const own = rooms.data() + room * static_cast<size_t>(i + 1);
            others.emplace_back([&bands, own] { bands.work(own); });
        }
    } catch (const std::system_error&) {
        // Those that there are do the work.
    }
    bands.work(rooms.data());
    for (std::thread& thread : others) thread.join();
}

}  // namespace tool
