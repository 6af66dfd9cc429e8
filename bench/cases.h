// SPDX-License-Identifier: Apache-2.0
// What is measured.
#pragma once

#include "kernels/kernels.h"
#include "ours.h"

namespace bench {

struct Case {
    std::string family;  // cases that share one geometric mean
    std::string name;    // sizes, and whatever else tells it from the family's others
    Job job;
    Sampling sampling;  // which rows the limit reads
    unsigned peer_filters;
    OurCalls ours;
};

std::vector<Case> all_cases();

// Ours with each of these sets of kernels, the limits and the peers.
std::vector<Contender> contenders_of(const Case& test,
                                     const std::vector<ovrin::NamedKernels>& sets);

}  // namespace bench
