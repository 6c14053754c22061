// Generated pictures hold exactly the values they promise, the counter's code block reads
// back the frame number, and frame sources hand GL its rows bottom first (a moving source's
// upright frames are read back through the render context).
#include "refhost/media/test_patterns.h"

#include <gtest/gtest.h>

#include "refhost/engine/composition.h"
#include "refhost/media/media_source.h"

namespace refhost {
namespace {

TEST(TestPatterns, PixelsHoldTheirDocumentedValues) {
  // 70x40 frames: bars of 10 columns, checker squares of 5 pixels.
  const struct {
    Pattern pattern;
    int32_t x, y;
    Rgba8 expected;
  } cases[] = {
      {Pattern::Bars, 9, 39, {191, 191, 191, 255}},
      {Pattern::Bars, 10, 0, {191, 191, 0, 255}},
      {Pattern::Bars, 35, 20, {0, 191, 0, 255}},
      {Pattern::Bars, 69, 0, {0, 0, 191, 255}},
      {Pattern::Checker, 4, 0, {204, 204, 204, 255}},
      {Pattern::Checker, 5, 0, {51, 51, 51, 255}},
      {Pattern::Checker, 5, 5, {204, 204, 204, 255}},
      {Pattern::Gradient, 0, 0, {0, 255, 128, 255}},
      {Pattern::Gradient, 69, 39, {255, 0, 128, 255}},
      {Pattern::Gradient, 23, 13, {85, 170, 128, 255}},
      {Pattern::Counter, 69, 39, {32, 48, 96, 255}},
  };
  for (const auto& c : cases) {
    const RgbaImage image = generatePattern(c.pattern, 3, 70, 40);
    ASSERT_EQ(image.pixels.size(), 70u * 40u * 4u);
    EXPECT_EQ(image.pixel(c.x, c.y), c.expected)
        << patternName(c.pattern) << " at " << c.x << "," << c.y;
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
  } cases[] = {
      {0, 64, 36, 0},         {1, 64, 36, 1},         {255, 64, 36, 255},
      {1234, 320, 180, 1234}, {65535, 64, 36, 65535}, {65536 + 7, 64, 36, 7},
      {-1, 64, 36, 65535},    {42, 1920, 1080, 42},   {9, 15, 15, std::nullopt},
  };
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
