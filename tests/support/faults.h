// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <vector>

namespace faults {

// What the library asks of the system and may be refused.
enum class Kind { kMalloc, kCalloc, kThread, kMutex, kCondition };
constexpr Kind kAllKinds[] = {Kind::kMalloc, Kind::kCalloc, Kind::kThread, Kind::kMutex,
                              Kind::kCondition};

const char* name(Kind kind);

// Nothing fails; calls and failures are counted from here.
void reset();

// As reset(), and the nth call of this kind (from 1) fails, alone or with all that follow.
void fail(Kind kind, int nth, bool and_all_later = false);

int calls(Kind kind);

// Bytes of the largest block asked for, malloc and calloc alike.
size_t largest_block();

bool has_failed();

// Blocks that the program's own objects obtained and have not released, waiting up to `seconds` for
// background threads to release theirs.
int live_blocks(int seconds = 60);

// Those of them that are `size` bytes long.
std::vector<void*> live_blocks_of(size_t size);

}  // namespace faults
