// An RGBA picture held top row first, the order image files use, with 8 bits a channel or, for
// pictures of more than 8 bits, half floats; GL keeps rows bottom first, so crossing between
// the two is one row flip.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

#include "refhost/gl/pixel_format.h"

namespace refhost {

using Rgba8 = std::array<uint8_t, 4>;

struct RgbaImage {
  int32_t width = 0;
  int32_t height = 0;
  PixelFormat format = PixelFormat::Rgba8;
  // width * height * bytesPerPixel(format) bytes, top row first; half floats in this machine's
  // byte order.
  std::vector<uint8_t> pixels;

  RgbaImage() = default;
  // An 8-bit picture of the size filled with one colour; negative sizes count as 0.
  RgbaImage(int32_t width, int32_t height, Rgba8 fill = {0, 0, 0, 0});
  // A picture of the size and format, all zero.
  RgbaImage(int32_t width, int32_t height, PixelFormat format);

  // Channel c of the pixel from 0 to 1, whatever the format; no bounds check.
  float channel(int32_t x, int32_t y, int c) const;
  void setChannel(int32_t x, int32_t y, int c, float value);

  // 8-bit pictures only. x from the left, y from the top; no bounds check.
  uint8_t* at(int32_t x, int32_t y);
  const uint8_t* at(int32_t x, int32_t y) const;
  Rgba8 pixel(int32_t x, int32_t y) const;
  // Fills the rectangle [x0, x1) x [y0, y1), clipped to the picture.
  void fillRect(int32_t x0, int32_t y0, int32_t x1, int32_t y1, Rgba8 colour);
};

// Where row `row` of a picture `height` rows high, counted from the top as image files count,
// lies in GL's order, which counts from the bottom: the one place rows change order. Every copy
// between the two orders (the flips below, the decoders writing GL's order straight away, the
// copy out of GL) places its rows by it.
inline int32_t glRowOf(int32_t row, int32_t height) { return height - 1 - row; }

// Reverses the row order of `height` rows of equal length: top-first to bottom-first and back.
std::vector<uint8_t> flipRows(const std::vector<uint8_t>& pixels, int32_t width, int32_t height);
void copyRowsFlipped(const uint8_t* from, uint8_t* to, std::size_t rowBytes, int32_t rows);

// The picture stretched to the size with bilinear filtering between pixel centres (a plain copy
// when the size is unchanged), in its own format.
RgbaImage resized(const RgbaImage& image, int32_t width, int32_t height);
// The same for `pixels` of a picture fromWidth x fromHeight held elsewhere (an editor's frame),
// in either row order: rows stay in the order they come.
std::vector<uint8_t> resizedPixels(const uint8_t* pixels, int32_t fromWidth, int32_t fromHeight,
                                   PixelFormat format, int32_t width, int32_t height);

// The picture in the format: 8 bits become v / 255 exactly; half floats become 8 bits rounded
// to nearest, clamped to 0 to 255.
RgbaImage converted(const RgbaImage& image, PixelFormat format);

}  // namespace refhost
