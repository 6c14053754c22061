// The declaration operations: they build the panel, refuse duplicates and the injected failure.
#include "refhost/core/host.h"
#include "refhost/platform/text.h"

namespace refhost {
namespace {

std::vector<std::string> splitChoices(const std::string& list) {
  std::vector<std::string> choices;
  std::size_t start = 0;
  while (true) {
    std::size_t bar = list.find('|', start);
    choices.push_back(list.substr(start, bar - start));
    if (bar == std::string::npos) break;
    start = bar + 1;
  }
  return choices;
}

}  // namespace

bool Host::declarationRefused() {
  return instruments_.faults && instruments_.faults->refusesNextDeclaration();
}

int32_t Host::declare(Param param) {
  if (param.id.empty()) {
    problem("declaration without an id");
    return 1;
  }
  // A parameter declared not in use starts disabled until SetParamEnabled says otherwise.
  param.enabled = (param.flags & kParamFlagNotInUse) == 0;
  param.state.value = param.defaultValue;
  std::string id = param.id;
  if (!panel_.add(std::move(param))) {
    problem("parameter '" + id + "' declared twice");
    return 1;
  }
  return 0;
}

int32_t Host::beginParamGroup(const wchar_t* displayName) {
  log([&] { return std::string("BeginParamGroup " + logText(displayName)); });
  if (declarationRefused()) return 1;
  panel_.beginGroup(toUtf8(displayName));
  return 0;
}

int32_t Host::endParamGroup() {
  log([&] { return std::string("EndParamGroup"); });
  if (declarationRefused()) return 1;
  if (!panel_.endGroup()) {
    problem("EndParamGroup without an open group");
    return 1;
  }
  return 0;
}

namespace {

// The fields every declaration call carries.
Param declaredParam(ParamKind kind, const wchar_t* displayName, const char* id, int32_t flags) {
  Param param;
  param.kind = kind;
  param.id = id ? id : "";
  param.displayName = toUtf8(displayName);
  param.flags = flags;
  return param;
}

}  // namespace

int32_t Host::addFloatParam(const wchar_t* displayName, const wchar_t* unit, const char* id,
                            int32_t flags, float minimum, float maximum, float defaultValue,
                            int32_t precision) {
  log([&] {
    return std::string("AddFloatParam " + logText(displayName) + " " + logText(unit) + " " +
                       logId(id) + " " + std::to_string(flags) + " " + formatFloat(minimum) + " " +
                       formatFloat(maximum) + " " + formatFloat(defaultValue) + " " +
                       std::to_string(precision));
  });
  if (declarationRefused()) return 1;
  Param param = declaredParam(ParamKind::Float, displayName, id, flags);
  param.unit = toUtf8(unit);
  param.minimum = minimum;
  param.maximum = maximum;
  param.defaultValue = ParamValue::ofFloat(defaultValue);
  param.precision = precision;
  return declare(std::move(param));
}

int32_t Host::addIntParam(const wchar_t* displayName, const wchar_t* unit, const char* id,
                          int32_t flags, int32_t minimum, int32_t maximum, int32_t defaultValue) {
  log([&] {
    return std::string("AddIntParam " + logText(displayName) + " " + logText(unit) + " " +
                       logId(id) + " " + std::to_string(flags) + " " + std::to_string(minimum) +
                       " " + std::to_string(maximum) + " " + std::to_string(defaultValue));
  });
  if (declarationRefused()) return 1;
  Param param = declaredParam(ParamKind::Int, displayName, id, flags);
  param.unit = toUtf8(unit);
  param.minimum = minimum;
  param.maximum = maximum;
  param.defaultValue = ParamValue::ofInt(defaultValue);
  return declare(std::move(param));
}

int32_t Host::addBoolParam(const wchar_t* displayName, const char* id, int32_t flags,
                           uint8_t defaultValue) {
  log([&] {
    return std::string("AddBoolParam " + logText(displayName) + " " + logId(id) + " " +
                       std::to_string(flags) + " " + std::to_string(defaultValue));
  });
  if (declarationRefused()) return 1;
  Param param = declaredParam(ParamKind::Bool, displayName, id, flags);
  param.minimum = 0;
  param.maximum = 1;
  param.defaultValue = ParamValue::ofInt(defaultValue);
  return declare(std::move(param));
}

int32_t Host::addChoiceParam(const wchar_t* displayName, const char* id, int32_t flags,
                             const wchar_t* choices, const int32_t* defaultIndex,
                             int32_t reserved) {
  log([&] {
    return std::string("AddChoiceParam " + logText(displayName) + " " + logId(id) + " " +
                       std::to_string(flags) + " " + logText(choices) + " " +
                       (defaultIndex ? std::to_string(*defaultIndex) : "null") + " " +
                       std::to_string(reserved));
  });
  if (declarationRefused()) return 1;
  if (!defaultIndex) problem("AddChoiceParam " + logId(id) + ": null default index, 0 used");
  Param param = declaredParam(ParamKind::Choice, displayName, id, flags);
  param.choices = splitChoices(toUtf8(choices));
  param.minimum = 0;
  param.maximum = static_cast<double>(param.choices.size()) - 1;
  param.defaultValue = ParamValue::ofInt(defaultIndex ? *defaultIndex : 0);
  return declare(std::move(param));
}

int32_t Host::addPointParam(const wchar_t* displayName, const char* id, int32_t flags, float x,
                            float y) {
  log([&] {
    return std::string("AddPointParam " + logText(displayName) + " " + logId(id) + " " +
                       std::to_string(flags) + " " + formatFloat(x) + " " + formatFloat(y));
  });
  if (declarationRefused()) return 1;
  Param param = declaredParam(ParamKind::Point, displayName, id, flags);
  param.defaultValue = ParamValue::ofPoint(x, y);
  return declare(std::move(param));
}

int32_t Host::addAngleParam(const wchar_t* displayName, const char* id, int32_t flags,
                            uint8_t extra, float degrees) {
  log([&] {
    return std::string("AddAngleParam " + logText(displayName) + " " + logId(id) + " " +
                       std::to_string(flags) + " " + std::to_string(extra) + " " +
                       formatFloat(degrees));
  });
  if (declarationRefused()) return 1;
  Param param = declaredParam(ParamKind::Angle, displayName, id, flags);
  param.extra = extra;
  param.defaultValue = ParamValue::ofFloat(degrees);
  return declare(std::move(param));
}

int32_t Host::addColorParam(const wchar_t* displayName, const char* id, int32_t flags, float red,
                            float green, float blue) {
  log([&] {
    return std::string("AddColorParam " + logText(displayName) + " " + logId(id) + " " +
                       std::to_string(flags) + " " + formatFloat(red) + " " + formatFloat(green) +
                       " " + formatFloat(blue));
  });
  if (declarationRefused()) return 1;
  Param param = declaredParam(ParamKind::Color, displayName, id, flags);
  param.defaultValue = ParamValue::ofColor(red, green, blue);
  return declare(std::move(param));
}

int32_t Host::addLayerParam(const wchar_t* displayName, const char* id, int32_t flags) {
  log([&] {
    return std::string("AddLayerParam " + logText(displayName) + " " + logId(id) + " " +
                       std::to_string(flags));
  });
  if (declarationRefused()) return 1;
  Param param = declaredParam(ParamKind::Layer, displayName, id, flags);
  param.defaultValue = ParamValue::ofLayer(kNoLayer);
  return declare(std::move(param));
}

void Host::setParamEnabled(const char* id, const uint8_t* enabled) {
  log([&] {
    return std::string("SetParamEnabled " + logId(id) + " " +
                       (enabled ? std::to_string(*enabled) : "null"));
  });
  if (!id || !enabled) {
    problem("SetParamEnabled with a null pointer");
    return;
  }
  Param* param = panel_.find(id);
  if (!param) {
    problem(std::string("SetParamEnabled: unknown parameter id '") + id + "'");
    return;
  }
  param->enabled = *enabled != 0;
}

}  // namespace refhost
