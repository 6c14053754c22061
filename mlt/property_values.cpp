// Reading and checking the effect's parameters from MLT properties.
#include "property_values.h"

#include <algorithm>
#include <cctype>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <optional>
#include <string_view>

namespace veltrane_mlt {

namespace {

using refhost::Param;
using refhost::ParamKind;
using refhost::ParamValue;

bool sameWord(std::string_view a, std::string_view b) {
  return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) {
           return std::tolower(static_cast<unsigned char>(x)) ==
                  std::tolower(static_cast<unsigned char>(y));
         });
}

// The whole text as one finite number, in the C locale whatever the process's locale is.
std::optional<double> numberOf(std::string_view text) {
  text = trimmed(text);
  if (!text.empty() && text.front() == '+') text.remove_prefix(1);
  double value = 0;
  auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
  if (text.empty() || error != std::errc() || end != text.data() + text.size() ||
      !std::isfinite(value))
    return std::nullopt;
  return value;
}

std::string numberText(double value) {
  char buffer[32];
  std::snprintf(buffer, sizeof buffer, "%g", value);
  return buffer;
}

bool isColour(std::string_view text) {
  text = trimmed(text);
  std::string_view digits;
  if (!text.empty() && text.front() == '#') {
    digits = text.substr(1);
    if (digits.size() != 6 && digits.size() != 8) return false;
  } else if (text.size() == 10 && (text.substr(0, 2) == "0x" || text.substr(0, 2) == "0X")) {
    digits = text.substr(2);
  } else {
    return false;
  }
  return std::all_of(digits.begin(), digits.end(),
                     [](char c) { return std::isxdigit(static_cast<unsigned char>(c)); });
}

// A point as MLT writes a rectangle's corner: "x y", optionally followed by a size and an
// opacity that a point does not use.
bool isPoint(std::string_view text) {
  int count = 0;
  text = trimmed(text);
  while (!text.empty()) {
    std::size_t end = text.find_first_of(" \t");
    if (!numberOf(text.substr(0, end))) return false;
    ++count;
    text = end == std::string_view::npos ? std::string_view() : trimmed(text.substr(end));
  }
  return count >= 2 && count <= 5;
}

std::optional<int32_t> choiceOf(const Param& param, std::string_view text) {
  text = trimmed(text);
  for (std::size_t i = 0; i < param.choices.size(); ++i) {
    if (sameWord(text, param.choices[i])) return static_cast<int32_t>(i);
  }
  std::optional<double> index = numberOf(text);
  if (index && *index == std::floor(*index) && *index >= 0 &&
      *index < static_cast<double>(param.choices.size()))
    return static_cast<int32_t>(*index);
  return std::nullopt;
}

std::optional<int32_t> boolOf(std::string_view text) {
  text = trimmed(text);
  if (text == "1" || sameWord(text, "true") || sameWord(text, "yes")) return 1;
  if (text == "0" || sameWord(text, "false") || sameWord(text, "no")) return 0;
  return std::nullopt;
}

// What the module would refuse in one value's text, or nothing when it is fine.
std::optional<std::string> problemWith(const Param& param, std::string_view text) {
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Int: {
      std::optional<double> value = numberOf(text);
      bool whole = param.kind == ParamKind::Int;
      if (value && (!whole || *value == std::floor(*value)) && *value >= param.minimum &&
          *value <= param.maximum)
        return std::nullopt;
      return std::string(whole ? "expected a whole number" : "expected a number") + " from " +
             numberText(param.minimum) + " to " + numberText(param.maximum);
    }
    case ParamKind::Angle:
      if (numberOf(text)) return std::nullopt;
      return std::string("expected an angle in degrees");
    case ParamKind::Point:
      if (isPoint(text)) return std::nullopt;
      return std::string("expected a point \"x y\" in pixels");
    case ParamKind::Color:
      if (isColour(text)) return std::nullopt;
      return std::string("expected a colour #rrggbb, #aarrggbb or 0xrrggbbaa");
    case ParamKind::Bool:
      if (boolOf(text)) return std::nullopt;
      return std::string("expected 0 or 1");
    case ParamKind::Choice: {
      if (choiceOf(param, text)) return std::nullopt;
      std::string names;
      for (const std::string& choice : param.choices) names += (names.empty() ? "" : ", ") + choice;
      return "expected one of " + names + " or an index from 0 to " +
             std::to_string(param.choices.size() - 1);
    }
    case ParamKind::Layer:
      if (parseLayerName(text)) return std::nullopt;
      return std::string("expected own, lower, track:K (a track's index) or track:NAME");
  }
  return std::nullopt;
}

