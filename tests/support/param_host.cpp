// The in-memory test host: stored parameter values behind the host's function table.
#include "support/param_host.h"

#include <cstdio>
#include <cstring>
#include <initializer_list>

namespace testsupport {

namespace {

constexpr const char* kNullLayer = "00000000-0000-0000-0000-000000000000";
constexpr std::size_t kGuidChars = 36;

std::string number(double value) {
  char text[32];
  std::snprintf(text, sizeof text, "%g", value);
  return text;
}

std::string joined(std::initializer_list<std::string> parts) {
  std::string text;
  for (const std::string& part : parts) {
    if (!text.empty()) text += ", ";
    text += part;
  }
  return text;
}

}  // namespace

ParamHost::ParamHost() {
  api_.GetIntParam = &getInt;
  api_.GetFloatParam = &getFloat;
  api_.GetBoolParam = &getBool;
  api_.GetChoiceParam = &getChoice;
  api_.GetAngleParam = &getAngle;
  api_.GetPointParam = &getPoint;
  api_.GetColorParam = &getColour;
  api_.GetLayerParam = &getLayer;
  api_.SetIntParam = &setIntOp;
  api_.SetFloatParam = &setFloatOp;
  api_.SetPointParam = &setPointOp;
  api_.SetAngleParam = &setAngleOp;
  api_.SetLayerParam = &setLayerOp;
  api_.SetParamEnabled = &setParamEnabled;
  api_.BeginUndo = &beginUndo;
  api_.EndUndo = &endUndo;
  api_.Redraw = &redraw;
  api_.SetCursor = &setCursor;
  api_.GetHostId = &getHostId;
}

void ParamHost::setInt(const std::string& id, int32_t value) { slot(id).integer = value; }
void ParamHost::setChoice(const std::string& id, int32_t value) { slot(id).integer = value; }
void ParamHost::setBool(const std::string& id, bool value) { slot(id).integer = value ? 1 : 0; }
void ParamHost::setFloat(const std::string& id, float value) { slot(id).numbers[0] = value; }
void ParamHost::setAngle(const std::string& id, float degrees) { slot(id).numbers[0] = degrees; }
void ParamHost::setPoint(const std::string& id, float x, float y) {
  slot(id).numbers = {x, y, 0.0f};
}
void ParamHost::setColour(const std::string& id, float red, float green, float blue) {
  slot(id).numbers = {red, green, blue};
}
void ParamHost::setLayer(const std::string& id, const std::string& guid) { slot(id).text = guid; }

bool ParamHost::has(const std::string& id) const { return values_.count(id) != 0; }
void ParamHost::erase(const std::string& id) { values_.erase(id); }
void ParamHost::clear() { values_.clear(); }

const ParamHost::Value* ParamHost::find(const char* id) const {
  const auto found = values_.find(id);
  return found == values_.end() ? nullptr : &found->second;
}

int32_t ParamHost::intValue(const std::string& id) const {
  const Value* value = find(id.c_str());
  return value ? value->integer : 0;
}
float ParamHost::floatValue(const std::string& id) const {
  const Value* value = find(id.c_str());
  return value ? value->numbers[0] : 0.0f;
}
std::array<float, 2> ParamHost::pointValue(const std::string& id) const {
  const Value* value = find(id.c_str());
  return value ? std::array<float, 2>{value->numbers[0], value->numbers[1]}
               : std::array<float, 2>{};
}
std::array<float, 3> ParamHost::colourValue(const std::string& id) const {
  const Value* value = find(id.c_str());
  return value ? value->numbers : std::array<float, 3>{};
}
std::string ParamHost::layerValue(const std::string& id) const {
  const Value* value = find(id.c_str());
  return value && !value->text.empty() ? value->text : kNullLayer;
}
bool ParamHost::enabled(const std::string& id) const {
  const auto found = enabled_.find(id);
  return found == enabled_.end() || found->second;
}

void ParamHost::record(const char* operation, const std::string& arguments) {
  calls_.push_back(std::string(operation) + "(" + arguments + ")");
}

int32_t ParamHost::getInt(WispHost* host, const char* id, int32_t time) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("GetIntParam", joined({id, number(time)}));
  const Value* value = self.find(id);
  return value ? value->integer : 0;
}

