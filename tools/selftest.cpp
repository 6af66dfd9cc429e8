// SPDX-License-Identifier: Apache-2.0
#include "selftest.h"

#include <dlfcn.h>

#include <cinttypes>
#include <cstdio>
#include <iostream>
#include <map>
#include <sstream>

#include "error.h"
#include "golden/cases.h"
#include "golden_file.h"
#include "json.h"
#include "kernels/kernels.h"

namespace tool {

namespace {

// What one set of kernels, or one library, gave.
struct Outcome {
    std::string of;
    size_t results;
    std::vector<std::string> different;  // the names of those that are not as everywhere
};

std::map<std::string, std::string> golden_hashes() {
    std::map<std::string, std::string> hashes;
    for (const char* const* line = kGoldenLines; *line != nullptr; ++line) {
        std::istringstream words(*line);
        std::string name;
        std::string hash;
        words >> name >> hash;
        hashes[name] = hash;
    }
    return hashes;
}

std::string hexadecimal(uint64_t hash) {
    char digits[17];
    snprintf(digits, sizeof digits, "%016" PRIx64, hash);
    return digits;
}

Outcome outcome_of(const std::string& name, const golden::Api& api) {
    std::map<std::string, std::string> wanted = golden_hashes();
    Outcome outcome = {name, 0, {}};
    for (const golden::Result& result : golden::run_cases(api)) {
        ++outcome.results;
        if (wanted[result.name] != hexadecimal(result.hash)) {
            outcome.different.push_back(result.name);
        }
    }
    return outcome;
}

std::vector<Outcome> outcomes_of_own_sets() {
    const golden::Api linked = OVRIN_LINKED_API;
    ovrin::NamedKernels sets[ovrin::kMaxSets];
    const int32_t count = ovrin::available_kernels(sets);
    std::vector<Outcome> outcomes;
    for (int32_t i = 0; i < count; ++i) {
        ovrin::force_kernels(*sets[i].kernels);
        outcomes.push_back(outcome_of(sets[i].name, linked));
    }
    return outcomes;
}

Outcome outcome_of_library(const std::string& path) {
    // A name without a folder would be looked for among the system's libraries.
    const std::string file = path.find('/') == std::string::npos ? "./" + path : path;
    void* const library = dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (library == nullptr) throw Error(dlerror());
    golden::Api api = {};
    const auto find = [&](const char* name) { return dlsym(library, name); };
    const char* const missing = golden::look_up(api, find);
    if (missing != nullptr) throw Error(path + ": has no " + missing);
    return outcome_of(path, api);
}

std::string in_words(const Outcome& outcome) {
    std::ostringstream words;
    words << outcome.of << ": ";
    if (outcome.different.empty()) {
        words << "all " << outcome.results << " results are right\n";
        return words.str();
    }
    words << outcome.different.size() << " of " << outcome.results << " results are wrong:";
    for (const std::string& name : outcome.different) words << "\n  " << name;
    words << "\n";
    return words.str();
}

Json as_json(const Outcome& outcome) {
    return {{"of", outcome.of}, {"results", outcome.results}, {"wrong", outcome.different}};
}

}  // namespace

bool selftest(const Options& options) {
    const std::vector<Outcome> outcomes = options.library.empty()
                                              ? outcomes_of_own_sets()
                                              : std::vector{outcome_of_library(options.library)};
    bool all_are_right = true;
    Json json = Json::array();
    for (const Outcome& outcome : outcomes) {
        json.push_back(as_json(outcome));
        if (!options.json) std::cout << in_words(outcome);
        if (!outcome.different.empty()) all_are_right = false;
    }
    if (options.json) std::cout << json_line(json);
    return all_are_right;
}

}  // namespace tool
