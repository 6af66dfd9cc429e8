// SPDX-License-Identifier: Apache-2.0
// A font of pen strokes: letters, digits and a little punctuation, at any size.
#pragma once

#include <string>
#include <vector>

struct Point {
    double x, y;
};

// The strokes of a line of text as chains of points, in units of the capital height: the baseline
// lies at y = 0, capitals reach up to y = -1, the text starts at x = 0. Characters that the font
// lacks are left out.
std::vector<std::vector<Point>> text_strokes(const std::string& text);
