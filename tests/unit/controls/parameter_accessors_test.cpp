// The accessors a control writes through: what a turned input's rectangle and a still press on a
// direction handle write. (Each control's binding to its own cut or input shows in the gestures.)
#include "controls/parameter_accessors.h"

#include <gtest/gtest.h>

#include <cmath>
#include <stdexcept>

#include "common/param_ids.h"
#include "controls/rotation_control.h"
#include "support/in_memory_host.h"

namespace {

using plugin_glsl_types::genVec2;
namespace param = veltrane::param;

constexpr float kPi = 3.1415927f;
const genVec2 kFrame{1920.0f, 1080.0f};

// The conversions of the cut and rotation setters show in the viewer gestures' values; a turned
// input's rectangle is seen only here: widened by its x1 edge to 150 percent, its centre moves
// along the input's own x axis, which points down the screen.
TEST(ParameterAccessors, ATurnedInputsRectangleMovesAlongItsOwnAxes) {
  testsupport::InMemoryHost host;
  host.set("inputFrameRotation2", 90.0f);
  veltrane::inputRectSetter(2)(host.handle(), host.record(), {0, 0, 1920, 1080}, {0, 0, 2880, 1080},
                               veltrane::kEdgeBitX1, 0, kFrame);
  EXPECT_NEAR(host.number("inputFrameTranslation2", 0), 0.0f, 1e-3f);
  EXPECT_NEAR(host.number("inputFrameTranslation2", 1), -480.0f, 1e-3f);
  EXPECT_FLOAT_EQ(host.number("inputFrameScale2"), 150.0f);
  EXPECT_THROW(veltrane::cutDirectionGetter(8), std::out_of_range);
  EXPECT_THROW(veltrane::inputRectSetter(-1), std::out_of_range);
}

TEST(ParameterAccessors, PressingADirectionHandleWithoutMovingWritesTheSameValue) {
  const struct {
    int cutType;
    float degrees;
    float handleDegrees;  // where the handle shows
  } cases[] = {{0, 0.0f, 90.0f}, {0, -30.0f, 60.0f}, {1, 30.0f, 30.0f}, {1, 170.0f, 170.0f}};
  for (const auto& c : cases) {
    testsupport::InMemoryHost host;
    host.setInt(param::kCutType, c.cutType);
    host.set("cutDirection_0", c.degrees);
    veltrane::RotationControl control(veltrane::cutDirectionSetter(0),
                                      veltrane::cutDirectionGetter(0), 0,
                                      veltrane::HandleMode::OnCircle, 6.0f);
    const float a = c.handleDegrees * kPi / 180.0f;
    const genVec2 centre{500.0f, 500.0f};
    const genVec2 onHandle{centre.x + 40.0f * std::sin(a), centre.y + 40.0f * std::cos(a)};
    ASSERT_TRUE(
        control.test(host.handle(), host.record(), centre, 40.0f, onHandle, {1, 1}, 1.0f, 1.0f, 0))
        << c.degrees;
    control.pressed = control.hot;
    control.test(host.handle(), host.record(), centre, 40.0f, onHandle, {1, 1}, 1.0f, 1.0f, 0);
    EXPECT_NEAR(host.number("cutDirection_0"), c.degrees, 1e-4f) << c.cutType;
  }
}

}  // namespace
