// The generated test pictures, drawn top row first.
#include "refhost/media/test_patterns.h"

#include <algorithm>
#include <cmath>

namespace refhost {
namespace {

constexpr Rgba8 kCounterBackground = {32, 48, 96, 255};
constexpr Rgba8 kCounterDigits = {235, 235, 235, 255};
constexpr Rgba8 kCodeSet = {255, 255, 255, 255};
constexpr Rgba8 kCodeClear = {0, 0, 0, 255};
constexpr int kCodeColumns = 8;
constexpr int kCodeRows = 2;

uint8_t ramp(int32_t index, int32_t count) {
  if (count <= 1) return 0;
  return static_cast<uint8_t>(std::lround(255.0 * index / (count - 1)));
}

RgbaImage bars(int32_t width, int32_t height) {
  static const Rgba8 kBars[7] = {{191, 191, 191, 255}, {191, 191, 0, 255}, {0, 191, 191, 255},
                                 {0, 191, 0, 255},     {191, 0, 191, 255}, {191, 0, 0, 255},
                                 {0, 0, 191, 255}};
  RgbaImage image(width, height);
  for (int32_t i = 0; i < 7; ++i) {
    // The first column of bar i is the smallest x with x * 7 / width == i.
    int32_t x0 = (i * width + 6) / 7;
    int32_t x1 = ((i + 1) * width + 6) / 7;
    image.fillRect(x0, 0, x1, height, kBars[i]);
  }
  return image;
}

RgbaImage checker(int32_t width, int32_t height) {
  RgbaImage image(width, height);
  int32_t cell = std::max(1, height / 8);
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x) {
      uint8_t level = ((x / cell + y / cell) % 2 == 0) ? 204 : 51;
      uint8_t* p = image.at(x, y);
      p[0] = p[1] = p[2] = level;
      p[3] = 255;
    }
  }
  return image;
}

RgbaImage gradient(int32_t width, int32_t height) {
  RgbaImage image(width, height);
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x) {
      uint8_t* p = image.at(x, y);
      p[0] = ramp(x, width);
      p[1] = ramp(height - 1 - y, height);
      p[2] = 128;
      p[3] = 255;
    }
  }
  return image;
}

// Seven-segment digits: bit 0 top, 1 top right, 2 bottom right, 3 bottom, 4 bottom left,
// 5 top left, 6 middle.
constexpr uint8_t kDigitSegments[10] = {0x3F, 0x06, 0x5B, 0x4F, 0x66, 0x6D, 0x7D, 0x07, 0x7F, 0x6F};
constexpr uint8_t kMinusSegments = 0x40;

void drawSegments(RgbaImage& image, uint8_t segments, int32_t left, int32_t top, int32_t width,
                  int32_t height, int32_t thickness) {
  int32_t right = left + width, bottom = top + height, middle = top + height / 2;
  int32_t t = thickness;
  const int32_t boxes[7][4] = {{left, top, right, top + t},
                               {right - t, top, right, middle + t / 2 + 1},
                               {right - t, middle - t / 2, right, bottom},
                               {left, bottom - t, right, bottom},
                               {left, middle - t / 2, left + t, bottom},
                               {left, top, left + t, middle + t / 2 + 1},
                               {left, middle - t / 2, right, middle - t / 2 + t}};
  for (int s = 0; s < 7; ++s) {
    if (segments & (1 << s))
      image.fillRect(boxes[s][0], boxes[s][1], boxes[s][2], boxes[s][3], kCounterDigits);
  }
}

