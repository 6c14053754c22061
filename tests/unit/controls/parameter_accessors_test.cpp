// The accessors a control writes through, and the record that binds them to cuts and inputs.
#include "controls/parameter_accessors.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <stdexcept>

#include "effect/instance_record.h"
#include "effect/param_ids.h"
#include "support/in_memory_host.h"

namespace {

using plugin_glsl_types::genVec2;
using veltrane::cutParamId;
using veltrane::inputParamId;
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

TEST(EffectInstance, ControlsAreBoundToTheirOwnCutOrInputAndSurviveACopy) {
  tagWispAPI slot{}, other{};
  veltrane::createInstance(&slot);
  veltrane::createInstance(&other);
  veltrane::EffectInstance& record = *veltrane::instanceOf(&slot);
  EXPECT_EQ(record.selectedInput, -1);
  record.selectedInput = 3;
  record.shiftDown = 1;
  veltrane::copyInstance(&other, &record);
  const veltrane::EffectInstance& copy = *veltrane::instanceOf(&other);
  EXPECT_EQ(copy.selectedInput, 3);
  EXPECT_EQ(copy.shiftDown, 1);

  // Each control, in the original and in the copy, reads and writes exactly its own parameters.
  testsupport::InMemoryHost host;
  const auto writtenIds = [&host] {
    std::vector<std::string> ids;
    for (const std::string& call : host.callLog()) {
      const size_t id = call.find(' ') + 1;
      if (call.rfind("Set", 0) == 0) ids.push_back(call.substr(id, call.find(' ', id) - id));
    }
    host.clearCallLog();
    std::sort(ids.begin(), ids.end());
    return ids;
  };
  const veltrane::EffectInstance* both[] = {&record, &copy};
  for (const veltrane::EffectInstance* instance : both) {
    for (size_t i = 0; i < veltrane::kMaxCuts; ++i) {
      instance->cutDirectionControls[i].setter(host.handle(), host.record(), kPi / 2.0f, 0);
      EXPECT_EQ(writtenIds(), std::vector<std::string>{"cutDirection_" + std::to_string(i)});
    }
    for (size_t j = 0; j < veltrane::kInputCount; ++j) {
      const std::string n = std::to_string(j);
      host.set("inputFrameRotation" + n, 10.0f * j);
      host.set("inputFrameScale" + n, 5.0f * (j + 1));
      host.setPoint("inputFrameTranslation" + n, 0, 0);
      const auto& rotation = instance->inputRotationControls[j];
      EXPECT_NEAR(rotation.getter(host.handle(), host.record(), 0), 10.0f * j * kPi / 180, 1e-5f);
      const auto& rect = instance->inputQuadControls[j];
      EXPECT_FLOAT_EQ(rect.getter(host.handle(), host.record(), 0, kFrame).z - 960.0f,
                      48.0f * (j + 1))
          << j;
      rotation.setter(host.handle(), host.record(), 0.5f, 0);
      EXPECT_EQ(writtenIds(), std::vector<std::string>{"inputFrameRotation" + n});
      rect.setter(host.handle(), host.record(), {0, 0, 1920, 1080}, {0, 0, 2880, 1080},
                  veltrane::kEdgeBitX1, 0, kFrame);
      EXPECT_EQ(writtenIds(),
                (std::vector<std::string>{"inputFrameScale" + n, "inputFrameTranslation" + n}));
    }
  }
  veltrane::destroyInstance(&other);
  veltrane::destroyInstance(&slot);
  EXPECT_EQ(slot.instanceData, nullptr);
}

}  // namespace
