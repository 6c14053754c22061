// Pointer gestures over parameters and viewer measures a host may hand over unchecked: every
// message returns, and every undo step a press opens is closed by its release.
#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <random>

#include "viewer_fixture.h"

namespace controls_test {
namespace {

using HostileInput = ViewerFixture;

TEST_F(HostileInput, GesturesStayBalancedWhateverTheParameters) {
  const float inf = std::numeric_limits<float>::infinity();
  const float nan = std::numeric_limits<float>::quiet_NaN();
  const float floats[] = {0.0f,    1.0f,  -1.0f,  0.5f, 100.0f, 540.0f,
                          -960.0f, 1e30f, -1e30f, inf,  -inf,   nan};
  const int counts[] = {-3, 0, 1, 2, 7, 8, 99};
  const int sizes[] = {0, 1, 2, 1920};
  const double scales[] = {0.0, 1.0, 1e-30, 1e300, std::nan("")};
  std::mt19937 random(2024);
  const auto pick = [&random](const auto& table) {
    return table[std::uniform_int_distribution<size_t>(0, std::size(table) - 1)(random)];
  };

  for (int trial = 0; trial < 400; ++trial) {
    restart();
    context_.width = pick(sizes);
    context_.height = pick(sizes);
    context_.viewScaleX = pick(scales);
    context_.viewScaleY = pick(scales);
    context_.uiScale = pick(scales);
    host_.setInt(param::kNumberOfCuts, pick(counts));
    host_.setChoice(param::kCutType, pick(counts));
    host_.setPoint(param::kCutPositionGlobal, pick(floats), pick(floats));
    for (int i = 0; i < veltrane::kMaxCuts; ++i) {
      host_.setPoint(cutParamId(param::kCutPositionPrefix, i), pick(floats), pick(floats));
      host_.setAngle(cutParamId(param::kCutDirectionPrefix, i), pick(floats));
    }
    for (int j = 0; j < veltrane::kInputCount; ++j) {
      host_.setPoint(inputParamId(param::kInputFrameTranslationPrefix, j), pick(floats),
                     pick(floats));
      host_.setFloat(inputParamId(param::kInputFrameScalePrefix, j), pick(floats));
      host_.setAngle(inputParamId(param::kInputFrameRotationPrefix, j), pick(floats));
    }
    if (trial % 3 == 0) veltrane::onKeyDown(host(), api(), veltrane::kKeyLeftShift);
    instance().selectedInput = static_cast<int>(random() % 10) - 1;
    host_.recordCalls(true);

    std::uniform_int_distribution<int> coordinate(-100, 2000);
    for (int gesture = 0; gesture < 3; ++gesture) {
      move(coordinate(random), coordinate(random), 0.0);
      press(coordinate(random), coordinate(random));
      move(coordinate(random), coordinate(random), 1.0);
      move(coordinate(random), coordinate(random), 1.0);
      release(coordinate(random), coordinate(random));
      ASSERT_EQ(callsOf("BeginUndo").size(), callsOf("EndUndo").size()) << "trial " << trial;
    }
  }
}

}  // namespace
}  // namespace controls_test