float ParamHost::getFloat(WispHost* host, const char* id, int32_t time) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("GetFloatParam", joined({id, number(time)}));
  const Value* value = self.find(id);
  return value ? value->numbers[0] : 0.0f;
}

uint8_t ParamHost::getBool(WispHost* host, const char* id, int32_t time) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("GetBoolParam", joined({id, number(time)}));
  const Value* value = self.find(id);
  return value && value->integer != 0 ? 1 : 0;
}

int32_t ParamHost::getChoice(WispHost* host, const char* id, int32_t time) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("GetChoiceParam", joined({id, number(time)}));
  const Value* value = self.find(id);
  return value ? value->integer : 0;
}

float ParamHost::getAngle(WispHost* host, const char* id, int32_t time) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("GetAngleParam", joined({id, number(time)}));
  const Value* value = self.find(id);
  return value ? value->numbers[0] : 0.0f;
}

void ParamHost::getPoint(WispHost* host, const char* id, int32_t time, float* x, float* y) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("GetPointParam", joined({id, number(time)}));
  if (const Value* value = self.find(id)) {
    *x = value->numbers[0];
    *y = value->numbers[1];
  }
}

void ParamHost::getColour(WispHost* host, const char* id, int32_t time, float* red, float* green,
                          float* blue) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("GetColorParam", joined({id, number(time)}));
  if (const Value* value = self.find(id)) {
    *red = value->numbers[0];
    *green = value->numbers[1];
    *blue = value->numbers[2];
  }
}

void ParamHost::getLayer(WispHost* host, const char* id, int32_t time, char* guidBuffer) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("GetLayerParam", joined({id, number(time)}));
  const std::string guid = self.layerValue(id);
  const std::size_t length = guid.size() < kGuidChars ? guid.size() : kGuidChars;
  std::memcpy(guidBuffer, guid.data(), length);
  guidBuffer[length] = '\0';
}

void ParamHost::setIntOp(WispHost* host, const char* id, int32_t time, int32_t value, int32_t) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("SetIntParam", joined({id, number(time), number(value)}));
  self.slot(id).integer = value;
}

void ParamHost::setFloatOp(WispHost* host, const char* id, int32_t time, float value, int32_t) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("SetFloatParam", joined({id, number(time), number(value)}));
  self.slot(id).numbers[0] = value;
}

void ParamHost::setPointOp(WispHost* host, const char* id, int32_t time, const float* x,
                           const float* y, int32_t) {
  ParamHost& self = from(host);
  if (self.recording_)
    self.record("SetPointParam", joined({id, number(time), number(*x), number(*y)}));
  self.slot(id).numbers = {*x, *y, 0.0f};
}

void ParamHost::setAngleOp(WispHost* host, const char* id, int32_t time, float degrees, int32_t) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("SetAngleParam", joined({id, number(time), number(degrees)}));
  self.slot(id).numbers[0] = degrees;
}

void ParamHost::setLayerOp(WispHost* host, const char* id, int32_t time, const char* guid,
                           int32_t) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("SetLayerParam", joined({id, number(time), guid}));
  self.slot(id).text = guid;
}

void ParamHost::setParamEnabled(WispHost* host, const char* id, const uint8_t* enabled) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("SetParamEnabled", joined({id, number(*enabled)}));
  self.enabled_[id] = *enabled != 0;
}

void ParamHost::beginUndo(WispHost* host, const char* stepName) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("BeginUndo", stepName);
}

void ParamHost::endUndo(WispHost* host) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("EndUndo", "");
}

void ParamHost::redraw(WispHost* host, int32_t) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("Redraw", "");
}

void ParamHost::setCursor(WispHost* host, int32_t shape) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("SetCursor", number(shape));
}

int32_t ParamHost::getHostId(WispHost* host) {
  ParamHost& self = from(host);
  if (self.recording_) self.record("GetHostId", "");
  return self.hostId_;
}

}  // namespace testsupport
