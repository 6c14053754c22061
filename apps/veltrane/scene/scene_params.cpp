// Checking scene parameter values against the declared panel, and writing them back.
#include "scene/scene_params.h"

#include "refhost/platform/text.h"

namespace veltrane_cli {
namespace {

using refhost::Param;
using refhost::ParamKind;
using refhost::ParamValue;

std::string choiceList(const Param& param) {
  std::string list;
  for (const std::string& choice : param.choices)
    list += (list.empty() ? "\"" : ", \"") + choice + "\"";
  return list;
}

ParamValue readChoice(const JsonField& field, const Param& param) {
  auto count = static_cast<int64_t>(param.choices.size());
  std::string expected =
      "one of " + choiceList(param) + " or an index from 0 to " + std::to_string(count - 1);
  if (field.isString()) {
    for (std::size_t i = 0; i < param.choices.size(); ++i) {
      if (param.choices[i] == field.json().get<std::string>())
        return ParamValue::ofInt(static_cast<int32_t>(i));
    }
    field.fail(expected);
  }
  if (!field.isWholeNumber()) field.fail(expected);
  return ParamValue::ofInt(field.integerIn(0, count - 1));
}

ParamValue readLayer(const JsonField& field, const std::set<std::string>& layerGuids) {
  std::string guids;
  for (const std::string& guid : layerGuids) guids += ", \"" + guid + "\"";
  std::string expected = "a layer GUID of the scene or the null GUID (\"" +
                         std::string(refhost::kNoLayer) + "\"" + guids + ")";
  std::string guid = field.string(expected);
  if (guid != refhost::kNoLayer && !layerGuids.count(guid)) field.fail(expected);
  return ParamValue::ofLayer(guid);
}

ParamValue readValue(const JsonField& field, const Param& param,
                     const std::set<std::string>& layerGuids) {
  switch (param.kind) {
    case ParamKind::Float:
      return ParamValue::ofFloat(static_cast<float>(field.numberIn(param.minimum, param.maximum)));
    case ParamKind::Int:
      return ParamValue::ofInt(field.integerIn(static_cast<int64_t>(param.minimum),
                                               static_cast<int64_t>(param.maximum)));
    case ParamKind::Bool:
      return ParamValue::ofInt(field.boolean() ? 1 : 0);
    case ParamKind::Choice:
      return readChoice(field, param);
    case ParamKind::Angle:
      return ParamValue::ofFloat(static_cast<float>(field.number("an angle in degrees")));
    case ParamKind::Point: {
      field.arraySize(2, 2, "a point [x, y] in pixels");
      return ParamValue::ofPoint(static_cast<float>(field.element(0).number("a number")),
                                 static_cast<float>(field.element(1).number("a number")));
    }
    case ParamKind::Color: {
      field.arraySize(3, 3, "a colour [r, g, b]");
      return ParamValue::ofColor(static_cast<float>(field.element(0).number("a number")),
                                 static_cast<float>(field.element(1).number("a number")),
                                 static_cast<float>(field.element(2).number("a number")));
    }
    case ParamKind::Layer:
      return readLayer(field, layerGuids);
  }
  field.fail("a value");
}

ParamSetting readSetting(const JsonField& field, const Param& param,
                         const std::set<std::string>& layerGuids) {
  ParamSetting setting;
  setting.id = param.id;
  if (!field.json().is_object()) {
    setting.value = readValue(field, param, layerGuids);
    return setting;
  }
  field.requireObject({"keys"});
  JsonField keys = field.member("keys");
  std::size_t count = keys.arraySize(1, 100000, "a non-empty array of [frame, value] keys");
  std::set<int32_t> times;
  setting.animated = true;
  for (std::size_t i = 0; i < count; ++i) {
    JsonField key = keys.element(i);
    key.arraySize(2, 2, "a key [frame, value]");
    int32_t time = key.element(0).integerIn(INT32_MIN, INT32_MAX);
    if (!times.insert(time).second) key.element(0).fail("a frame no earlier key has");
    setting.keys.emplace_back(time, readValue(key.element(1), param, layerGuids));
  }
  return setting;
}

// A float as the shortest decimal that reads back as the same float, so 0.1f shows as 0.1.
double shortest(float value) { return std::stod(refhost::formatFloat(value)); }

}  // namespace

std::vector<ParamSetting> readParamSettings(const JsonField& params,
                                            const refhost::ParamPanel& panel,
                                            const std::set<std::string>& layerGuids) {
  std::vector<ParamSetting> settings;
  if (!params.present() || params.json().is_null()) return settings;
  if (!params.json().is_object()) params.fail("an object of parameter ids and values");
  for (auto it = params.json().begin(); it != params.json().end(); ++it) {
    JsonField field = params.member(it.key());
    const Param* param = panel.find(it.key());
    if (!param) field.fail("the id of a parameter the module declares");
    settings.push_back(readSetting(field, *param, layerGuids));
  }
  return settings;
}

void applyParamSettings(refhost::Engine& engine, const std::vector<ParamSetting>& settings) {
  std::vector<std::pair<std::string, refhost::ParamState>> states;
  for (const ParamSetting& setting : settings) {
    refhost::ParamState state;
    // An animated parameter keeps the static value it had; only its keys are replaced.
    state.value = setting.animated ? engine.param(setting.id).state.value : setting.value;
    for (const auto& [time, value] : setting.keys) state.keyframes[time] = value;
    states.emplace_back(setting.id, state);
  }
  engine.setParams(states);
}

nlohmann::ordered_json paramValueJson(const Param& param, const ParamValue& value) {
  switch (param.kind) {
    case ParamKind::Float:
    case ParamKind::Angle:
      return shortest(value.number[0]);
    case ParamKind::Int:
      return value.integer;
    case ParamKind::Bool:
      return value.integer != 0;
    case ParamKind::Choice:
      if (value.integer >= 0 && static_cast<std::size_t>(value.integer) < param.choices.size())
        return param.choices[static_cast<std::size_t>(value.integer)];
      return value.integer;
    case ParamKind::Point:
      return {shortest(value.number[0]), shortest(value.number[1])};
    case ParamKind::Color:
      return {shortest(value.number[0]), shortest(value.number[1]), shortest(value.number[2])};
    case ParamKind::Layer:
      return std::string(value.layer);
  }
  return nullptr;
}

nlohmann::ordered_json paramValuesJson(const refhost::ParamPanel& panel) {
  nlohmann::ordered_json values = nlohmann::ordered_json::object();
  for (const Param& param : panel.params()) {
    if (param.state.keyframes.empty()) {
      values[param.id] = paramValueJson(param, param.state.value);
      continue;
    }
    nlohmann::ordered_json keys = nlohmann::ordered_json::array();
    for (const auto& [time, value] : param.state.keyframes)
      keys.push_back({time, paramValueJson(param, value)});
    values[param.id] = {{"keys", keys}};
  }
  return values;
}

}  // namespace veltrane_cli
