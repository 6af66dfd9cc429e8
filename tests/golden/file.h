// SPDX-License-Identifier: Apache-2.0
// The golden file: a line "name hash" for each case.
#pragma once

#include <string>
#include <vector>

#include "golden/cases.h"

namespace golden {

// Writes the results to standard output.
void print(const std::vector<Result>& results);

// Compares them with the file, says on standard output what differs, and returns whether nothing
// does. Cases that only one side has are differences too.
bool equal_file(const std::vector<Result>& results, const std::string& path);

// The same with several files; a later one's hash takes the place of an earlier one's.
bool equal_files(const std::vector<Result>& results, const std::vector<std::string>& paths);

}  // namespace golden
