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

double look_up(const float* table, double distance) {
    const double step = fabs(distance) * kStepsPerPixel;
    const int32_t last = kTableEntries - 1;
    return static_cast<double>(table[step > last ? last : static_cast<int32_t>(step)]);
}

// The weights of samples c - 3 ... c + 3 around a position with fraction `fraction`. A scale below
// 1 stretches the kernel over them.
void fill_taps(double* weights, const float* table, double fraction, float scale) {
    for (int32_t j = 0; j < kLanczosTaps; ++j) {
        double distance = fraction + (kLanczosMargin - j);
        if (scale < 1.0F) distance *= static_cast<double>(scale);
        weights[j] = look_up(table, distance);
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

void LanczosWeights::fill_columns(const float* table, int32_t src_w, int32_t dst_w) {
    const double step = static_cast<double>(src_w) / dst_w;
    double position = 0.0;
    for (int32_t x = 0; x < dst_w; ++x, position += step) {
        fill_taps(data_ + int64_t{x} * kLanczosTaps, table, fraction_of(position),
                  scale_of(src_w, dst_w));
    }
}

void LanczosWeights::fill_rows(const float* table, int32_t src_h, int32_t dst_h) {
    const double step = static_cast<double>(src_h) / dst_h;
    for (int32_t y = 0; y < dst_h; ++y) {
        fill_taps(data_ + int64_t{y} * kLanczosTaps, table, fraction_of(step * y),
                  scale_of(src_h, dst_h));
    }
}

LanczosPlan::LanczosPlan(int32_t dst_w, int32_t dst_h)
    : columns(dst_w), rows(dst_h), table(create_lanczos_lookup()) {}

LanczosPlan::~LanczosPlan() {
    free(table);
}

bool LanczosPlan::ready() const {
    return columns.data() != nullptr && rows.data() != nullptr && table != nullptr;
}

void LanczosPlan::fill(int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h) {
    columns.fill_columns(table, src_w, dst_w);
    rows.fill_rows(table, src_h, dst_h);
}

}  // namespace ovrin

// Distances are a running sum: it drifts below the exact multiples, so that entry 12000 lies just
// short of 3 and is not 0.
float* create_lanczos_lookup(void) {
    auto* table = static_cast<float*>(malloc(ovrin::kTableEntries * sizeof(float)));
    if (table == nullptr) return nullptr;
    double x = 0.0;
    for (int32_t i = 0; i < ovrin::kTableEntries; ++i, x += ovrin::kStep) {
        table[i] = static_cast<float>(ovrin::kernel(x));
    }
    return table;
}
