// The editors' settings, read off the declared panel through the effect's vocabulary.
#include "settings.h"

#include <cmath>
#include <cstdio>

#include "layout_choice.h"
#include "layouts/layouts.h"
#include "track_layers.h"

namespace veltrane_describe {
namespace {

using refhost::Param;
using refhost::ParamKind;
using Kind = Setting::Kind;

std::string colourText(const refhost::ParamValue& value) {
  char buffer[16];
  auto channel = [](float c) {
    return static_cast<int>(std::lround(std::fmin(std::fmax(c, 0), 1) * 255));
  };
  std::snprintf(buffer, sizeof buffer, "#%02x%02x%02x", channel(value.number[0]),
                channel(value.number[1]), channel(value.number[2]));
  return buffer;
}

std::string defaultText(const Param& param) {
  const refhost::ParamValue& value = param.defaultValue;
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Angle:
      return number(value.number[0]);
    case ParamKind::Int:
    case ParamKind::Bool:
      return std::to_string(value.integer);
    case ParamKind::Choice:
      return param.choices.at(static_cast<std::size_t>(value.integer));
    case ParamKind::Point:
      return number(value.number[0]) + " " + number(value.number[1]);
    case ParamKind::Color:
      return colourText(value);
    case ParamKind::Layer:
      return "own";
  }
  return "";
}

std::vector<std::pair<std::string, std::string>> trackChoices(bool transition) {
  std::vector<std::pair<std::string, std::string>> choices{
      {"own", transition ? "This track" : "This clip"}};
  if (transition) choices.emplace_back("lower", "Track below");
  for (int track = 1; track <= veltrane_mlt::kMostTracks; ++track)
    choices.emplace_back("track:V" + std::to_string(track), "V" + std::to_string(track));
  return choices;
}

// An angle in degrees, keyframable, shown from -360 to 360.
void makeAngle(Setting& setting) {
  setting.kind = Kind::Angle;
  setting.minimum = -360;
  setting.maximum = 360;
  setting.decimals = 1;
  setting.unit = "°";
  setting.animated = true;
}

// One of the bridge's own settings, in the Layout group.
Setting layoutSetting(const char* property, const char* name, const std::string& fallback,
                      const std::string& editorDefault, const char* description) {
  Setting setting;
  setting.property = property;
  setting.group = "Layout";
  setting.name = name;
  setting.fallback = fallback;
  setting.editorDefault = editorDefault;
  setting.description = description;
  return setting;
}

std::vector<Setting> layoutSettings() {
  Setting layout = layoutSetting(
      veltrane_mlt::kLayoutProperty, "Layout", "none", veltrane_cli::layouts().front().name,
      "A layout of veltrane split; its cuts replace the cut settings below");
  layout.kind = Kind::List;
  layout.choices.emplace_back("none", "Cuts as set below");
  for (const veltrane_cli::LayoutInfo& info : veltrane_cli::layouts())
    layout.choices.emplace_back(info.name, info.menuName);
  Setting angle =
      layoutSetting(veltrane_mlt::kLayoutAngleProperty, "Turn", "0", "0",
                    "Degrees the layout's cuts are turned by, about the frame's centre");
  makeAngle(angle);
  Setting framing = layoutSetting(
      veltrane_mlt::kFramePicturesProperty, "Frame pictures on their regions", "0", "1",
      "Each picture moved and scaled to fill its region, as veltrane split frames it");
  framing.kind = Kind::Bool;
  return {layout, angle, framing};
}

Setting settingOf(const refhost::ParamPanel& panel, const refhost::EffectVocabulary& roles,
                  const Param& param, bool transition) {
  Setting setting;
  setting.property = param.id;
  setting.name = param.displayName;
  if (auto cut = roles.cutOf(param.id)) {
    setting.group = "Cut " + std::to_string(cut->second + 1);
  } else if (auto input = roles.inputOf(param.id)) {
    setting.group = "Picture " + std::to_string(input->second + 1);
    if (input->first == refhost::InputParam::Layer) setting.name = "Track";
    if (input->first == refhost::InputParam::Shift) {
      setting.name = "Time shift";
      setting.unit = "frames";
    }
  } else {
    std::vector<std::string> groups = panel.groupPath(param);
    if (!groups.empty()) setting.group = groups.back();
  }
  setting.fallback = defaultText(param);
  setting.editorDefault = setting.fallback;
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Int:
      setting.kind = param.kind == ParamKind::Int ? Kind::WholeNumber : Kind::Number;
      setting.minimum = param.minimum;
      setting.maximum = param.maximum;
      setting.decimals = param.kind == ParamKind::Int ? 0 : param.precision;
      if (setting.unit.empty()) setting.unit = param.unit;
      setting.animated = true;
      break;
    case ParamKind::Angle:
      makeAngle(setting);
      break;
    case ParamKind::Point:
      setting.kind = Kind::Point;
      setting.animated = true;
      setting.description = "x and y in pixels from the frame's centre, y up";
      break;
    case ParamKind::Color:
      setting.kind = Kind::Color;
      setting.animated = true;
      break;
    case ParamKind::Bool:
      setting.kind = Kind::Bool;
      break;
    case ParamKind::Choice:
      setting.kind = Kind::List;
      for (const std::string& choice : param.choices) setting.choices.emplace_back(choice, choice);
      break;
    case ParamKind::Layer: {
      setting.kind = Kind::List;
      setting.choices = trackChoices(transition);
      // Dropped between two tracks, the second picture shows the lower one at once; a filter
      // on Shotcut's Output track splits its first two tracks.
      const int32_t input = roles.inputOf(param.id)->second;
      if (transition && input == 1) setting.editorDefault = "lower";
      if (!transition && input < 2) setting.editorDefault = "track:V" + std::to_string(input + 1);
      break;
    }
  }
  return setting;
}

}  // namespace

std::string number(double value) {
  char buffer[32];
  std::snprintf(buffer, sizeof buffer, "%.9g", value);
  return buffer;
}

std::vector<Setting> settingsOf(const refhost::ParamPanel& panel, bool transition) {
  const refhost::EffectVocabulary roles(panel);
  std::vector<Setting> settings = layoutSettings();
  for (const Param& param : panel.params()) {
    // A choice with a single entry offers nothing to pick; editors leave it out.
    if (param.kind == ParamKind::Choice && param.choices.size() < 2) continue;
    settings.push_back(settingOf(panel, roles, param, transition));
  }
  return settings;
}

}  // namespace veltrane_describe
