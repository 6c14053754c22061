// A preview rendered at half size with every pixel value scaled to match, scaled back up, matches
// the full render but along the edges, which half as many pixels draw more coarsely.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>

#include "refhost/engine/composition.h"
#include "refhost/pipeline/frame_readback.h"
#include "support/engine_fixture.h"

namespace refhost {
namespace {

constexpr int32_t kWidth = 320;
constexpr int32_t kHeight = 180;

TEST(Preview, HalfSizeScaledUpMatchesTheFullRenderEdgesAside) {
  const Layer teal = testsupport::solidLayer("0e000000-0000-4000-8000-00000000000b", kWidth,
                                             kHeight, {26, 153, 153, 255});
  auto started = testsupport::startEngine({kWidth, kHeight, 25.0, 1.0f, 10, ""}, [&](auto& e) {
    // Smooth pictures, so that what differs is where the edges are.
    e.setSourceFrames(
        frameSourceOf(openMediaSource(MediaSpec::ofPattern(Pattern::Gradient), {25, 1})));
    e.addLayer(teal);
  });
  Engine& engine = *started;
  // Two cuts off the centre, a wide border, and pictures moved and scaled in pixels.
  engine.setParam("numberOfCuts", ParamValue::ofInt(2));
  engine.setParam("cutPosition_0", ParamValue::ofPoint(-40, 10));
  engine.setParam("cutDirection_0", ParamValue::ofFloat(20));
  engine.setParam("cutPosition_1", ParamValue::ofPoint(60, -20));
  engine.setParam("cutDirection_1", ParamValue::ofFloat(100));
  engine.setParam("borderWidth", ParamValue::ofFloat(8));
  engine.setParam("borderColor", ParamValue::ofColor(1, 0.8f, 0.1f));
  engine.setParam("inputLayer1", ParamValue::ofLayer(teal.guid));
  engine.setParam("inputFrameTranslation0", ParamValue::ofPoint(40, -25));
  engine.setParam("inputFrameScale0", ParamValue::ofFloat(140));
  engine.setParam("inputFrameTranslation2", ParamValue::ofPoint(-30, 20));
  engine.setParam("inputFrameScale2", ParamValue::ofFloat(70));

  auto full = engine.render(3);
  const RgbaImage fullPicture = readBack(full->context().output.id, kWidth, kHeight);
  auto preview = engine.renderPreview(3, 2);
  ASSERT_EQ(preview->context().width, kWidth / 2);
  const RgbaImage small = readBack(preview->context().output.id, kWidth / 2, kHeight / 2);
  const RgbaImage scaledUp = resized(small, kWidth, kHeight);
  EXPECT_EQ(readBack(engine.render(3)->context().output.id, kWidth, kHeight).pixels,
            fullPicture.pixels)
      << "the scale ends with the preview";

  // Edges aside (a pixel whose 5x5 neighbourhood in the full render spans more than 40 levels
  // in a channel lies at a border's or a picture's edge, which half as many pixels draw more
  // coarsely), every pixel of the scaled-up preview is within 12 levels of the full render.
  auto nearAnEdge = [&](int x, int y) {
    for (int c = 0; c < 3; ++c) {
      int low = 255, high = 0;
      for (int dy = -2; dy <= 2; ++dy)
        for (int dx = -2; dx <= 2; ++dx) {
          const int v = fullPicture.pixel(std::clamp(x + dx, 0, kWidth - 1),
                                          std::clamp(y + dy, 0, kHeight - 1))[c];
          low = std::min(low, v);
          high = std::max(high, v);
        }
      if (high - low > 40) return true;
    }
    return false;
  };
  int compared = 0, far = 0;
  for (int y = 0; y < kHeight; ++y) {
    for (int x = 0; x < kWidth; ++x) {
      if (nearAnEdge(x, y)) continue;
      ++compared;
      for (int c = 0; c < 3; ++c)
        if (std::abs(fullPicture.pixel(x, y)[c] - scaledUp.pixel(x, y)[c]) > 12) {
          ++far;
          break;
        }
    }
  }
  EXPECT_GT(compared, kWidth * kHeight * 85 / 100) << "most of the frame is compared";
  EXPECT_EQ(far, 0);
  engine.finish();
}

}  // namespace
}  // namespace refhost
