// Parameter reads and writes from the plug-in. Unknown ids and kind mismatches read as zero
// values and write nothing; both are noted as problems.
#include <algorithm>
#include <cstring>

#include "refhost/core/host.h"
#include "refhost/platform/text.h"

namespace refhost {

ParamValue Host::read(const char* operation, const char* id, int32_t time, ParamKind kind) {
  log([&] {
    return std::string(std::string(operation) + " " + logId(id) + " " + std::to_string(time));
  });
  const Param* param = id ? panel_.find(id) : nullptr;
  if (!param) {
    problem(std::string(operation) + ": unknown parameter id '" + logId(id) + "'");
    return ParamValue{};
  }
  if (param->kind != kind) {
    problem(std::string(operation) + " " + id + ": the parameter is of kind " +
            kindName(param->kind));
    return ParamValue{};
  }
  if (readRecord_) readRecord_->push_back(param);
  ParamValue value = param->valueAt(time);
  if (pixelScale_ != 1 &&
      (kind == ParamKind::Point || (kind == ParamKind::Float && param->unit == "px"))) {
    value.number[0] = static_cast<float>(value.number[0] * pixelScale_);
    value.number[1] = static_cast<float>(value.number[1] * pixelScale_);
  }
  return value;
}

int32_t Host::getIntParam(const char* id, int32_t time) {
  return read("GetIntParam", id, time, ParamKind::Int).integer;
}

float Host::getFloatParam(const char* id, int32_t time) {
  return read("GetFloatParam", id, time, ParamKind::Float).number[0];
}

uint8_t Host::getBoolParam(const char* id, int32_t time) {
  return static_cast<uint8_t>(read("GetBoolParam", id, time, ParamKind::Bool).integer);
}

int32_t Host::getChoiceParam(const char* id, int32_t time) {
  return read("GetChoiceParam", id, time, ParamKind::Choice).integer;
}

float Host::getAngleParam(const char* id, int32_t time) {
  return read("GetAngleParam", id, time, ParamKind::Angle).number[0];
}

void Host::getPointParam(const char* id, int32_t time, float* x, float* y) {
  ParamValue value = read("GetPointParam", id, time, ParamKind::Point);
  if (!x || !y) problem("GetPointParam " + logId(id) + ": null output pointer");
  if (x) *x = value.number[0];
  if (y) *y = value.number[1];
}

void Host::getColorParam(const char* id, int32_t time, float* red, float* green, float* blue) {
  ParamValue value = read("GetColorParam", id, time, ParamKind::Color);
  if (!red || !green || !blue) problem("GetColorParam " + logId(id) + ": null output pointer");
  if (red) *red = value.number[0];
  if (green) *green = value.number[1];
  if (blue) *blue = value.number[2];
}

void Host::getLayerParam(const char* id, int32_t time, char* guidBuffer) {
  ParamValue value = read("GetLayerParam", id, time, ParamKind::Layer);
  if (!guidBuffer) {
    problem("GetLayerParam " + logId(id) + ": null buffer");
    return;
  }
  // The buffer promises room for a GUID text and its terminator, nothing more.
  std::size_t length = std::min<std::size_t>(value.layer.size(), 36);
  std::memcpy(guidBuffer, value.layer.data(), length);
  guidBuffer[length] = '\0';
}

void Host::write(const char* operation, const char* id, int32_t time, const ParamValue& value,
                 std::initializer_list<ParamKind> kinds) {
  Param* param = id ? panel_.find(id) : nullptr;
  if (!param) {
    problem(std::string(operation) + ": unknown parameter id '" + logId(id) + "'");
    return;
  }
  if (std::find(kinds.begin(), kinds.end(), param->kind) == kinds.end()) {
    problem(std::string(operation) + " " + id + ": the parameter is of kind " +
            kindName(param->kind) + "; nothing stored");
    return;
  }
  if (undo_.isOpen())
    undo_.noteBefore(*param);
  else
    immediateEdits_.push_back(ImmediateEdit{id, time, formatValue(param->kind, value)});
  param->edit(time, value);
}

void Host::checkReserved(const char* operation, int32_t reserved) {
  if (reserved != 0) problem(std::string(operation) + ": the last argument must be 0");
}

void Host::setIntParam(const char* id, int32_t time, int32_t value, int32_t reserved) {
  log([&] {
    return std::string("SetIntParam " + logId(id) + " " + std::to_string(time) + " " +
                       std::to_string(value) + " " + std::to_string(reserved));
  });
  checkReserved("SetIntParam", reserved);
  // The interface has no setter of its own for choices and booleans; they are integers here.
  write("SetIntParam", id, time, ParamValue::ofInt(value),
        {ParamKind::Int, ParamKind::Choice, ParamKind::Bool});
}

void Host::setFloatParam(const char* id, int32_t time, float value, int32_t reserved) {
  log([&] {
    return std::string("SetFloatParam " + logId(id) + " " + std::to_string(time) + " " +
                       formatFloat(value) + " " + std::to_string(reserved));
  });
  checkReserved("SetFloatParam", reserved);
  write("SetFloatParam", id, time, ParamValue::ofFloat(value), {ParamKind::Float});
}

void Host::setPointParam(const char* id, int32_t time, const float* x, const float* y,
                         int32_t reserved) {
  log([&] {
    return std::string("SetPointParam " + logId(id) + " " + std::to_string(time) + " " +
                       (x ? formatFloat(*x) : "null") + " " + (y ? formatFloat(*y) : "null") + " " +
                       std::to_string(reserved));
  });
  checkReserved("SetPointParam", reserved);
  if (!x || !y) {
    problem("SetPointParam " + logId(id) + ": null coordinate pointer; nothing stored");
    return;
  }
  write("SetPointParam", id, time, ParamValue::ofPoint(*x, *y), {ParamKind::Point});
}

void Host::setAngleParam(const char* id, int32_t time, float degrees, int32_t reserved) {
  log([&] {
    return std::string("SetAngleParam " + logId(id) + " " + std::to_string(time) + " " +
                       formatFloat(degrees) + " " + std::to_string(reserved));
  });
  checkReserved("SetAngleParam", reserved);
  write("SetAngleParam", id, time, ParamValue::ofFloat(degrees), {ParamKind::Angle});
}

void Host::setLayerParam(const char* id, int32_t time, const char* guid, int32_t reserved) {
  // A GUID text is 36 characters; the plug-in's buffer need not hold a terminator after them.
  std::string text = guid ? std::string(guid, strnlen(guid, 36)) : std::string();
  log([&] {
    return std::string("SetLayerParam " + logId(id) + " " + std::to_string(time) + " " +
                       (!guid          ? "null"
                        : text.empty() ? "\"\""
                                       : text) +
                       " " + std::to_string(reserved));
  });
  checkReserved("SetLayerParam", reserved);
  if (!guid) {
    problem("SetLayerParam " + logId(id) + ": null GUID; nothing stored");
    return;
  }
  write("SetLayerParam", id, time, ParamValue::ofLayer(text), {ParamKind::Layer});
}

}  // namespace refhost
