// Parameter values in the form scene files write them, checked against the parameters the
// module declared: numbers within their declared range, choices by index or text, points
// [x, y], colours [r, g, b], angles in degrees, layers by GUID, and animations as keys.
#pragma once

#include <nlohmann/json.hpp>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "refhost/engine.h"
#include "scene/json_fields.h"

namespace veltrane_cli {

struct ParamSetting {
  std::string id;
  bool animated = false;
  refhost::ParamValue value;                                  // when not animated
  std::vector<std::pair<int32_t, refhost::ParamValue>> keys;  // when animated: (frame, value)
};

// Reads the "params" object (a null document sets nothing). `layerGuids` are the GUIDs a layer
// parameter may name besides the null GUID. Throws FieldError for an unknown id, a value of
// the wrong kind or outside the declared range.
std::vector<ParamSetting> readParamSettings(const JsonField& params,
                                            const refhost::ParamPanel& panel,
                                            const std::set<std::string>& layerGuids);

// Stores every setting (a static value, or keyframes replacing any there were), then reports
// each with message 7 in the order given.
void applyParamSettings(refhost::Engine& engine, const std::vector<ParamSetting>& settings);

// One value of the parameter as a scene writes it (a choice by its text).
nlohmann::ordered_json paramValueJson(const refhost::Param& param,
                                      const refhost::ParamValue& value);
// Every declared parameter, in declaration order: its value, or {"keys": ...} when animated.
nlohmann::ordered_json paramValuesJson(const refhost::ParamPanel& panel);

}  // namespace veltrane_cli