// The value at the position of a property whose every key passed the check.
ParamValue valueAt(mlt_properties properties, const Param& param, int position, int length,
                   const FrameSize& frame, const LayerResolver& layers) {
  const char* id = param.id.c_str();
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Angle: {
      double value = mlt_properties_anim_get_double(properties, id, position, length);
      // Smooth keyframes may overshoot keys that are all in range; the range still holds.
      if (param.kind == ParamKind::Float) value = std::clamp(value, param.minimum, param.maximum);
      return ParamValue::ofFloat(static_cast<float>(value));
    }
    case ParamKind::Int: {
      double value = mlt_properties_anim_get_double(properties, id, position, length);
      value = std::clamp(std::round(value), param.minimum, param.maximum);
      return ParamValue::ofInt(static_cast<int32_t>(value));
    }
    case ParamKind::Point: {
      mlt_rect rect = mlt_properties_anim_get_rect(properties, id, position, length);
      // A rectangle with a size (Kdenlive's, dragged on its monitor) is measured from the
      // frame's top-left corner, y down; the point is its centre. MLT leaves a size it was not
      // given at the smallest positive double.
      constexpr double kNoSize = 1e-9;
      if (rect.w > kNoSize && rect.h > kNoSize)
        return ParamValue::ofPoint(static_cast<float>(rect.x + rect.w / 2 - frame.width / 2.0),
                                   static_cast<float>(frame.height / 2.0 - rect.y - rect.h / 2));
      return ParamValue::ofPoint(static_cast<float>(rect.x), static_cast<float>(rect.y));
    }
    case ParamKind::Color: {
      mlt_color colour = mlt_properties_anim_get_color(properties, id, position, length);
      return ParamValue::ofColor(colour.r / 255.0f, colour.g / 255.0f, colour.b / 255.0f);
    }
    case ParamKind::Bool:
    case ParamKind::Choice:
    case ParamKind::Layer:
      break;
  }
  const char* text = mlt_properties_anim_get(properties, id, position, length);
  std::string_view held = text ? text : "";
  if (param.kind == ParamKind::Bool) return ParamValue::ofInt(boolOf(held).value_or(0));
  if (param.kind == ParamKind::Choice) return ParamValue::ofInt(choiceOf(param, held).value_or(0));
  std::optional<LayerName> layer = parseLayerName(held);
  return ParamValue::ofLayer(trackGuid(layer && layers ? layers(*layer) : -1));
}

}  // namespace

std::string_view trimmed(std::string_view text) {
  while (!text.empty() && std::isspace(static_cast<unsigned char>(text.front())))
    text.remove_prefix(1);
  while (!text.empty() && std::isspace(static_cast<unsigned char>(text.back())))
    text.remove_suffix(1);
  return text;
}

std::vector<std::string_view> keyValues(std::string_view text) {
  std::vector<std::string_view> values;
  if (text.find('=') == std::string_view::npos) return {text};
  while (!text.empty()) {
    std::size_t end = text.find(';');
    std::string_view item = text.substr(0, end);
    if (!trimmed(item).empty()) {
      std::size_t equals = item.find('=');
      values.push_back(equals == std::string_view::npos ? item : item.substr(equals + 1));
    }
    if (end == std::string_view::npos) break;
    text.remove_prefix(end + 1);
  }
  return values;
}

ParamReading readParams(mlt_properties properties, const refhost::ParamPanel& panel, int position,
                        int length, const FrameSize& frame, const LayerResolver& layers) {
  ParamReading reading;
  reading.values.reserve(panel.params().size());
  for (const Param& param : panel.params()) {
    const char* text = mlt_properties_get(properties, param.id.c_str());
    if (!text || trimmed(text).empty()) {
      reading.values.push_back(param.defaultValue);
      continue;
    }
    std::optional<std::string> problem;
    for (std::string_view value : keyValues(text)) {
      if ((problem = problemWith(param, value))) break;
    }
    if (problem) {
      reading.refusals.push_back(Refusal{param.id, text, *problem});
      reading.values.push_back(param.defaultValue);
    } else {
      reading.values.push_back(valueAt(properties, param, position, length, frame, layers));
    }
  }
  return reading;
}

}  // namespace veltrane_mlt
