// The frame render through the real module: regions show the right inputs, the border has the
// promised coverage, and every host resource is given back.
#include <algorithm>
#include <cmath>

#include "render_fixture.h"
#include "support/instrumented_host.h"

namespace {

using FrameRender = RenderTest;

using refhost::ParamValue;

const std::string kLayerGreen = "22222222-0000-4000-8000-000000000002";
const std::string kLayerBlue = "33333333-0000-4000-8000-000000000003";

TEST_F(FrameRender, ThreeLocalCutsAndFourRadialCutsPickTheirInputs) {
  addSolidLayer(kLayerGreen, kGreen);
  addSolidLayer(kLayerBlue, kBlue);
  host().setValue("inputLayer1", ParamValue::ofLayer(kLayerGreen));
  host().setValue("inputLayer2", ParamValue::ofLayer(kLayerBlue));
  host().setValue("borderWidth", ParamValue::ofFloat(0.0f));

  // Cut 1 vertical at x = 0 (left half becomes input 1), cut 2 horizontal at y = 0 splitting
  // the left half (direction +x: its left side, y > 0, becomes input 2).
  host().setValue("numberOfCuts", ParamValue::ofInt(2));
  setCut(host(), 0, 0.0f, 0.0f, 0.0f);
  setCut(host(), 1, -16.0f, 0.0f, 90.0f);
  std::vector<uint8_t> pixels = render(kRed);
  EXPECT_EQ(pixel(pixels, 8, 30), kBlue);  // left, top
  EXPECT_EQ(pixel(pixels, 8, 4), kGreen);  // left, bottom
  EXPECT_EQ(pixel(pixels, 50, 30), kRed);  // right half untouched by cut 2
  EXPECT_EQ(pixel(pixels, 50, 4), kRed);

  // Radial, four cuts from the centre at 0, 90, 180, 270 degrees: each quadrant is numbered
  // by the cut at its end in the direction of increasing angle.
  host().setValue("cutType", ParamValue::ofInt(1));
  host().setValue("numberOfCuts", ParamValue::ofInt(4));
  for (int i = 0; i < 4; ++i) setCut(host(), i, 0.0f, 0.0f, 90.0f * static_cast<float>(i));
  addSolidLayer("44444444-0000-4000-8000-000000000004", {255, 255, 0, 255});
  host().setValue("inputLayer3", ParamValue::ofLayer("44444444-0000-4000-8000-000000000004"));
  host().setValue("inputLayer4", ParamValue::ofLayer(kLayerGreen));
  host().setValue("inputLayer1", ParamValue::ofLayer(kLayerBlue));
  host().setValue("inputLayer2", ParamValue::ofLayer(refhost::kNoLayer));
  pixels = render(kRed);
  EXPECT_EQ(pixel(pixels, 50, 30), kRed);                     // +x +y: input 2, own source
  EXPECT_EQ(pixel(pixels, 50, 4), (Rgba{255, 255, 0, 255}));  // +x -y: input 3
  EXPECT_EQ(pixel(pixels, 8, 4), kGreen);                     // -x -y: input 4
  EXPECT_EQ(pixel(pixels, 8, 30), kBlue);                     // -x +y: input 1

  // Pixels twice as wide as high stretch positions across: a Local cut at x = 8 runs at
  // x = 16, column 48, so column 44 is left of it.
  host().setValue("cutType", ParamValue::ofInt(0));
  host().setValue("numberOfCuts", ParamValue::ofInt(1));
  setCut(host(), 0, 8.0f, 0.0f, 0.0f);
  pixelAspect = 2.0f;
  pixels = render(kRed);
  EXPECT_EQ(pixel(pixels, 44, 18), kBlue);
  EXPECT_EQ(pixel(pixels, 52, 18), kRed);
}

// Coverage c = clamp(h - d + 0.5, 0, 1) x clamp(h, 0, 1) of the border colour (premultiplied by
// its alpha) over the picture, h half the border width and d the distance of the pixel centre
// to the cut. No coverage leaves the picture exactly as it was.
TEST_F(FrameRender, BorderCoverageFollowsTheDistanceToTheCut) {
  setCut(host(), 0, 0.5f, 0.0f, 0.0f);  // x = 0.5: pixel centres at whole distances from it
  host().setValue("borderColor", ParamValue::ofColor(1.0f, 0.0f, 0.0f));
  const Rgba picture{100, 100, 100, 255};
  const struct { float width, alpha; } borders[] = {{6, 1}, {6, 0.5f}, {1, 1}, {0, 1}};
  for (const auto& border : borders) {
    host().setValue("borderWidth", ParamValue::ofFloat(border.width));
    host().setValue("borderAlpha", ParamValue::ofFloat(border.alpha));
    const std::vector<uint8_t> pixels = render(picture);
    const float h = border.width / 2.0f;
    const float colour[4] = {255 * border.alpha, 0, 0, 255 * border.alpha};
    for (int column = 26; column < 40; ++column) {
      const float distance = std::fabs(static_cast<float>(column) - 32.0f);
      const float coverage =
          std::clamp(h - distance + 0.5f, 0.0f, 1.0f) * std::clamp(h, 0.0f, 1.0f);
      for (int k = 0; k < 4; ++k) {
        const float expected = picture[k] * (1 - coverage) + colour[k] * coverage;
        EXPECT_NEAR(pixel(pixels, column, 18)[k], expected, coverage > 0 ? 2.0f : 0.0f)
            << "width " << border.width << " alpha " << border.alpha << " column " << column;
      }
    }
  }
}

// With no cut to read (a host may store any count) the output is the source, pixel for pixel.
TEST_F(FrameRender, WithoutCutsTheOutputIsTheSource) {
  host().setValue("numberOfCuts", ParamValue::ofInt(0));
  const refhost::FrameSource ramp = [](int32_t, int32_t width, int32_t height,
                                       refhost::PixelFormat) {
    std::vector<uint8_t> pixels(static_cast<size_t>(width) * static_cast<size_t>(height) * 4);
    for (size_t i = 0; i < pixels.size(); ++i) pixels[i] = static_cast<uint8_t>(i * 7 % 251);
    return pixels;
  };
  EXPECT_EQ(render(kRed, 10, ramp), ramp(10, width(), height(), refhost::PixelFormat::Rgba8));
}

TEST_F(FrameRender, ViewCutRegionsTintsARampOfGreys) {
  host().setValue("viewCutRegions", ParamValue::ofInt(1));
  host().setValue("borderWidth", ParamValue::ofFloat(0.0f));
  setCut(host(), 0, 0.0f, 0.0f, 0.0f);
  const std::vector<uint8_t> pixels = render({255, 255, 255, 255});
  // Region 0 (right) is drawn first at 1/2, region 1 (left) at 2/2.
  EXPECT_NEAR(pixel(pixels, 50, 18)[0], 128, 1);
  EXPECT_EQ(pixel(pixels, 8, 18)[0], 255);
}

TEST_F(FrameRender, ShiftedInputsShowTheirFrameOrTransparentBlack) {
  host().setValue("borderWidth", ParamValue::ofFloat(0.0f));
  setCut(host(), 0, 0.0f, 0.0f, 0.0f);
  const refhost::FrameSource counter = [](int32_t frame, int32_t width, int32_t height,
                                          refhost::PixelFormat) {
    return refhost::RgbaImage(width, height, {static_cast<uint8_t>(frame), 0, 0, 255}).pixels;
  };
  host().setValue("inputFrameShift1", ParamValue::ofInt(-3));
  std::vector<uint8_t> pixels = render(kRed, 10, counter);
  EXPECT_EQ(pixel(pixels, 8, 18), (Rgba{7, 0, 0, 255}));    // frame 10 - 3
  EXPECT_EQ(pixel(pixels, 50, 18), (Rgba{10, 0, 0, 255}));  // the source itself

  host().setValue("inputFrameShift1", ParamValue::ofInt(-12));  // frame -2: out of range
  pixels = render(kRed, 10, counter);
  EXPECT_EQ(pixel(pixels, 8, 18), kClear);
  EXPECT_EQ(pixel(pixels, 50, 18), (Rgba{10, 0, 0, 255}));
}

TEST_F(FrameRender, InputPlacementMovesAndScalesThePicture) {
  host().setValue("borderWidth", ParamValue::ofFloat(0.0f));
  setCut(host(), 0, -31.0f, 0.0f, 0.0f);  // nearly the whole frame is input 0
  host().setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  host().setValue("inputFrameTranslation0", ParamValue::ofPoint(16.0f, 0.0f));
  const std::vector<uint8_t> pixels = render(kRed);
  // Half size (32 x 18), centred 16 px right of the frame centre: x from 32 to 64, y from 9
  // to 27 in corner pixels.
  for (const auto& [x, y] : {std::pair{33, 10}, {62, 26}, {48, 18}})
    EXPECT_EQ(pixel(pixels, x, y), kRed) << x << "," << y;
  for (const auto& [x, y] : {std::pair{30, 18}, {12, 18}, {48, 7}, {48, 29}})
    EXPECT_EQ(pixel(pixels, x, y), kClear) << x << "," << y;
  // Pixels twice as wide as high halve the move across: x from 24 to 56.
  pixelAspect = 2.0f;
  const std::vector<uint8_t> wide = render(kRed);
  EXPECT_EQ(pixel(wide, 26, 18), kRed);
  EXPECT_EQ(pixel(wide, 58, 18), kClear);
}

}  // namespace
