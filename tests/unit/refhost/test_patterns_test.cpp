// Generated pictures keep the promises the tests rely on at every size, the counter's code reads
// back its frame, and frame sources hand GL the bottom row first.
#include "refhost/media/test_patterns.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <set>
#include <utility>
#include <vector>

#include "refhost/engine/composition.h"
#include "refhost/media/media_source.h"

namespace refhost {
namespace {

// At every size, opaque: seven distinct full-height bars of even width; two greys alternating
// square by square from a light corner; red rising to the right and green upwards, blue held.
TEST(TestPatterns, PicturesKeepTheirShapeAtEverySize) {
  for (const auto& [width, height] : {std::pair{1, 1}, {7, 3}, {64, 36}, {71, 40}, {320, 180}}) {
    SCOPED_TRACE(std::to_string(width) + "x" + std::to_string(height));
    for (const std::string& name : patternNames()) {
      const RgbaImage image = generatePattern(*patternFromName(name), 3, width, height);
      ASSERT_EQ(image.pixels.size(), static_cast<size_t>(width * height * 4)) << name;
      for (size_t alpha = 3; alpha < image.pixels.size(); alpha += 4)
        ASSERT_EQ(image.pixels[alpha], 255) << name;
    }
    const RgbaImage bars = generatePattern(Pattern::Bars, 0, width, height);
    const RgbaImage checker = generatePattern(Pattern::Checker, 0, width, height);
    const RgbaImage gradient = generatePattern(Pattern::Gradient, 0, width, height);
    std::vector<std::pair<Rgba8, int32_t>> columns;  // each bar's colour and width
    const Rgba8 light = checker.pixel(0, 0);
    int32_t cell = 1;
    while (cell < width && checker.pixel(cell, 0) == light) ++cell;
    for (int32_t x = 0; x < width; ++x) {
      if (columns.empty() || columns.back().first != bars.pixel(x, 0))
        columns.push_back({bars.pixel(x, 0), 0});
      ++columns.back().second;
      for (int32_t y = 0; y < height; ++y) {
        const Rgba8 square = checker.pixel(x, y), ramp = gradient.pixel(x, y);
        ASSERT_EQ(bars.pixel(x, y), bars.pixel(x, 0)) << x << "," << y;
        ASSERT_TRUE(square[0] == square[1] && square[1] == square[2]) << "grey";
        ASSERT_EQ(square == light, (x / cell + y / cell) % 2 == 0) << x << "," << y;
        ASSERT_EQ(ramp[2], gradient.pixel(0, 0)[2]);
        ASSERT_GE(ramp[0], gradient.pixel(std::max(x - 1, 0), y)[0]) << x << "," << y;
        ASSERT_LE(ramp[1], gradient.pixel(x, std::max(y - 1, 0))[1]) << "rows count from the top";
      }
    }
    std::set<Rgba8> colours;
    for (const auto& [colour, count] : columns) {
      colours.insert(colour);
      EXPECT_LE(std::abs(count - width / 7), 1);
    }
    EXPECT_EQ(colours.size(), static_cast<size_t>(std::min(width, 7)));
    EXPECT_EQ(columns.size(), colours.size()) << "no colour comes back further right";
    EXPECT_TRUE(width <= cell || checker.pixel(cell, 0)[0] < light[0]) << "the other is darker";
    if (width > 1 && height > 1) {
      EXPECT_EQ(gradient.pixel(0, height - 1), (Rgba8{0, 0, gradient.pixel(0, 0)[2], 255}));
      EXPECT_EQ(gradient.pixel(width - 1, 0)[0], 255);
      EXPECT_EQ(gradient.pixel(0, 0)[1], 255);
    }
  }
  for (const std::string& name : patternNames())
    EXPECT_EQ(patternName(*patternFromName(name)), name);
  EXPECT_FALSE(patternFromName("Bars").has_value());
  EXPECT_EQ(solidColour({0.5f, 0, 1, 1}, 2, 2).pixel(1, 1), (Rgba8{128, 0, 255, 255}));
  EXPECT_EQ(solidColour({-1, 2, 0.2f, 0}, 1, 1).pixel(0, 0), (Rgba8{0, 255, 51, 0}));
}

TEST(TestPatterns, CounterShowsItsFrameInCodeAndDigits) {
  const struct {
    int32_t frame, width, height;
    std::optional<uint16_t> expected;
  } cases[] = {{0, 64, 36, 0},         {1, 64, 36, 1},         {255, 64, 36, 255},
               {1234, 320, 180, 1234}, {65535, 64, 36, 65535}, {65536 + 7, 64, 36, 7},
               {-1, 64, 36, 65535},    {42, 1920, 1080, 42},   {9, 15, 15, std::nullopt}};
  for (const auto& c : cases) {
    EXPECT_EQ(readCounterCode(generatePattern(Pattern::Counter, c.frame, c.width, c.height)),
              c.expected)
        << c.frame << " at " << c.width << "x" << c.height;
  }
  // Different frames look different outside the code block too: the digits change.
  RgbaImage one = generatePattern(Pattern::Counter, 1, 320, 180);
  RgbaImage two = generatePattern(Pattern::Counter, 8, 320, 180);
  const int32_t cell = counterCodeCell(320, 180);
  one.fillRect(0, 0, 8 * cell, 2 * cell, {0, 0, 0, 0});
  two.fillRect(0, 0, 8 * cell, 2 * cell, {0, 0, 0, 0});
  EXPECT_NE(one.pixels, two.pixels);
}

TEST(FrameSource, HandsGlTheBottomRowFirstAtAnySize) {
  FrameSource source =
      frameSourceOf(openMediaSource(MediaSpec::ofPattern(Pattern::Gradient), {25, 1}));
  const std::vector<uint8_t> rows = source(0, 4, 3, PixelFormat::Rgba8);
  ASSERT_EQ(rows.size(), 4u * 3u * 4u);
  EXPECT_EQ(rows[1], 0);                  // green of the bottom row
  EXPECT_EQ(rows[rows.size() - 3], 255);  // green of the top row
  EXPECT_EQ(source(0, 2, 2, PixelFormat::Rgba8).size(), 16u)
      << "a still source is not stuck at its first size";
}

}  // namespace
}  // namespace refhost
