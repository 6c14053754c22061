// The parameter panel's value conversions: widgets and ranges per declared kind, layer
// options, keyframe toggles and the names of the undo steps edits make.
#include "panel_values.h"

#include <gtest/gtest.h>

#include <cmath>

namespace veltrane_viewer {
namespace {

using refhost::Param;
using refhost::ParamKind;
using refhost::ParamValue;

Param declared(ParamKind kind, double minimum = 0, double maximum = 0, const char* unit = "",
               int32_t precision = 0) {
  Param param;
  param.kind = kind;
  param.id = "p";
  param.displayName = "Width";
  param.minimum = minimum;
  param.maximum = maximum;
  param.unit = unit;
  param.precision = precision;
  return param;
}

TEST(PanelValues, WidgetsFormatsAndRangesFollowTheDeclaration) {
  struct Case {
    Param param;
    Widget widget;
    const char* format;
    double low, high;
  } cases[] = {
      {declared(ParamKind::Float, 0, 200, "px", 1), Widget::Slider, "%.1f px", 0, 200},
      {declared(ParamKind::Float, 1, 1000, "%", 1), Widget::Slider, "%.1f %%", 1, 1000},
      {declared(ParamKind::Int, -100000, 10000), Widget::Drag, "%d", -100000, 10000},
      {declared(ParamKind::Int, 1, 8), Widget::Slider, "%d", 1, 8},
      {declared(ParamKind::Angle), Widget::Angle, "%.1f\xC2\xB0", -3.4028234663852886e38,
       3.4028234663852886e38},
      {declared(ParamKind::Point), Widget::Point, "%.1f", -3.4028234663852886e38,
       3.4028234663852886e38},
  };
  for (const Case& c : cases) {
    NumberWidget number = numberWidget(c.param);
    EXPECT_EQ(widgetFor(c.param), c.widget) << c.format;
    EXPECT_EQ(number.format, c.format);
    EXPECT_EQ(number.minimum, c.low) << c.format;
    EXPECT_EQ(number.maximum, c.high) << c.format;
    EXPECT_GT(number.dragSpeed, 0) << c.format;
  }
  EXPECT_EQ(widgetFor(declared(ParamKind::Layer)), Widget::Layer);
  EXPECT_EQ(widgetFor(declared(ParamKind::Color)), Widget::Colour);

  Param scale = declared(ParamKind::Float, 1, 1000);
  EXPECT_EQ(clampToRange(scale, 0.5), 1);
  EXPECT_EQ(clampToRange(scale, 1e9), 1000);
  EXPECT_EQ(clampToRange(scale, std::nan("")), 1);
  EXPECT_EQ(clampToRange(declared(ParamKind::Angle), 1e9), 1e9);

  Param choice = declared(ParamKind::Choice);
  choice.choices = {"Local", "Radial"};
  EXPECT_EQ(validChoice(choice, 1), 1);
  EXPECT_EQ(validChoice(choice, 2), 0);
  EXPECT_EQ(validChoice(choice, -1), 0);
}

TEST(PanelValues, LayerOptionsListNoLayerTheOwnLayerAndTheOthersInHostOrder) {
  refhost::Composition composition;
  composition.ownLayerName = "Split Screen";
  refhost::CompositionLayer bars;
  bars.layer.guid = "d3e00000-0000-4000-8000-000000000001";
  bars.layer.name = "Bars";
  composition.layers = {bars};
  std::vector<LayerOption> options = layerOptions(composition);
  ASSERT_EQ(options.size(), 3u);
  EXPECT_EQ(options[0].guid, refhost::kNoLayer);
  EXPECT_EQ(options[1].label, "Split Screen");
  EXPECT_EQ(options[2].label, "Bars");
  EXPECT_EQ(layerOptionIndex(options, bars.layer.guid), 2);
  EXPECT_EQ(layerOptionIndex(options, "ffffffff-0000-4000-8000-000000000001"), -1);
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
      {"between keys gets the shown value",
       animated,
       5,
       KeyState::Animated,
       {{0, 0}, {5, 50}, {10, 100}},
       2},
      {"a key is removed", animated, 10, KeyState::KeyHere, {{0, 0}}, 2},
      {"the last key leaves its value static", oneKey, 4, KeyState::KeyHere, {}, 7},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(keyState(c.param, c.time), c.before) << c.name;
    refhost::ParamState after = stateAfterKeyToggle(c.param, c.time);
    std::map<int32_t, float> keys;
    for (const auto& [time, value] : after.keyframes) keys[time] = value.number[0];
    EXPECT_EQ(keys, c.keys) << c.name;
    if (c.keys.empty()) {
      EXPECT_EQ(after.value.number[0], c.staticValue) << c.name;
    }
  }

  refhost::ParamState edited = stateAfterEdit(animated, 5, ParamValue::ofFloat(9));
  EXPECT_EQ(edited.keyframes.size(), 3u);
  EXPECT_EQ(edited.keyframes.at(5).number[0], 9);
  EXPECT_EQ(stateAfterEdit(width, 5, ParamValue::ofFloat(9)).value.number[0], 9);
}

TEST(PanelValues, StepNamesSayWhatChangedAndWhere) {
  refhost::ParamPanel panel;
  panel.beginGroup("Border");
  panel.add(declared(ParamKind::Float, 0, 200));
  panel.endGroup();
  Param top = declared(ParamKind::Bool);
  top.id = "q";
  top.displayName = "Preset";
  panel.add(top);
  const Param& width = *panel.find("p");
  EXPECT_EQ(editStepName(panel, width), "Edit Width (Border)");
  EXPECT_EQ(editStepName(panel, *panel.find("q")), "Edit Preset");
  EXPECT_EQ(keyToggleStepName(panel, width, 12), "Add Key to Width (Border) at Frame 12");
  Param keyed = width;
  keyed.state.keyframes[12] = ParamValue::ofFloat(1);
  EXPECT_EQ(keyToggleStepName(panel, keyed, 12), "Remove Key from Width (Border) at Frame 12");
}

}  // namespace
}  // namespace veltrane_viewer
