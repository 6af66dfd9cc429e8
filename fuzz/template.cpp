// SPDX-License-Identifier: Apache-2.0
// Names of results, made of a template and the names of inputs, which stand in lines below it.
#include "template.h"

#include <set>
#include <sstream>

#include "file_kind.h"
#include "tool_support.h"

using namespace fuzz;

namespace {

size_t count_of(const std::string& part, const std::string& whole) {
    size_t count = 0;
    for (size_t at = whole.find(part); at != std::string::npos; at = whole.find(part, at + 1)) {
        ++count;
    }
    return count;
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::istringstream lines(text(data, size));
    std::string pattern;
    std::getline(lines, pattern);
    std::vector<std::string> inputs;
    for (std::string line; std::getline(lines, line);) inputs.push_back(line);

    succeeds([&] { tool::kind_of_name(pattern); });
    succeeds([&] {
        // A name that stands nowhere else shows where "%s" was.
        const std::string filled = tool::filled_template(pattern, "\n");
        require(count_of("\n", filled) <= count_of("%s", pattern), "a name that nobody asked for");
        require(filled.size() <= pattern.size(), "a longer name than the template allows");
    });
    succeeds([&] {
        std::set<std::string> results;
        for (const tool::InAndOut& file : tool::in_and_out(inputs, pattern, false)) {
            require(results.insert(file.out).second, "two results of one name");
        }
        require(results.size() == inputs.size(), "not one result for each input");
    });
    return 0;
}
