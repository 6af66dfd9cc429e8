// SPDX-License-Identifier: Apache-2.0
// Lanczos rows for WebAssembly, with 128-bit vectors or, where those are missing, what the compiler
// makes of them; see lanczos_approximation_inl.h for how the byte is decided. Products are rounded
// before they are added. Seven of them and 0.5, added in pairs, go through fewer roundings all the
// same than one after the other.
#include "kernels/lanczos_approximation_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

using Floats = float __attribute__((vector_size(16)));
using Ints = int32_t __attribute__((vector_size(16)));
using Bytes = uint8_t __attribute__((vector_size(4)));

Floats load(const float* floats) {
    Floats value;
    memcpy(&value, floats, sizeof value);
    return value;
}

Floats smaller(Floats a, Floats b) {
    return a < b ? a : b;
}

Floats larger(Floats a, Floats b) {
    return a > b ? a : b;
}

bool any(Ints mask) {
    return (mask[0] | mask[1] | mask[2] | mask[3]) != 0;
}

// Seven rows of sums, to be weighed and added.
class WasmRows {
public:
    WasmRows(const float* const* rows, const double* weights, float uncertain)
        : uncertain_(uncertain) {
        for (int32_t r = 0; r < kLanczosTaps; ++r) {
            rows_[r] = rows[r];
            weights_[r] = static_cast<float>(weights[r]);
        }
    }

    uint64_t add_block(uint8_t* dst, int32_t first) const {
        Ints near[kBlock];
        Ints all = {};
        for (int32_t i = 0; i < kBlock; ++i) {
            near[i] = add_four(dst + i * kPixel, first + i * kPixel);
            all |= near[i];
        }
        if (!any(all)) return 0;
        uint64_t mask = 0;
        for (int32_t i = kBlock * kPixel - 1; i >= 0; --i) {
            mask = mask << 1 | (near[i / kPixel][i % kPixel] & 1);
        }
        return mask;
    }

private:
    // Stores four bytes and tells which of them are uncertain.
    Ints add_four(uint8_t* dst, int32_t i) const {
        const auto product = [&](int32_t r) { return load(rows_[r] + i) * weights_[r]; };
        const Floats half = {0.5F, 0.5F, 0.5F, 0.5F};
        const Floats sum = ((product(0) + product(1)) + (product(2) + product(3))) +
                           ((product(4) + product(5)) + (product(6) + half));
        // Below and above, results are 0 and 255 anyway, and so are these: far from others.
        const Floats value = smaller(larger(sum, half), half + 255.0F);
        const Ints whole = __builtin_convertvector(value, Ints);
        const Bytes bytes = __builtin_convertvector(whole, Bytes);
        memcpy(dst, &bytes, sizeof bytes);
        // Exact, and so is its distance from 1.
        const Floats fraction = value - __builtin_convertvector(whole, Floats);
        return (fraction < uncertain_) | (1.0F - fraction < uncertain_);
    }

    const float* rows_[kLanczosTaps];
    float weights_[kLanczosTaps];
    float uncertain_;
};

struct Wasm {
    using WeightedRows = WasmRows;
    static constexpr bool kMirrors = false;

    static constexpr int32_t kConverted = 16;
    static void convert(float* floats, const uint8_t* bytes) {
        for (int32_t i = 0; i < kConverted; ++i) floats[i] = bytes[i];
    }

    static void sum_group(float* sums, const float* span, const LanczosStripPlan& plan, int32_t x,
                          int32_t first) {
        for (int32_t k = 0; k < kGroup; ++k) {
            const float* const taps = span + (plan.index[x + k] - first) * kPixel;
            const float* const weights = plan.weights[x + k];
            const auto product = [&](int32_t i) { return load(taps + i * kPixel) * weights[i]; };
            const Floats sum = ((product(0) + product(1)) + (product(2) + product(3))) +
                               ((product(4) + product(5)) + product(6));
            memcpy(sums + k * kPixel, &sum, sizeof sum);
        }
    }

    static void run_chains(const LanczosColumns& columns, const LanczosRow& row,
                           const uint16_t* bytes, int32_t count) {
        for (int32_t i = 0; i < count; ++i) run_chain(columns, row, bytes[i]);
    }
};

}  // namespace

FilterLanczos* plan_lanczos_wasm(LanczosStripPlan& plan, const LanczosColumns& columns) {
    return plan_filter<Wasm>(plan, columns);
}

}  // namespace ovrin
