// SPDX-License-Identifier: Apache-2.0
// Measures contenders against each other. In every round each of them is sampled once, in random
// order, on the same picture; ratios are formed within a round, so that a machine that slows down
// or a picture that is harder than others hits both sides, and the median over the rounds counts.
#pragma once

#include "contender.h"

namespace bench {

// What the caches hold when a call begins.
enum class Caches {
    kWarm,  // what calls like it left there
    kCold,  // nothing of either picture, as with a frame that comes from a camera
};

struct Effort {
    Caches caches;
    int rounds;
    double least_seconds;  // a short call is repeated until a sample takes this long
    double most_seconds;   // rounds end when a case has taken this long, but for the first few
};

// Seconds per call, one entry for each round.
using Samples = std::vector<double>;

// The samples of every contender.
std::vector<Samples> measure(const Job& job, const std::vector<Contender>& contenders,
                             const Effort& effort);

struct Quartiles {
    double low;
    double median;
    double high;
};

Quartiles quartiles(Samples samples);

// Of a/b, round by round.
Quartiles paired_ratio(const Samples& a, const Samples& b);

}  // namespace bench
