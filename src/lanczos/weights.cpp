// SPDX-License-Identifier: Apache-2.0
#include "lanczos/weights.h"

#include <math.h>
#include <ovrinresize.h>

namespace ovrin {

namespace {

constexpr int32_t kTableEntries = 16000;
constexpr double kStepsPerPixel = 4000.0;
constexpr double kStep = 0.00025;
constexpr double kPi = 3.141592653589793;

// sin(pi t) / (pi t)
double sinc(double t) {
    return t < kStep ? 1.0 : sin(kPi * t) / (kPi * t);
}

double kernel(double x) {
    return x >= 3.0 ? 0.0 : sinc(x) * sinc(x / 3.0);
}

int32_t entry_of(double distance) {
    const double step = fabs(distance) * kStepsPerPixel;
    const int32_t last = kTableEntries - 1;
    return step > last ? last : static_cast<int32_t>(step);
}

float* new_table() {
    return static_cast<float*>(malloc(kTableEntries * sizeof(float)));
}

// Entries of the filter's table.
struct Wanted {
    bool entries[kTableEntries];
};

// Computes the entries that are wanted. Distances are a running sum: it drifts below the exact
// multiples, so that entry 12000 lies just short of 3 and is not 0.
void fill_table(float* table, const Wanted& wanted) {
    double x = 0.0;
    for (int32_t i = 0; i < kTableEntries; ++i, x += kStep) {
        table[i] = wanted.entries[i] ? static_cast<float>(kernel(x)) : 0.0F;
    }
}

double fraction_of(double position) {
    return position - static_cast<double>(static_cast<int64_t>(position));
}

// An axis of the picture. Columns lie at a running sum of source / destination, rows at a multiple
// of it: the two round differently.
enum class Positions { kRunningSum, kMultiple };
struct Axis {
    int32_t source;
    int32_t destination;
    Positions positions;
};

// Calls function(sample, entries of the table for its taps) for the samples of an axis. The taps
// lie around a position, from three before its whole part to three after it. A reduction stretches
// the filter over the samples.
template <class Function>
void for_each_sample(const Axis& axis, const Function& function) {
    const double step = static_cast<double>(axis.source) / axis.destination;
    const float scale = static_cast<float>(axis.destination) / static_cast<float>(axis.source);
    double sum = 0.0;
    for (int32_t i = 0; i < axis.destination; ++i, sum += step) {
        const double position = axis.positions == Positions::kRunningSum ? sum : step * i;
        int32_t entries[kLanczosTaps];
        for (int32_t j = 0; j < kLanczosTaps; ++j) {
            double distance = fraction_of(position) + (kLanczosMargin - j);
            if (scale < 1.0F) distance *= static_cast<double>(scale);
            entries[j] = entry_of(distance);
        }
        function(i, entries);
    }
}

void want_entries(Wanted& wanted, const Axis& axis) {
    for_each_sample(axis, [&](int32_t, const int32_t(&entries)[kLanczosTaps]) {
        for (const int32_t entry : entries) wanted.entries[entry] = true;
    });
}

void fill_weights(LanczosWeights& weights, const Axis& axis, const float* table) {
    for_each_sample(axis, [&](int32_t sample, const int32_t(&entries)[kLanczosTaps]) {
        double* taps = weights.of_sample(sample);
        for (int32_t j = 0; j < kLanczosTaps; ++j) taps[j] = static_cast<double>(table[entries[j]]);
        // From the last one down: the order is part of the result.
        double sum = taps[kLanczosTaps - 1];
        for (int32_t j = kLanczosTaps - 2; j >= 0; --j) sum += taps[j];
        for (int32_t j = 0; j < kLanczosTaps; ++j) taps[j] /= sum;
    });
}

}  // namespace

LanczosPlan::LanczosPlan(int32_t dst_w, int32_t dst_h)
    : columns(dst_w), rows(dst_h), table(new_table()) {}

LanczosPlan::~LanczosPlan() {
    free(table);
}

bool LanczosPlan::ready() const {
    return columns.data() != nullptr && rows.data() != nullptr && table != nullptr;
}

// Most ratios use a small part of the table, and sines take long.
void LanczosPlan::fill(int32_t src_w, int32_t src_h) {
    const Axis across = {src_w, columns.count(), Positions::kRunningSum};
    const Axis down = {src_h, rows.count(), Positions::kMultiple};
    Wanted wanted = {};
    want_entries(wanted, across);
    want_entries(wanted, down);
    fill_table(table, wanted);
    fill_weights(columns, across, table);
    fill_weights(rows, down, table);
}

}  // namespace ovrin

float* create_lanczos_lookup(void) {
    float* table = ovrin::new_table();
    if (table == nullptr) return nullptr;
    ovrin::Wanted all;
    for (bool& entry : all.entries) entry = true;
    ovrin::fill_table(table, all);
    return table;
}
