// SPDX-License-Identifier: Apache-2.0
#include "color.h"

#include <charconv>

#include "error.h"

namespace tool {

namespace {

struct Named {
    const char* name;
    Color color;
};

constexpr Named kNames[] = {
    {"black", kBlack},         {"white", kWhite},       {"gray", {128, 128, 128}},
    {"red", {255, 0, 0}},      {"green", {0, 128, 0}},  {"blue", {0, 0, 255}},
    {"yellow", {255, 255, 0}}, {"cyan", {0, 255, 255}}, {"magenta", {255, 0, 255}},
};

uint8_t byte_of(uint32_t number, int shift) {
    return static_cast<uint8_t>(number >> shift);
}

}  // namespace

Color parse_color(const std::string& text) {
    for (const Named& named : kNames) {
        if (text == named.name) return named.color;
    }
    std::string digits;
    if (!text.empty() && text[0] == '#') digits = text.substr(1);
    if (digits.size() == 3) {
        digits = {digits[0], digits[0], digits[1], digits[1], digits[2], digits[2]};
    }
    uint32_t number = 0;
    const char* const end = digits.data() + digits.size();
    const auto [stop, status] = std::from_chars(digits.data(), end, number, 16);
    if (digits.size() != 6 || status != std::errc() || stop != end) {
        throw Error("'" + text + "' is not a colour; write it like #ff8000 or white");
    }
    return {byte_of(number, 16), byte_of(number, 8), byte_of(number, 0)};
}

}  // namespace tool
