// SPDX-License-Identifier: Apache-2.0
#include "golden/file.h"

#include <cinttypes>
#include <cstdio>
#include <fstream>
#include <map>

namespace golden {

namespace {

std::string hex(uint64_t hash) {
    char digits[17];
    snprintf(digits, sizeof digits, "%016" PRIx64, hash);
    return digits;
}

using Hashes = std::map<std::string, std::string>;

// A later file's hash takes the place of an earlier one's.
Hashes read(const std::vector<std::string>& paths) {
    Hashes hashes;
    for (const std::string& path : paths) {
        std::ifstream file(path);
        for (std::string name, hash; file >> name >> hash;) hashes[name] = hash;
    }
    return hashes;
}

}  // namespace

void print(const std::vector<Result>& results) {
    for (const Result& result : results) {
        printf("%s %s\n", result.name.c_str(), hex(result.hash).c_str());
    }
}

bool equal_files(const std::vector<Result>& results, const std::vector<std::string>& paths) {
    Hashes wanted = read(paths);
    size_t differences = 0;
    for (const Result& result : results) {
        const auto found = wanted.find(result.name);
        if (found == wanted.end()) {
            printf("DIFFERS %s is not in the file, or is there twice\n", result.name.c_str());
            ++differences;
            continue;
        }
        const std::string actual = hex(result.hash);
        if (found->second != actual) {
            printf("DIFFERS %s gave %s, not %s\n", result.name.c_str(), actual.c_str(),
                   found->second.c_str());
            ++differences;
        }
        wanted.erase(found);
    }
    for (const auto& [name, hash] : wanted) printf("DIFFERS %s was not run\n", name.c_str());
    differences += wanted.size();
    printf("%zu cases, %zu differ from %s\n", results.size(), differences, paths.back().c_str());
    return differences == 0 && !results.empty();
}

bool equal_file(const std::vector<Result>& results, const std::string& path) {
    return equal_files(results, {path});
}

}  // namespace golden
