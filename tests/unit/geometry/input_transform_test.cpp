// Input placement: the sampling transform from the input parameters and the control rectangle.
#include "geometry/input_transform.h"

#include <gtest/gtest.h>

#include "effect/param_ids.h"
#include "geometry/angles.h"
#include "support/in_memory_host.h"

namespace veltrane {
namespace {

class InputTransform : public ::testing::Test {
 protected:
  void place(int input, float tx, float ty, float scale, float degrees) {
    host.setPoint(inputParamId(param::kInputFrameTranslationPrefix, input), tx, ty);
    host.set(inputParamId(param::kInputFrameScalePrefix, input), scale);
    host.set(inputParamId(param::kInputFrameRotationPrefix, input), degrees);
  }
  testsupport::InMemoryHost host;
};

TEST_F(InputTransform, SamplingFromParameters) {
  const float wide = 1920.0f / 1080.0f;
  const struct {
    const char* what;
    float tx, ty, scale, degrees;
    int32_t width, height;
    bool aspectPresent;
    float aspect, offsetX, offsetY, inverseScale, rotation, aspectRatio;
  } cases[] = {
      {"identity", 0, 0, 100, 0, 1920, 1080, false, 1, 0, 0, 1, 0, wide},
      {"double size", 0, 0, 200, 0, 1920, 1080, false, 1, 0, 0, 0.5f, 0, wide},
      {"scale 0 samples unscaled", 0, 0, 0, 0, 100, 100, false, 1, 0, 0, 1, 0, 1},
      {"moved, pixel aspect 2", 100, -54, 100, 0, 1920, 1080, true, 2, -100.0f / 3840, 0.05f, 1, 0,
       wide},
      {"pixel aspect needs its flag", 100, 0, 100, 0, 1920, 1080, false, 2, -100.0f / 1920, 0, 1, 0,
       wide},
      {"turned", 0, 0, 100, 90, 64, 64, false, 1, 0, 0, 1, -kHalfPi, 1},
  };
  for (const auto& c : cases) {
    place(3, c.tx, c.ty, c.scale, c.degrees);
    const InputSampling s = readInputSampling(host.handle(), host.record(), 0, c.width, c.height,
                                              c.aspectPresent, c.aspect, 3);
    EXPECT_FLOAT_EQ(s.sampleOffset.x, c.offsetX) << c.what;
    EXPECT_FLOAT_EQ(s.sampleOffset.y, c.offsetY) << c.what;
    EXPECT_FLOAT_EQ(s.inverseScale, c.inverseScale) << c.what;
    EXPECT_FLOAT_EQ(s.sampleRotation, c.rotation) << c.what;
    EXPECT_FLOAT_EQ(s.aspectRatio, c.aspectRatio) << c.what;
  }
  EXPECT_EQ(makeInputSampling({0, 0}, 100, 0, 64, 0, 1).aspectRatio, 1.0f);  // height 0
}

TEST_F(InputTransform, QuarterTurnPointsThePictureUpAlongPlusX) {
  // In a 2:1 frame the turn is true on screen: the middle of the picture's top edge lands half
  // a picture height, a quarter of the frame width, right of the centre.
  place(0, 0, 0, 100, 90);
  const InputSampling s = readInputSampling(host.handle(), host.record(), 0, 200, 100, false, 1, 0);
  const auto picture = inputTextureCoordinate(s, {0.75f, 0.5f});
  EXPECT_NEAR(picture.x, 0.5f, 1e-6f);
  EXPECT_NEAR(picture.y, 1.0f, 1e-6f);
}

}  // namespace
}  // namespace veltrane
