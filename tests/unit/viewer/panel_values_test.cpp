// The parameter panel's value conversions: widgets, ranges and formats per declared kind, and
// keyframe toggles and edits of static and animated parameters.
#include "viewer/panel_values.h"

#include <gtest/gtest.h>

#include <cfloat>
#include <cmath>

namespace veltrane_viewer {
namespace {

using refhost::Param;
using refhost::ParamKind;
using refhost::ParamValue;

Param declared(ParamKind kind, double minimum = 0, double maximum = 0, const char* unit = "") {
  Param param;
  param.kind = kind;
  param.minimum = minimum;
  param.maximum = maximum;
  param.unit = unit;
  param.precision = 1;
  return param;
}

TEST(PanelValues, WidgetsFormatsAndRangesFollowTheDeclaration) {
  struct Case {
    Param param;
    Widget widget;
    const char* format;
    double low, high;
  } cases[] = {{declared(ParamKind::Float, 0, 200, "px"), Widget::Slider, "%.1f px", 0, 200},
               {declared(ParamKind::Float, 1, 1000, "%"), Widget::Slider, "%.1f %%", 1, 1000},
               {declared(ParamKind::Int, -100000, 10000), Widget::Drag, "%d", -100000, 10000},
               {declared(ParamKind::Int, 1, 8), Widget::Slider, "%d", 1, 8},
               {declared(ParamKind::Angle), Widget::Angle, "%.1f\xC2\xB0", -FLT_MAX, FLT_MAX},
               {declared(ParamKind::Point), Widget::Point, "%.1f", -FLT_MAX, FLT_MAX}};
  for (const Case& c : cases) {
    NumberWidget number = numberWidget(c.param);
    EXPECT_EQ(widgetFor(c.param), c.widget) << c.format;
    EXPECT_EQ(number.format, c.format);
    EXPECT_EQ(number.minimum, c.low) << c.format;
    EXPECT_EQ(number.maximum, c.high) << c.format;
    EXPECT_GT(number.dragSpeed, 0) << c.format;
  }
  Param scale = declared(ParamKind::Float, 1, 1000);
  EXPECT_EQ(clampToRange(scale, 0.5), 1);
  EXPECT_EQ(clampToRange(scale, 1e9), 1000);
  EXPECT_EQ(clampToRange(scale, std::nan("")), 1);
  EXPECT_EQ(clampToRange(declared(ParamKind::Angle), 1e9), 1e9);
}

TEST(PanelValues, KeyframeToggleAndEditsKeepOrDropAnimation) {
  Param width = declared(ParamKind::Float, 0, 200);
  width.state.value = ParamValue::ofFloat(2);
  Param animated = width;
  animated.state.keyframes = {{0, ParamValue::ofFloat(0)}, {10, ParamValue::ofFloat(100)}};
  Param oneKey = width;
  oneKey.state.keyframes = {{4, ParamValue::ofFloat(7)}};

  struct Case {
    const char* name;
    const Param& param;
    int32_t time;
    KeyState before;
    std::map<int32_t, float> keys;  // after the toggle
    float staticValue;              // after the toggle, when no key is left
  } cases[] = {
      {"static gets its first key", width, 3, KeyState::Static, {{3, 2}}, 2},
      {"adds the shown value", animated, 5, KeyState::Animated, {{0, 0}, {5, 50}, {10, 100}}, 2},
      {"a key is removed", animated, 10, KeyState::KeyHere, {{0, 0}}, 2},
      {"the last key leaves its value static", oneKey, 4, KeyState::KeyHere, {}, 7}};
  for (const Case& c : cases) {
    EXPECT_EQ(keyState(c.param, c.time), c.before) << c.name;
    refhost::ParamState after = stateAfterKeyToggle(c.param, c.time);
    std::map<int32_t, float> keys;
    for (const auto& [time, value] : after.keyframes) keys[time] = value.number[0];
    EXPECT_EQ(keys, c.keys) << c.name;
    EXPECT_EQ(after.value.number[0], c.staticValue) << c.name;
  }
  refhost::ParamState edited = stateAfterEdit(animated, 5, ParamValue::ofFloat(9));
  EXPECT_EQ(edited.keyframes.size(), 3u);
  EXPECT_EQ(edited.keyframes.at(5).number[0], 9);
  EXPECT_EQ(stateAfterEdit(width, 5, ParamValue::ofFloat(9)).value.number[0], 9);
}

}  // namespace
}  // namespace veltrane_viewer