void drawNumber(RgbaImage& image, int32_t value) {
  std::string text = std::to_string(value);
  auto count = static_cast<int32_t>(text.size());
  // Digits two fifths of the height, narrowed until the number fits in nine tenths of the width.
  int32_t digitHeight = std::max(5, image.height * 2 / 5);
  auto digitWidth = [](int32_t h) { return std::max(3, h / 2); };
  auto gap = [](int32_t h) { return std::max(1, h / 5); };
  while (digitHeight > 5 &&
         count * digitWidth(digitHeight) + (count - 1) * gap(digitHeight) > image.width * 9 / 10)
    --digitHeight;
  int32_t width = digitWidth(digitHeight);
  int32_t total = count * width + (count - 1) * gap(digitHeight);
  int32_t left = (image.width - total) / 2;
  int32_t top = (image.height - digitHeight) / 2;
  int32_t thickness = std::max(1, digitHeight / 8);
  for (char c : text) {
    uint8_t segments = c == '-' ? kMinusSegments : kDigitSegments[c - '0'];
    drawSegments(image, segments, left, top, width, digitHeight, thickness);
    left += width + gap(digitHeight);
  }
}

RgbaImage counter(int32_t frame, int32_t width, int32_t height) {
  RgbaImage image(width, height, kCounterBackground);
  drawNumber(image, frame);
  int32_t cell = counterCodeCell(width, height);
  auto code = static_cast<uint16_t>(static_cast<uint32_t>(frame) & 0xFFFF);
  for (int bit = 0; cell > 0 && bit < kCodeColumns * kCodeRows; ++bit) {
    int32_t x = (bit % kCodeColumns) * cell, y = (bit / kCodeColumns) * cell;
    image.fillRect(x, y, x + cell, y + cell, (code >> bit) & 1 ? kCodeSet : kCodeClear);
  }
  return image;
}

}  // namespace

const char* patternName(Pattern pattern) {
  switch (pattern) {
    case Pattern::Bars:
      return "bars";
    case Pattern::Checker:
      return "checker";
    case Pattern::Gradient:
      return "gradient";
    case Pattern::Counter:
      return "counter";
  }
  return "";
}

const std::vector<std::string>& patternNames() {
  static const std::vector<std::string> names = {"bars", "checker", "gradient", "counter"};
  return names;
}

std::optional<Pattern> patternFromName(const std::string& name) {
  for (Pattern pattern : {Pattern::Bars, Pattern::Checker, Pattern::Gradient, Pattern::Counter}) {
    if (name == patternName(pattern)) return pattern;
  }
  return std::nullopt;
}

RgbaImage generatePattern(Pattern pattern, int32_t frame, int32_t width, int32_t height) {
  switch (pattern) {
    case Pattern::Bars:
      return bars(width, height);
    case Pattern::Checker:
      return checker(width, height);
    case Pattern::Gradient:
      return gradient(width, height);
    case Pattern::Counter:
      return counter(frame, width, height);
  }
  return RgbaImage(width, height);
}

RgbaImage solidColour(const std::array<float, 4>& rgba, int32_t width, int32_t height) {
  Rgba8 colour{};
  for (int c = 0; c < 4; ++c) {
    float value = std::isnan(rgba[c]) ? 0.0f : std::clamp(rgba[c], 0.0f, 1.0f);
    colour[c] = static_cast<uint8_t>(std::lround(value * 255.0f));
  }
  return RgbaImage(width, height, colour);
}

int32_t counterCodeCell(int32_t width, int32_t height) {
  int32_t cell = std::clamp(std::min(width, height) / 9, 2, 16);
  if (cell * kCodeColumns > width || cell * kCodeRows > height) return 0;
  return cell;
}

std::optional<uint16_t> readCounterCode(const RgbaImage& image) {
  int32_t cell = counterCodeCell(image.width, image.height);
  if (cell == 0) return std::nullopt;
  uint16_t code = 0;
  for (int bit = 0; bit < kCodeColumns * kCodeRows; ++bit) {
    const uint8_t* p =
        image.at((bit % kCodeColumns) * cell + cell / 2, (bit / kCodeColumns) * cell + cell / 2);
    if (p[0] + p[1] + p[2] > 3 * 128) code = static_cast<uint16_t>(code | (1u << bit));
  }
  return code;
}

}  // namespace refhost
