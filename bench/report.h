// SPDX-License-Identifier: Apache-2.0
// What came out, and how it is shown.
#pragma once

#include <iosfwd>
#include <optional>

#include "cases.h"
#include "runner.h"
#include "table.h"

namespace bench {

struct Result {
    Case test;
    std::vector<Contender> contenders;
    std::vector<Samples> samples;  // of each contender
};

// Our sets of kernels that a result has samples of.
std::vector<std::string> sets_of(const Result& result);

// A result in the numbers that people compare, for one of our sets.
struct Figures {
    Quartiles limit;                  // seconds per call, of the faster one
    std::optional<Quartiles> single;  // the calling thread
    std::optional<Quartiles> wrapper;
    std::optional<double> wrapper_gain;  // calling thread over wrapper
    double over_limit;                   // ours over limit; ours is the calling thread if measured
    std::string best_peer;
    double best_peer_seconds;
    double faster;  // best peer over ours
};

Figures figures_of(const Result& result, const std::string& set);

struct FamilyMeans {
    std::string family;
    std::string set;
    double over_limit;  // 0 where no case has the figure
    double wrapper_gain;
    double faster;
};

// Geometric means, in the order in which families and sets appear.
std::vector<FamilyMeans> family_means(const std::vector<Result>& results);

// The table, to be filled row by row as results come in.
Table result_table(std::ostream& out);
void print_result(Table& table, const Result& result);

void print_means(std::ostream& out, const std::vector<Result>& results);

// The peers that the table leaves out because they copy single samples; nothing when there are
// none.
void print_copiers(std::ostream& out, const std::vector<Result>& results);

// Everything, the peers that were not the best included.
void write_json(std::ostream& out, const std::vector<std::string>& machine,
                const std::vector<Result>& results);

}  // namespace bench
