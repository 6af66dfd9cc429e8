// SPDX-License-Identifier: Apache-2.0
#include "message.h"

#include <cstdio>
#include <string>

namespace tool {

void say(const char* message) {
    std::string line = "ovrinresize: ";
    for (; *message != '\0'; ++message) {
        const auto letter = static_cast<unsigned char>(*message);
        const bool is_control = letter < ' ' || letter == 127;
        line += is_control ? ' ' : *message;
    }
    line += '\n';
    static_cast<void>(fputs(line.c_str(), stderr));
}

}  // namespace tool
