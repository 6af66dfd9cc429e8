// SPDX-License-Identifier: Apache-2.0
// The fused multiply-add for processors without one, beside the C library's.
#include "kernels/exact_fma.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>

#include "support/random.h"

namespace {

int calls_of_fma = 0;

}  // namespace

// The linker sends all calls of fma here.
extern "C" double __real_fma(double a, double b, double c);
extern "C" double __wrap_fma(double a, double b, double c) {
    ++calls_of_fma;
    return __real_fma(a, b, c);
}

namespace {

using ovrin::bits_of;
using ovrin::double_of;
using ovrin_test::Random;
using ovrin_test::rounds;

void expect_fused(double weight, int byte, double acc) {
    const double wanted = fma(weight, byte, acc);
    const double actual = ovrin::exact_fma(weight, static_cast<uint8_t>(byte), acc);
    if (wanted != wanted && actual != actual) return;
    ASSERT_EQ(bits_of(actual), bits_of(wanted)) << weight << " * " << byte << " + " << acc;
}

// Any sign and significand; the exponent is that of 2 to the power of -`spread` to `spread`.
double number(Random& random, int spread) {
    const auto exponent = static_cast<uint64_t>(1023 + random.between(-spread, spread));
    const auto low = static_cast<uint64_t>(random.between(0, INT32_MAX));
    const auto high = static_cast<uint64_t>(random.between(0, INT32_MAX));
    return double_of((high << 63) | (exponent << 52) |
                     (((high << 31) ^ low) & ((uint64_t{1} << 52) - 1)));
}

TEST(ExactFma, RoundsOnce) {
    Random random(1);
    for (int i = rounds(2000000); i > 0; --i) {
        expect_fused(number(random, 8), random.between(0, 255), number(random, 8));
        if (HasFatalFailure()) FAIL() << random.trace();
    }
}

// The sum lies on a tie, or next to one by as little as the last bit of the product.
TEST(ExactFma, RoundsTiesAndWhatLiesNextToThem) {
    Random random(2);
    for (int i = rounds(500000); i > 0; --i) {
        const int byte = random.between(1, 255);
        const double weight = ldexp(random.between(1, 1023), random.between(-80, -40));
        const double acc = number(random, 12);
        const double half = ldexp(1.0, ilogb(acc) - 53);
        const double tie = half * (2 * random.between(0, 7) + 1);
        for (const double near : {half / byte, tie / byte, nextafter(tie / byte, 0.0), weight,
                                  nextafter(tie / byte, 1.0), tie + weight * 0x1p-30}) {
            expect_fused(near, byte, acc);
            expect_fused(-near, byte, acc);
            if (HasFatalFailure()) FAIL() << random.trace();
        }
    }
}

// What is left when a sum nearly cancels must be exact.
TEST(ExactFma, Cancels) {
    Random random(3);
    for (int i = rounds(500000); i > 0; --i) {
        const double weight = number(random, 20);
        const int byte = random.between(0, 255);
        const double product = weight * byte;
        for (const double acc : {-product, nextafter(-product, 0.0), -product * 0.5}) {
            expect_fused(weight, byte, acc);
            if (HasFatalFailure()) FAIL() << random.trace();
        }
    }
}

TEST(ExactFma, TakesAnyOperands) {
    const double inf = std::numeric_limits<double>::infinity();
    const double values[] = {0.0,       -0.0,        1.0,
                             -1.0,      0x1p-896,    0x1p896,
                             0x1p-897,  0x1p897,     0x1p-1022,
                             0x1p-1074, 0x1.8p-1000, 0x1.fffffffffffffp1023,
                             inf,       -inf,        std::numeric_limits<double>::quiet_NaN()};
    for (const double weight : values) {
        for (const double acc : values) {
            for (const int byte : {0, 1, 3, 255}) expect_fused(weight, byte, acc);
        }
    }
    Random random(4);
    for (int i = rounds(200000); i > 0; --i) {
        expect_fused(number(random, 1022), random.between(0, 255), number(random, 1022));
        if (HasFatalFailure()) FAIL() << random.trace();
    }
}

// The C library's takes more than twice as long.
TEST(ExactFma, AsksTheLibraryForUnusualOperandsOnly) {
    const int before = calls_of_fma;
    const double usual[] = {0.0, 0x1p-896, -0x1p-896, 1.0, nextafter(0x1p896, 0.0)};
    double sum = 0.0;
    for (const double weight : usual) {
        for (const double acc : usual) sum += ovrin::exact_fma(weight, 3, acc);
    }
    Random random(5);
    for (int i = rounds(100000); i > 0; --i) {
        const auto byte = static_cast<uint8_t>(random.between(0, 255));
        sum += ovrin::exact_fma(number(random, 400), byte, number(random, 400));
    }
    EXPECT_EQ(calls_of_fma, before) << sum;
#if !defined(__FP_FAST_FMA)
    const volatile double unusual = 0x1p896;  // not known while compiling
    EXPECT_GT(ovrin::exact_fma(unusual, 3, 1.0), 0.0);
    EXPECT_EQ(calls_of_fma, before + 1) << "calls are not counted";
#endif
}

}  // namespace
