// SPDX-License-Identifier: Apache-2.0
// What the tool says for programs: lines of JSON.
#pragma once

#include <nlohmann/json.hpp>
#include <string>

#include "size.h"

namespace tool {

using Json = nlohmann::ordered_json;

inline Json json_of(Size size) {
    return {{"width", size.width}, {"height", size.height}};
}

// Ends with a line feed. Names of files may be any bytes; those that are no UTF-8 are replaced.
inline std::string json_line(const Json& json) {
    return json.dump(-1, ' ', false, Json::error_handler_t::replace) + "\n";
}

}  // namespace tool
