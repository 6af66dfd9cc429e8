// SPDX-License-Identifier: Apache-2.0
#include "report.h"

#include <algorithm>
#include <cmath>
#include <nlohmann/json.hpp>
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

const Samples* samples_of(const Result& result, Role role, const std::string& set) {
    for (size_t i = 0; i < result.contenders.size(); ++i) {
        const Contender& contender = result.contenders[i];
        if (contender.role == role && contender.set == set) return &result.samples[i];
    }
    return nullptr;
}

void add_new(std::vector<std::string>& names, const std::string& name) {
    if (std::find(names.begin(), names.end(), name) == names.end()) names.push_back(name);
}

std::optional<Quartiles> optional_quartiles(const Samples* samples) {
    if (samples == nullptr) return {};
    return quartiles(*samples);
}

std::optional<double> optional_ratio(const Samples* a, const Samples* b) {
    if (a == nullptr || b == nullptr) return {};
    return paired_ratio(*a, *b).median;
}

// The contender with the least median among those of a role.
size_t fastest(const Result& result, Role role) {
    size_t best = result.contenders.size();
    double best_median = INFINITY;
    for (size_t i = 0; i < result.contenders.size(); ++i) {
        if (result.contenders[i].role != role) continue;
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
        case Role::kCopier:
            return "peer that copies samples";
        case Role::kPeer:
            break;
    }
    return "peer";
}

using Json = nlohmann::ordered_json;

Json json_of(const Contender& contender, const Samples& samples) {
    const Quartiles q = quartiles(samples);
    Json json = {{"role", role_name(contender.role)}, {"name", contender.name}};
    if (!contender.set.empty()) json["set"] = contender.set;
    json["rounds"] = samples.size();
    json["median_us"] = q.median * 1e6;
    json["low_quartile_us"] = q.low * 1e6;
    json["high_quartile_us"] = q.high * 1e6;
    return json;
}

Json json_of(const Result& result) {
    const Case& test = result.test;
    Json json = {{"family", test.family},
                 {"case", test.name},
                 {"sampled_pixels", sampled_pixels(test.job, test.sampling)}};
    for (const std::string& set : sets_of(result)) {
        const Figures figures = figures_of(result, set);
        Json of_set = {{"set", set}, {"over_limit", figures.over_limit}};
        if (figures.wrapper_gain) of_set["wrapper_gain"] = *figures.wrapper_gain;
        of_set["best_peer"] = figures.best_peer;
        of_set["faster"] = figures.faster;
        json["sets"].push_back(of_set);
    }
    for (size_t i = 0; i < result.contenders.size(); ++i) {
        json["contenders"].push_back(json_of(result.contenders[i], result.samples[i]));
    }
    return json;
}

}  // namespace

std::vector<std::string> sets_of(const Result& result) {
    std::vector<std::string> sets;
    for (const Contender& contender : result.contenders) {
        if (!contender.set.empty()) add_new(sets, contender.set);
    }
    return sets;
}

Figures figures_of(const Result& result, const std::string& set) {
    const Samples* single = samples_of(result, Role::kSingle, set);
    const Samples* wrapper = samples_of(result, Role::kWrapper, set);
    const Samples& limit = result.samples[fastest(result, Role::kLimit)];
    const size_t peer = fastest(result, Role::kPeer);
    const Samples* ours = single != nullptr ? single : wrapper;
    return {quartiles(limit),
            optional_quartiles(single),
            optional_quartiles(wrapper),
            optional_ratio(single, wrapper),
            paired_ratio(*ours, limit).median,
            result.contenders[peer].name,
            quartiles(result.samples[peer]).median,
            paired_ratio(result.samples[peer], *ours).median};
}

std::vector<FamilyMeans> family_means(const std::vector<Result>& results) {
    std::vector<std::string> families;
    for (const Result& result : results) add_new(families, result.test.family);
    std::vector<FamilyMeans> means;
    for (const std::string& family : families) {
        for (const std::string& set : sets_of(results.front())) {
            Mean over_limit, wrapper_gain, faster;
            for (const Result& result : results) {
                if (result.test.family != family) continue;
                const Figures figures = figures_of(result, set);
                over_limit.add(figures.over_limit);
                wrapper_gain.add(figures.wrapper_gain);
                faster.add(figures.faster);
            }
            means.push_back(
                {family, set, over_limit.value(), wrapper_gain.value(), faster.value()});
        }
    }
    return means;
}

Table result_table(std::ostream& out) {
    return {out,
            {{"family", 13, true},
             {"case", 39, true},
             {"read MP", 7, false},
             {"limit us", 8, false},
             {"set", 6, true},
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
    const Case& test = result.test;
    const std::string read = fixed(sampled_pixels(test.job, test.sampling) / 1e6, 1);
    for (const std::string& set : sets_of(result)) {
        const Figures figures = figures_of(result, set);
        const Quartiles& ours = figures.single ? *figures.single : *figures.wrapper;
        table.print_row({test.family, test.name, read, median_microseconds(figures.limit), set,
                         or_dash(figures.single, median_microseconds), spread(ours),
                         times(figures.over_limit), or_dash(figures.wrapper, median_microseconds),
                         or_dash(figures.wrapper_gain, times), figures.best_peer,
                         microseconds(figures.best_peer_seconds), times(figures.faster)});
    }
}

void print_means(std::ostream& out, const std::vector<Result>& results) {
    Table table(out, {{"geometric mean", 14, true},
                      {"set", 6, true},
                      {"x limit", 7, false},
                      {"gain", 5, false},
                      {"faster", 6, false}});
    for (const FamilyMeans& means : family_means(results)) {
        table.print_row({means.family, means.set, mean_text(means.over_limit),
                         mean_text(means.wrapper_gain), mean_text(means.faster)});
    }
}

void print_copiers(std::ostream& out, const std::vector<Result>& results) {
    const char* title = "\nNot compared with, because they copy single samples there:\n\n";
    for (const Result& result : results) {
        for (size_t i = 0; i < result.contenders.size(); ++i) {
            const Contender& contender = result.contenders[i];
            if (contender.role != Role::kCopier) continue;
            out << title << result.test.family << ' ' << result.test.name << ": " << contender.name
                << ", " << median_microseconds(quartiles(result.samples[i])) << " us\n";
            title = "";
        }
    }
}

void write_json(std::ostream& out, const std::vector<std::string>& machine,
                const std::vector<Result>& results) {
    Json json = {{"machine", machine}, {"cases", Json::array()}};
    for (const Result& result : results) json["cases"].push_back(json_of(result));
    out << json.dump(1) << '\n';
}

}  // namespace bench
