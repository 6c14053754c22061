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

// 0 to 1 as 0 to 255, rounded; below 0 and NaN give 0, above 1 gives 255.
uint8_t unitToByte(float value) {
  if (!(value > 0.0f)) return 0;
  return static_cast<uint8_t>(std::lround(std::min(value, 1.0f) * 255.0f));
}

}  // namespace

RgbaImage::RgbaImage(int32_t width, int32_t height, PixelFormat format)
    : width(std::max(width, 0)),
      height(std::max(height, 0)),
      format(format),
      pixels(byteCount(width, height) / 4 * bytesPerPixel(format)) {}

float RgbaImage::channel(int32_t x, int32_t y, int c) const {
  const std::size_t index = (static_cast<std::size_t>(y) * static_cast<std::size_t>(width) +
                             static_cast<std::size_t>(x)) *
                                4 +
                            static_cast<std::size_t>(c);
  if (format == PixelFormat::Rgba8) return pixels[index] / 255.0f;
  uint16_t half;
  std::memcpy(&half, &pixels[index * 2], 2);
  return floatFromHalf(half);
}

void RgbaImage::setChannel(int32_t x, int32_t y, int c, float value) {
  const std::size_t index = (static_cast<std::size_t>(y) * static_cast<std::size_t>(width) +
                             static_cast<std::size_t>(x)) *
                                4 +
                            static_cast<std::size_t>(c);
  if (format == PixelFormat::Rgba8) {
    pixels[index] = unitToByte(value);
    return;
  }
  const uint16_t half = halfFromFloat(value);
  std::memcpy(&pixels[index * 2], &half, 2);
}

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

void copyRowsFlipped(const uint8_t* from, uint8_t* to, std::size_t rowBytes, int32_t rows) {
  for (int32_t y = 0; y < rows; ++y)
    std::memcpy(to + static_cast<std::size_t>(glRowOf(y, rows)) * rowBytes,
                from + static_cast<std::size_t>(y) * rowBytes, rowBytes);
}

std::vector<uint8_t> flipRows(const std::vector<uint8_t>& pixels, int32_t width, int32_t height) {
  std::vector<uint8_t> flipped(pixels.size());
  if (width <= 0 || height <= 0) return flipped;
  copyRowsFlipped(pixels.data(), flipped.data(), pixels.size() / static_cast<std::size_t>(height),
                  height);
  return flipped;
}

std::vector<uint8_t> resizedPixels(const uint8_t* pixels, int32_t fromWidth, int32_t fromHeight,
                                   PixelFormat format, int32_t width, int32_t height) {
  width = std::max(width, 0);
  height = std::max(height, 0);
  const std::size_t pixel = bytesPerPixel(format);
  std::vector<uint8_t> out(static_cast<std::size_t>(width) * height * pixel);
  if (fromWidth <= 0 || fromHeight <= 0) return out;
  if (fromWidth == width && fromHeight == height) {
    std::memcpy(out.data(), pixels, out.size());
    return out;
  }
  auto at = [&](int32_t x, int32_t y) {
    return (static_cast<std::size_t>(y) * static_cast<std::size_t>(fromWidth) +
            static_cast<std::size_t>(x)) *
           pixel;
  };
  auto sampleOf = [&](std::size_t offset, int c) {
    if (format == PixelFormat::Rgba8) return static_cast<float>(pixels[offset + c]);
    uint16_t half;
    std::memcpy(&half, pixels + offset + 2 * c, 2);
    return floatFromHalf(half);
  };
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
  for (int32_t y = 0; y < height; ++y) {
    int32_t y0 = 0, y1 = 0;
    float wy = 0;
    sample(height, fromHeight, y, y0, y1, wy);
    for (int32_t x = 0; x < width; ++x) {
      int32_t x0 = 0, x1 = 0;
      float wx = 0;
      sample(width, fromWidth, x, x0, x1, wx);
      uint8_t* to = &out[(static_cast<std::size_t>(y) * width + x) * pixel];
      for (int c = 0; c < 4; ++c) {
        const float top = sampleOf(at(x0, y0), c) * (1 - wx) + sampleOf(at(x1, y0), c) * wx;
        const float bottom = sampleOf(at(x0, y1), c) * (1 - wx) + sampleOf(at(x1, y1), c) * wx;
        const float value = top * (1 - wy) + bottom * wy;
        if (format == PixelFormat::Rgba8) {
          to[c] = static_cast<uint8_t>(std::lround(value));
        } else {
          const uint16_t half = halfFromFloat(value);
          std::memcpy(to + 2 * c, &half, 2);
        }
      }
    }
  }
  return out;
}

RgbaImage resized(const RgbaImage& image, int32_t width, int32_t height) {
  if (image.width == width && image.height == height) return image;
  RgbaImage out(width, height, image.format);
  out.pixels = resizedPixels(image.pixels.data(), image.width, image.height, image.format,
                             out.width, out.height);
  return out;
}

RgbaImage converted(const RgbaImage& image, PixelFormat format) {
  if (image.format == format) return image;
  RgbaImage out(image.width, image.height, format);
  const std::size_t values = static_cast<std::size_t>(image.width) * image.height * 4;
  if (format == PixelFormat::RgbaHalf) {
    uint16_t table[256];
    for (int v = 0; v < 256; ++v) table[v] = halfFromFloat(v / 255.0f);
    for (std::size_t i = 0; i < values; ++i)
      std::memcpy(&out.pixels[i * 2], &table[image.pixels[i]], 2);
    return out;
  }
  for (std::size_t i = 0; i < values; ++i) {
    uint16_t half;
    std::memcpy(&half, &image.pixels[i * 2], 2);
    out.pixels[i] = unitToByte(floatFromHalf(half));
  }
  return out;
}

}  // namespace refhost
