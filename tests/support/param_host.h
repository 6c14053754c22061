// An in-memory host for tests: parameter values stored by id, served and written through a
// tagWispAPI record, with an optional log of the host operations the plug-in calls.
#pragma once

#include <array>
#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <vector>

#include "host/wisp_api.h"

namespace testsupport {

// Values do not vary with time. Reading an id that was never set gives 0 (false, the null layer)
// and leaves a point or colour unwritten, as a host may. The tagWispAPI record is the test's to
// extend: fill renderContext, event or further operations as needed; handle() must go with it.
class ParamHost {
 public:
  ParamHost();
  ParamHost(const ParamHost&) = delete;
  ParamHost& operator=(const ParamHost&) = delete;

  void setInt(const std::string& id, int32_t value);
  void setChoice(const std::string& id, int32_t value);
  void setBool(const std::string& id, bool value);
  void setFloat(const std::string& id, float value);
  void setAngle(const std::string& id, float degrees);
  void setPoint(const std::string& id, float x, float y);
  void setColour(const std::string& id, float red, float green, float blue);
  void setLayer(const std::string& id, const std::string& guid);
  void setHostId(int32_t hostId) { hostId_ = hostId; }

  bool has(const std::string& id) const;
  void erase(const std::string& id);
  void clear();

  // Values as last set by the test or written by the plug-in.
  int32_t intValue(const std::string& id) const;  // ints, choices and bools
  float floatValue(const std::string& id) const;  // floats and angles (degrees)
  std::array<float, 2> pointValue(const std::string& id) const;
  std::array<float, 3> colourValue(const std::string& id) const;
  std::string layerValue(const std::string& id) const;
  // Whether the plug-in last marked the parameter usable; true until it says otherwise.
  bool enabled(const std::string& id) const;

  // Logging is off until enabled. Entries read like "GetPointParam(cutPosition_0, 5)",
  // "SetAngleParam(cutDirection_1, 0, 45)", "BeginUndo(Inserting Cut)", "SetCursor(3)".
  void recordCalls(bool on) { recording_ = on; }
  const std::vector<std::string>& calls() const { return calls_; }
  void clearCalls() { calls_.clear(); }

  WispHost* handle() { return reinterpret_cast<WispHost*>(this); }
  tagWispAPI* api() { return &api_; }

 private:
  struct Value {
    int32_t integer = 0;
    std::array<float, 3> numbers{};
    std::string text;
  };

  static ParamHost& from(WispHost* host) { return *reinterpret_cast<ParamHost*>(host); }
  const Value* find(const char* id) const;
  Value& slot(const std::string& id) { return values_[id]; }
  void record(const char* operation, const std::string& arguments);

  // Host operations, each a static function reaching this object through the handle.
  static int32_t getInt(WispHost* host, const char* id, int32_t time);
  static float getFloat(WispHost* host, const char* id, int32_t time);
  static uint8_t getBool(WispHost* host, const char* id, int32_t time);
  static int32_t getChoice(WispHost* host, const char* id, int32_t time);
  static float getAngle(WispHost* host, const char* id, int32_t time);
  static void getPoint(WispHost* host, const char* id, int32_t time, float* x, float* y);
  static void getColour(WispHost* host, const char* id, int32_t time, float* red, float* green,
                        float* blue);
  static void getLayer(WispHost* host, const char* id, int32_t time, char* guidBuffer);
  static void setIntOp(WispHost* host, const char* id, int32_t time, int32_t value, int32_t);
  static void setFloatOp(WispHost* host, const char* id, int32_t time, float value, int32_t);
  static void setPointOp(WispHost* host, const char* id, int32_t time, const float* x,
                         const float* y, int32_t);
  static void setAngleOp(WispHost* host, const char* id, int32_t time, float degrees, int32_t);
  static void setLayerOp(WispHost* host, const char* id, int32_t time, const char* guid, int32_t);
  static void setParamEnabled(WispHost* host, const char* id, const uint8_t* enabled);
  static void beginUndo(WispHost* host, const char* stepName);
  static void endUndo(WispHost* host);
  static void redraw(WispHost* host, int32_t);
  static void setCursor(WispHost* host, int32_t shape);
  static int32_t getHostId(WispHost* host);

  tagWispAPI api_{};
  std::map<std::string, Value, std::less<>> values_;
  std::map<std::string, bool, std::less<>> enabled_;
  int32_t hostId_ = 0;
  bool recording_ = false;
  std::vector<std::string> calls_;
};

}  // namespace testsupport
