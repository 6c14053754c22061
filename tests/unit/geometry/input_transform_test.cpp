// Input placement: a quarter turn in a frame that is not square. (Moved and scaled inputs show in
// the rendered frames.)
#include "geometry/input_transform.h"

#include <gtest/gtest.h>

#include "common/param_ids.h"
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
