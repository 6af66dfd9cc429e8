// SPDX-License-Identifier: Apache-2.0
#include "engine.h"

#include <ovrinresize.h>

#include "error.h"

namespace tool {

namespace {

struct Engine {
    const char* name;
    decltype(ovrin_resize_rgba8888)* rgba;
};

constexpr Engine kEngines[] = {{"quarter", ovrin_resize_rgba8888}};

}  // namespace

std::vector<std::string> engine_names() {
    std::vector<std::string> names;
    for (const Engine& engine : kEngines) names.emplace_back(engine.name);
    return names;
}

Picture resize(const Picture& source, Size size, const std::string& engine_name) {
    for (const Engine& engine : kEngines) {
        if (engine.name != engine_name) continue;
        Picture result(size);
        result.has_alpha = source.has_alpha;
        engine.rgba(source.bytes(), result.pixels.data(), source.size.width, source.size.height,
                    size.width, size.height);
        return result;
    }
    throw Error("unknown engine '" + engine_name + "'");
}

}  // namespace tool
