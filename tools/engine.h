// SPDX-License-Identifier: Apache-2.0
// The library's resamplers by name, and one made of them. All calls of the library are here and in
// lanczos.h.
#pragma once

#include <string>

#include "picture.h"
#include "placement.h"

namespace tool {

enum class Engine { kQuarter, kThumbnail, kBilinear, kBilinearProgressive, kLanczos, kNearest };

const char* name_of(Engine engine);

// Throws Error when the engine cannot resize pictures of this format.
void check_engine(Engine engine, PixelFormat format);

// Resizes into *result, which has the source's format or, where that is YUV, may have another one
// that is. The engine has passed check_engine(). May use up the source.
void resize(Engine engine, Picture* source, Picture* result);

// The Lanczos engine on samples of 1 to 4 bytes that lie side by side.
void resize_lanczos(const uint8_t* src, Size from, uint8_t* dst, Size to, int32_t channels);

// The quarter engine, straight onto a black, transparent canvas. Not for planes other than 4:2:0.
void resize_onto_canvas(const Picture& source, const Placement& placement, Picture* canvas);

// Otherwise the library starts threads for pictures of 1024 rows or more, which changes no byte;
// kBilinearProgressive keeps its own, which do. Before any picture is resized.
void keep_to_calling_thread();

// Threads that work while the library resizes one picture: its own four, and the calling one.
constexpr int64_t kThreadsOfPicture = 5;

// That, or 1 where they keep to the calling one.
int32_t threads_of_picture();

// What the engine makes of white and of full alpha, 255.
int white_of(Engine engine);

}  // namespace tool
