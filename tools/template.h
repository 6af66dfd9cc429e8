// SPDX-License-Identifier: Apache-2.0
// From the names of inputs to those of results, where there are many.
#pragma once

#include <string>
#include <vector>

namespace tool {

struct InAndOut {
    std::string in, out;
};

// "%s" in the template stands for the input's name without folder and ending; "%%" for "%". Throws
// Error when anything else follows a "%".
std::string filled_template(const std::string& text, const std::string& name);

// The files among the inputs, and with is_recursive the image files in those that are folders, each
// with its result: there the folders below come with the name. Throws Error: for a folder without
// is_recursive, and when two results would have the same name.
std::vector<InAndOut> in_and_out(const std::vector<std::string>& inputs, const std::string& text,
                                 bool is_recursive);

}  // namespace tool
