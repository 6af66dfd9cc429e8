// SPDX-License-Identifier: Apache-2.0
#include "report.h"

#include <iomanip>
#include <sstream>

#include "json.h"

namespace tool {

std::string in_words(const Report& report) {
    const Placement& placement = report.placement;
    std::ostringstream words;
    words << name_of(report.format) << " " << to_string(report.source) << " to "
          << to_string(placement.picture);
    if (placement.on_canvas) words << " on " << to_string(placement.result);
    words << ": ";
    if (report.frames > 1) words << report.frames << " frames ";
    words << "resized by " << name_of(report.engine) << " in " << std::fixed << std::setprecision(3)
          << report.resizing_ms / static_cast<double>(report.frames) << " ms";
    words << (report.frames > 1 ? " each\n" : "\n");
    return words.str();
}

std::string as_json(const Report& report) {
    return json_line({
        {"in", report.in},
        {"out", report.out},
        {"format", name_of(report.format)},
        {"source", json_of(report.source)},
        {"picture", json_of(report.placement.picture)},
        {"result", json_of(report.placement.result)},
        {"engine", name_of(report.engine)},
        {"frames", report.frames},
        {"resizing_ms", report.resizing_ms},
    });
}

}  // namespace tool
