// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace tool {

// Says on standard error what went wrong: one line, whatever the message holds, which may quote
// names and arguments.
void say(const char* message);

}  // namespace tool
