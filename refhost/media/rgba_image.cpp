// The RGBA picture record, row flips between image and GL order, and bilinear resizing.
#include "refhost/media/rgba_image.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace refhost {
namespace {

std::size_t byteCount(int32_t width, int32_t height) {
  return static_cast<std::size_t>(std::max(width, 0)) *
         static_cast<std::size_t>(std::max(height, 0)) * 4;
}

}  // namespace

RgbaImage::RgbaImage(int32_t width, int32_t height, Rgba8 fill)
    : width(std::max(width, 0)), height(std::max(height, 0)), pixels(byteCount(width, height)) {
  for (std::size_t i = 0; i < pixels.size(); i += 4) std::memcpy(&pixels[i], fill.data(), 4);
}

uint8_t* RgbaImage::at(int32_t x, int32_t y) {
  return &pixels[(static_cast<std::size_t>(y) * static_cast<std::size_t>(width) +
                  static_cast<std::size_t>(x)) *
                 4];
}

const uint8_t* RgbaImage::at(int32_t x, int32_t y) const {
  return const_cast<RgbaImage*>(this)->at(x, y);
}

Rgba8 RgbaImage::pixel(int32_t x, int32_t y) const {
  const uint8_t* p = at(x, y);
  return {p[0], p[1], p[2], p[3]};
}

void RgbaImage::fillRect(int32_t x0, int32_t y0, int32_t x1, int32_t y1, Rgba8 colour) {
  x0 = std::max(x0, 0);
  y0 = std::max(y0, 0);
  x1 = std::min(x1, width);
  y1 = std::min(y1, height);
  for (int32_t y = y0; y < y1; ++y) {
    for (int32_t x = x0; x < x1; ++x) std::memcpy(at(x, y), colour.data(), 4);
  }
}

std::vector<uint8_t> flipRows(const std::vector<uint8_t>& pixels, int32_t width, int32_t height) {
  std::vector<uint8_t> flipped(pixels.size());
  std::size_t row = static_cast<std::size_t>(std::max(width, 0)) * 4;
  for (int32_t y = 0; y < height && row > 0; ++y) {
    std::size_t from = static_cast<std::size_t>(y) * row;
    std::size_t to = static_cast<std::size_t>(height - 1 - y) * row;
    if (from + row <= pixels.size() && to + row <= flipped.size())
      std::memcpy(&flipped[to], &pixels[from], row);
  }
  return flipped;
}

RgbaImage resized(const RgbaImage& image, int32_t width, int32_t height) {
  if (image.width == width && image.height == height) return image;
  RgbaImage out(width, height);
  if (image.width == 0 || image.height == 0) return out;
  // Pixel centres of the output mapped onto the input, clamped at the edges.
  auto sample = [](int32_t outSize, int32_t inSize, int32_t index, int32_t& low, int32_t& high,
                   float& weight) {
    float position = (static_cast<float>(index) + 0.5f) * static_cast<float>(inSize) /
                         static_cast<float>(outSize) -
                     0.5f;
    position = std::clamp(position, 0.0f, static_cast<float>(inSize - 1));
    low = static_cast<int32_t>(std::floor(position));
    high = std::min(low + 1, inSize - 1);
    weight = position - static_cast<float>(low);
  };
  for (int32_t y = 0; y < out.height; ++y) {
    int32_t y0 = 0, y1 = 0;
    float wy = 0;
    sample(out.height, image.height, y, y0, y1, wy);
    for (int32_t x = 0; x < out.width; ++x) {
      int32_t x0 = 0, x1 = 0;
      float wx = 0;
      sample(out.width, image.width, x, x0, x1, wx);
      for (int c = 0; c < 4; ++c) {
        float top = image.at(x0, y0)[c] * (1 - wx) + image.at(x1, y0)[c] * wx;
        float bottom = image.at(x0, y1)[c] * (1 - wx) + image.at(x1, y1)[c] * wx;
        out.at(x, y)[c] = static_cast<uint8_t>(std::lround(top * (1 - wy) + bottom * wy));
      }
    }
  }
  return out;
}

}  // namespace refhost
