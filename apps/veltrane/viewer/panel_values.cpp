// Widget choice, ranges, formats, layer options, keyframe toggles and edit step names.
#include "viewer/panel_values.h"

#include <algorithm>
#include <cfloat>
#include <cmath>

namespace veltrane_viewer {

using refhost::Param;
using refhost::ParamKind;
using refhost::ParamState;
using refhost::ParamValue;

namespace {

bool hasRange(const Param& param) {
  return param.kind == ParamKind::Float || param.kind == ParamKind::Int;
}

// A unit as a printf format shows it: "%" must be doubled.
std::string formatUnit(const std::string& unit) {
  if (unit.empty()) return "";
  std::string escaped = " ";
  for (char c : unit) escaped += c == '%' ? std::string("%%") : std::string(1, c);
  return escaped;
}

}  // namespace

Widget widgetFor(const Param& param) {
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Int:
      return param.maximum - param.minimum <= kLongestSliderRange ? Widget::Slider : Widget::Drag;
    case ParamKind::Bool:
      return Widget::Checkbox;
    case ParamKind::Choice:
      return Widget::Choice;
    case ParamKind::Point:
      return Widget::Point;
    case ParamKind::Angle:
      return Widget::Angle;
    case ParamKind::Color:
      return Widget::Colour;
    case ParamKind::Layer:
      return Widget::Layer;
  }
  return Widget::Drag;
}

NumberWidget numberWidget(const Param& param) {
  NumberWidget number;
  number.widget = widgetFor(param);
  number.minimum = hasRange(param) ? param.minimum : -FLT_MAX;
  number.maximum = hasRange(param) ? param.maximum : FLT_MAX;
  switch (param.kind) {
    case ParamKind::Int:
      number.format = "%d" + formatUnit(param.unit);
      break;
    case ParamKind::Angle:
      number.format = "%.1f\xC2\xB0";  // degrees
      number.dragSpeed = 0.5;
      break;
    case ParamKind::Point:
      number.format = "%.1f";
      break;
    default:
      number.format =
          "%." + std::to_string(std::clamp(param.precision, 0, 6)) + "f" + formatUnit(param.unit);
      // A drag across a few hundred pixels covers a short range; a long one moves by units.
      number.dragSpeed = std::min(1.0, (param.maximum - param.minimum) / 500);
      break;
  }
  return number;
}

double clampToRange(const Param& param, double value) {
  if (!hasRange(param)) return value;
  if (std::isnan(value)) return param.minimum;
  return std::clamp(value, param.minimum, param.maximum);
}

int32_t validChoice(const Param& param, int32_t index) {
  return index >= 0 && static_cast<std::size_t>(index) < param.choices.size() ? index : 0;
}

std::vector<LayerOption> layerOptions(const refhost::Composition& composition) {
  std::vector<LayerOption> options{{refhost::kNoLayer, "(own input)"},
                                   {composition.ownLayerGuid, composition.ownLayerName}};
  for (const refhost::CompositionLayer& layer : composition.layers)
    options.push_back({layer.layer.guid, layer.layer.name});
  return options;
}

int layerOptionIndex(const std::vector<LayerOption>& options, const std::string& guid) {
  for (std::size_t i = 0; i < options.size(); ++i) {
    if (options[i].guid == guid) return static_cast<int>(i);
  }
  return -1;
}

KeyState keyState(const Param& param, int32_t time) {
  if (param.state.keyframes.empty()) return KeyState::Static;
  return param.state.keyframes.count(time) ? KeyState::KeyHere : KeyState::Animated;
}

ParamState stateAfterEdit(const Param& param, int32_t time, const ParamValue& value) {
  Param edited = param;
  edited.edit(time, value);
  return edited.state;
}

ParamState stateAfterKeyToggle(const Param& param, int32_t time) {
  ParamState state = param.state;
  ParamValue shown = param.valueAt(time);
  auto key = state.keyframes.find(time);
  if (key == state.keyframes.end()) {
    state.keyframes[time] = shown;
    return state;
  }
  state.keyframes.erase(key);
  if (state.keyframes.empty()) state.value = shown;
  return state;
}

std::string paramLabel(const refhost::ParamPanel& panel, const Param& param) {
  std::vector<std::string> groups = panel.groupPath(param);
  return groups.empty() ? param.displayName : param.displayName + " (" + groups.back() + ")";
}

std::string editStepName(const refhost::ParamPanel& panel, const Param& param) {
  return "Edit " + paramLabel(panel, param);
}

std::string keyToggleStepName(const refhost::ParamPanel& panel, const Param& param, int32_t time) {
  bool removing = keyState(param, time) == KeyState::KeyHere;
  return (removing ? "Remove Key from " : "Add Key to ") + paramLabel(panel, param) + " at Frame " +
         std::to_string(time);
}

}  // namespace veltrane_viewer
