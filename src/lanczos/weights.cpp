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

constexpr float kWanted = 1.0F;

float* new_table() {
    return static_cast<float*>(malloc(kTableEntries * sizeof(float)));
}

// Computes the entries that are kWanted. Distances are a running sum: it drifts below the exact
// multiples, so that entry 12000 lies just short of 3 and is not 0.
void fill_wanted(float* table) {
    double x = 0.0;
    for (int32_t i = 0; i < kTableEntries; ++i, x += kStep) {
        if (table[i] == kWanted) table[i] = static_cast<float>(kernel(x));
    }
}

// Marks the table's entries for samples c - 3 ... c + 3 around a position with fraction `fraction`,
// and notes them in place of the weights. A scale below 1 stretches the kernel over the samples.
void want_taps(double* weights, float* table, double fraction, float scale) {
    for (int32_t j = 0; j < kLanczosTaps; ++j) {
        double distance = fraction + (kLanczosMargin - j);
        if (scale < 1.0F) distance *= static_cast<double>(scale);
        const int32_t entry = entry_of(distance);
        table[entry] = kWanted;
        weights[j] = entry;
    }
}

void fill_taps(double* weights, const float* table) {
    for (int32_t j = 0; j < kLanczosTaps; ++j) {
        weights[j] = static_cast<double>(table[static_cast<int32_t>(weights[j])]);
    }
    // From the smallest distance up: the order is part of the result.
    double sum = weights[kLanczosTaps - 1];
    for (int32_t j = kLanczosTaps - 2; j >= 0; --j) sum += weights[j];
    for (int32_t j = 0; j < kLanczosTaps; ++j) weights[j] /= sum;
}

double fraction_of(double position) {
    return position - static_cast<double>(static_cast<int32_t>(position));
}

float scale_of(int32_t src, int32_t dst) {
    return static_cast<float>(dst) / static_cast<float>(src);
}

}  // namespace

void LanczosWeights::want_columns(float* table, int32_t src_w) {
    const double step = static_cast<double>(src_w) / count_;
    double position = 0.0;
    for (int32_t x = 0; x < count_; ++x, position += step) {
        want_taps(data_ + int64_t{x} * kLanczosTaps, table, fraction_of(position),
                  scale_of(src_w, count_));
    }
}

void LanczosWeights::want_rows(float* table, int32_t src_h) {
    const double step = static_cast<double>(src_h) / count_;
    for (int32_t y = 0; y < count_; ++y) {
        want_taps(data_ + int64_t{y} * kLanczosTaps, table, fraction_of(step * y),
                  scale_of(src_h, count_));
    }
}

void LanczosWeights::fill(const float* table) {
    for (int32_t i = 0; i < count_; ++i) fill_taps(data_ + int64_t{i} * kLanczosTaps, table);
}

LanczosPlan::LanczosPlan(int32_t dst_w, int32_t dst_h)
    : columns(dst_w), rows(dst_h), table(new_table()) {}

LanczosPlan::~LanczosPlan() {
    free(table);
}

bool LanczosPlan::ready() const {
    return columns.data() != nullptr && rows.data() != nullptr && table != nullptr;
}

// A sine takes longer than to find out that nobody wants it: most ratios use a small part of the
// table.
void LanczosPlan::fill(int32_t src_w, int32_t src_h) {
    for (int32_t i = 0; i < kTableEntries; ++i) table[i] = 0.0F;
    columns.want_columns(table, src_w);
    rows.want_rows(table, src_h);
    fill_wanted(table);
    columns.fill(table);
    rows.fill(table);
}

}  // namespace ovrin

float* create_lanczos_lookup(void) {
    float* table = ovrin::new_table();
    if (table == nullptr) return nullptr;
    for (int32_t i = 0; i < ovrin::kTableEntries; ++i) table[i] = ovrin::kWanted;
    ovrin::fill_wanted(table);
    return table;
}
