// An 8-bit RGBA picture held top row first, the order image files use; GL keeps rows bottom
// first, so crossing between the two is one row flip.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

namespace refhost {

using Rgba8 = std::array<uint8_t, 4>;

struct RgbaImage {
  int32_t width = 0;
  int32_t height = 0;
  std::vector<uint8_t> pixels;  // width * height * 4 bytes, top row first

  RgbaImage() = default;
  // A picture of the size filled with one colour; negative sizes count as 0.
  RgbaImage(int32_t width, int32_t height, Rgba8 fill = {0, 0, 0, 0});

  // x from the left, y from the top; no bounds check.
  uint8_t* at(int32_t x, int32_t y);
  const uint8_t* at(int32_t x, int32_t y) const;
  Rgba8 pixel(int32_t x, int32_t y) const;
  // Fills the rectangle [x0, x1) x [y0, y1), clipped to the picture.
  void fillRect(int32_t x0, int32_t y0, int32_t x1, int32_t y1, Rgba8 colour);
};

// Reverses the row order of width * height RGBA8 pixels: top-first to bottom-first and back.
std::vector<uint8_t> flipRows(const std::vector<uint8_t>& pixels, int32_t width, int32_t height);

// The picture stretched to the size with bilinear filtering between pixel centres (a plain copy
// when the size is unchanged).
RgbaImage resized(const RgbaImage& image, int32_t width, int32_t height);

}  // namespace refhost
