// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace tool {

// The lines of the project's golden file, "name hash" for each case; then null. The build makes
// them of the file itself.
extern const char* const kGoldenLines[];

}  // namespace tool
