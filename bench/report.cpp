// SPDX-License-Identifier: Apache-2.0
#include "report.h"

#include <algorithm>
#include <cmath>
#include <ostream>

namespace bench {

namespace {

std::string microseconds(double seconds) {
    return fixed(seconds * 1e6, seconds < 1e-4 ? 1 : 0);
}

std::string times(double ratio) {
    return fixed(ratio, ratio < 10 ? 2 : 1);
}

template <class Value>
std::string or_dash(const std::optional<Value>& value, std::string (*show)(Value)) {
    return value ? show(*value) : "-";
}

std::string median_microseconds(Quartiles quartiles) {
    return microseconds(quartiles.median);
}

// Half the distance of the quartiles, as a part of the median.
std::string spread(const Quartiles& q) {
    return fixed(50 * (q.high - q.low) / q.median, 0) + " %";
}

const Samples* samples_of(const Result& result, Role role) {
    for (size_t i = 0; i < result.contenders.size(); ++i) {
        if (result.contenders[i].role == role) return &result.samples[i];
    }
    return nullptr;
}

std::optional<Quartiles> optional_quartiles(const Samples* samples) {
    if (samples == nullptr) return {};
    return quartiles(*samples);
}

std::optional<double> optional_ratio(const Samples* a, const Samples* b) {
    if (a == nullptr || b == nullptr) return {};
    return paired_ratio(*a, *b).median;
}

size_t best_peer_of(const Result& result) {
    size_t best = result.contenders.size();
    double best_median = INFINITY;
    for (size_t i = 0; i < result.contenders.size(); ++i) {
        if (result.contenders[i].role != Role::kPeer) continue;
        const double median = quartiles(result.samples[i]).median;
        if (median < best_median) {
            best = i;
            best_median = median;
        }
    }
    return best;
}

// Geometric mean of the figures that are there; 0 when none is.
class Mean {
public:
    void add(std::optional<double> value) {
        if (!value) return;
        log_sum_ += std::log(*value);
        ++count_;
    }
    double value() const { return count_ == 0 ? 0 : std::exp(log_sum_ / count_); }

private:
    double log_sum_ = 0;
    int count_ = 0;
};

std::string mean_text(double mean) {
    return mean > 0 ? times(mean) : "-";
}

const char* role_name(Role role) {
    switch (role) {
        case Role::kSingle:
            return "single";
        case Role::kWrapper:
            return "wrapper";
        case Role::kLimit:
            return "limit";
        case Role::kPeer:
            break;
    }
    return "peer";
}

// No name here holds a character that would need escaping.
std::string quoted(const std::string& text) {
    return '"' + text + '"';
}

void write_contender(std::ostream& out, const Contender& contender, const Samples& samples) {
    const Quartiles q = quartiles(samples);
    out << "{\"role\": " << quoted(role_name(contender.role))
        << ", \"name\": " << quoted(contender.name) << ", \"rounds\": " << samples.size()
        << ", \"median_us\": " << fixed(q.median * 1e6, 3)
        << ", \"low_quartile_us\": " << fixed(q.low * 1e6, 3)
        << ", \"high_quartile_us\": " << fixed(q.high * 1e6, 3) << '}';
}

void write_result(std::ostream& out, const Result& result) {
    const Figures figures = figures_of(result);
    const Case& test = result.test;
    out << "{\"family\": " << quoted(test.family) << ", \"case\": " << quoted(test.name)
        << ", \"sampled_pixels\": " << fixed(sampled_pixels(test.job, test.sampling), 0);
    out << ", \"over_limit\": " << fixed(figures.over_limit, 4);
    if (figures.wrapper_gain) out << ", \"wrapper_gain\": " << fixed(*figures.wrapper_gain, 4);
    out << ", \"best_peer\": " << quoted(figures.best_peer)
        << ", \"faster\": " << fixed(figures.faster, 4) << ",\n \"contenders\": [";
    for (size_t i = 0; i < result.contenders.size(); ++i) {
        out << (i == 0 ? "\n  " : ",\n  ");
        write_contender(out, result.contenders[i], result.samples[i]);
    }
    out << "]}";
}

}  // namespace

Figures figures_of(const Result& result) {
    const Samples* single = samples_of(result, Role::kSingle);
    const Samples* wrapper = samples_of(result, Role::kWrapper);
    const Samples* limit = samples_of(result, Role::kLimit);
    const size_t peer = best_peer_of(result);
    const Samples* ours = single != nullptr ? single : wrapper;
    return {quartiles(*limit),
            optional_quartiles(single),
            optional_quartiles(wrapper),
            optional_ratio(single, wrapper),
            paired_ratio(*ours, *limit).median,
            result.contenders[peer].name,
            quartiles(result.samples[peer]).median,
            paired_ratio(result.samples[peer], *ours).median};
}

std::vector<FamilyMeans> family_means(const std::vector<Result>& results) {
    std::vector<std::string> families;
    for (const Result& result : results) {
        const std::string& family = result.test.family;
        if (std::find(families.begin(), families.end(), family) == families.end()) {
            families.push_back(family);
        }
    }
    std::vector<FamilyMeans> means;
    for (const std::string& family : families) {
        Mean over_limit, wrapper_gain, faster;
        for (const Result& result : results) {
            if (result.test.family != family) continue;
            const Figures figures = figures_of(result);
            over_limit.add(figures.over_limit);
            wrapper_gain.add(figures.wrapper_gain);
            faster.add(figures.faster);
        }
        means.push_back({family, over_limit.value(), wrapper_gain.value(), faster.value()});
    }
    return means;
}

Table result_table(std::ostream& out) {
    return {out,
            {{"family", 13, true},
             {"case", 39, true},
             {"read MP", 7, false},
             {"ours us", 7, false},
             {"spread", 6, false},
             {"x limit", 7, false},
             {"wrapper", 7, false},
             {"gain", 5, false},
             {"best peer", 22, true},
             {"peer us", 7, false},
             {"faster", 6, false}}};
}

void print_result(Table& table, const Result& result) {
    const Figures figures = figures_of(result);
    const Case& test = result.test;
    const Quartiles& ours = figures.single ? *figures.single : *figures.wrapper;
    table.print_row(
        {test.family, test.name, fixed(sampled_pixels(test.job, test.sampling) / 1e6, 1),
         or_dash(figures.single, median_microseconds), spread(ours), times(figures.over_limit),
         or_dash(figures.wrapper, median_microseconds), or_dash(figures.wrapper_gain, times),
         figures.best_peer, microseconds(figures.best_peer_seconds), times(figures.faster)});
}

void print_means(std::ostream& out, const std::vector<Result>& results) {
    Table table(out, {{"geometric mean", 14, true},
                      {"x limit", 7, false},
                      {"gain", 5, false},
                      {"faster", 6, false}});
    for (const FamilyMeans& means : family_means(results)) {
        table.print_row({means.family, mean_text(means.over_limit), mean_text(means.wrapper_gain),
                         mean_text(means.faster)});
    }
}

void write_json(std::ostream& out, const std::vector<std::string>& machine,
                const std::vector<Result>& results) {
    const char* separator = "";
    out << "{\"machine\": [";
    for (const std::string& line : machine) {
        out << separator << quoted(line);
        separator = ", ";
    }
    out << "],\n\"cases\": [";
    separator = "\n";
    for (const Result& result : results) {
        out << separator;
        write_result(out, result);
        separator = ",\n";
    }
    out << "\n]}\n";
}

}  // namespace bench
