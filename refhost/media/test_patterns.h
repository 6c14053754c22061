// Generated pictures: colour bars, a checkerboard, a gradient, solid colours, and a frame
// counter that shows its frame number in digits and in a code block a test can read exactly.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "refhost/media/rgba_image.h"

namespace refhost {

enum class Pattern { Bars, Checker, Gradient, Counter };

// The pattern's name as scenes write it ("bars", "checker", "gradient", "counter").
const char* patternName(Pattern pattern);
std::optional<Pattern> patternFromName(const std::string& name);
const std::vector<std::string>& patternNames();

// Every pattern is opaque and, except the counter, the same at every frame:
// - bars: seven vertical bars of 75% white, yellow, cyan, green, magenta, red and blue
//   (channels 191 or 0), bar i covering the columns x with x * 7 / width == i;
// - checker: squares of max(1, height / 8) pixels from the top-left corner, light (204) where
//   column + row of the square is even, dark (51) elsewhere;
// - gradient: red rising left to right, green rising bottom to top (255 on the top row), blue
//   128, each ramp round(255 * i / (n - 1));
// - counter: the frame number in large digits on dark blue, with its code block (below).
RgbaImage generatePattern(Pattern pattern, int32_t frame, int32_t width, int32_t height);

// Components 0 to 1, clamped, each round(255 * c).
RgbaImage solidColour(const std::array<float, 4>& rgba, int32_t width, int32_t height);

// The counter's code block sits in the top-left corner: 2 rows of 8 square cells of
// counterCodeCell() pixels, cell i (left to right, then the next row) white when bit i of the
// frame number's low 16 bits is set and black otherwise. Black and white survive lossy video
// coding, so a decoded frame still reads back exactly. 0 when the picture has no room for it.
int32_t counterCodeCell(int32_t width, int32_t height);
// The low 16 bits of the frame number shown, read from the centre of each cell (bright means
// set); nothing when the picture is too small to hold a code block.
std::optional<uint16_t> readCounterCode(const RgbaImage& image);

}  // namespace refhost
