// The host operations as C function pointers: each finds its Host through the WispHost handle
// and forwards to the method of the same name, nothing more.
#include "refhost/core/host.h"
#include "refhost/core/operations.h"

namespace refhost {

struct Operations {
  static Host& of(WispHost* handle) { return *reinterpret_cast<Host::Handle*>(handle)->host; }

  static const wchar_t* getHostIdentifier(WispHost* h) { return of(h).getHostIdentifier(); }
  static int32_t getHostId(WispHost* h) { return of(h).getHostId(); }
  static int32_t beginParamGroup(WispHost* h, const wchar_t* name) {
    return of(h).beginParamGroup(name);
  }
  static int32_t endParamGroup(WispHost* h) { return of(h).endParamGroup(); }
  static int32_t addFloatParam(WispHost* h, const wchar_t* name, const wchar_t* unit,
                               const char* id, int32_t flags, float minimum, float maximum,
                               float defaultValue, int32_t precision) {
    return of(h).addFloatParam(name, unit, id, flags, minimum, maximum, defaultValue, precision);
  }
  static int32_t addIntParam(WispHost* h, const wchar_t* name, const wchar_t* unit, const char* id,
                             int32_t flags, int32_t minimum, int32_t maximum,
                             int32_t defaultValue) {
    return of(h).addIntParam(name, unit, id, flags, minimum, maximum, defaultValue);
  }
  static int32_t addBoolParam(WispHost* h, const wchar_t* name, const char* id, int32_t flags,
                              uint8_t defaultValue) {
    return of(h).addBoolParam(name, id, flags, defaultValue);
  }
  static int32_t addChoiceParam(WispHost* h, const wchar_t* name, const char* id, int32_t flags,
                                const wchar_t* choices, const int32_t* defaultIndex,
                                int32_t reserved) {
    return of(h).addChoiceParam(name, id, flags, choices, defaultIndex, reserved);
  }
  static int32_t addPointParam(WispHost* h, const wchar_t* name, const char* id, int32_t flags,
                               float x, float y) {
    return of(h).addPointParam(name, id, flags, x, y);
  }
  static int32_t addAngleParam(WispHost* h, const wchar_t* name, const char* id, int32_t flags,
                               uint8_t extra, float degrees) {
    return of(h).addAngleParam(name, id, flags, extra, degrees);
  }
  static int32_t addColorParam(WispHost* h, const wchar_t* name, const char* id, int32_t flags,
                               float red, float green, float blue) {
    return of(h).addColorParam(name, id, flags, red, green, blue);
  }
  static int32_t addLayerParam(WispHost* h, const wchar_t* name, const char* id, int32_t flags) {
    return of(h).addLayerParam(name, id, flags);
  }
  static void setParamEnabled(WispHost* h, const char* id, const uint8_t* enabled) {
    of(h).setParamEnabled(id, enabled);
  }

  static int32_t getIntParam(WispHost* h, const char* id, int32_t time) {
    return of(h).getIntParam(id, time);
  }
  static float getFloatParam(WispHost* h, const char* id, int32_t time) {
    return of(h).getFloatParam(id, time);
  }
  static uint8_t getBoolParam(WispHost* h, const char* id, int32_t time) {
    return of(h).getBoolParam(id, time);
  }
  static int32_t getChoiceParam(WispHost* h, const char* id, int32_t time) {
    return of(h).getChoiceParam(id, time);
  }
  static float getAngleParam(WispHost* h, const char* id, int32_t time) {
    return of(h).getAngleParam(id, time);
  }
  static void getPointParam(WispHost* h, const char* id, int32_t time, float* x, float* y) {
    of(h).getPointParam(id, time, x, y);
  }
  static void getColorParam(WispHost* h, const char* id, int32_t time, float* red, float* green,
                            float* blue) {
    of(h).getColorParam(id, time, red, green, blue);
  }
  static void getLayerParam(WispHost* h, const char* id, int32_t time, char* guidBuffer) {
    of(h).getLayerParam(id, time, guidBuffer);
  }

  static void setIntParam(WispHost* h, const char* id, int32_t time, int32_t value,
                          int32_t reserved) {
    of(h).setIntParam(id, time, value, reserved);
  }
  static void setFloatParam(WispHost* h, const char* id, int32_t time, float value,
                            int32_t reserved) {
    of(h).setFloatParam(id, time, value, reserved);
  }
  static void setPointParam(WispHost* h, const char* id, int32_t time, const float* x,
                            const float* y, int32_t reserved) {
    of(h).setPointParam(id, time, x, y, reserved);
  }
  static void setAngleParam(WispHost* h, const char* id, int32_t time, float degrees,
                            int32_t reserved) {
    of(h).setAngleParam(id, time, degrees, reserved);
  }
  static void setLayerParam(WispHost* h, const char* id, int32_t time, const char* guid,
                            int32_t reserved) {
    of(h).setLayerParam(id, time, guid, reserved);
  }

  static void beginUndo(WispHost* h, const char* name) { of(h).beginUndo(name); }
  static void endUndo(WispHost* h) { of(h).endUndo(); }
  static void redraw(WispHost* h, int32_t reserved) { of(h).redraw(reserved); }
  static void setCursor(WispHost* h, int32_t shape) { of(h).setCursor(shape); }
  static int32_t showPopupMenu(WispHost* h, const char* items) {
    return of(h).showPopupMenu(items);
  }
  static int32_t getLayerCount(WispHost* h) { return of(h).getLayerCount(); }
  static void getLayerInfo(WispHost* h, int32_t index, char* guid, char* name, int32_t nameSize,
                           int32_t* kind) {
    of(h).getLayerInfo(index, guid, name, nameSize, kind);
  }
  static void requestFrames(WispHost* h, int32_t count, const uint32_t* frames) {
    of(h).requestFrames(nullptr, count, frames, true);
  }
  static void requestLayerFrames(WispHost* h, const char* guid, int32_t count,
                                 const uint32_t* frames) {
    of(h).requestFrames(guid, count, frames, false);
  }

  static uint32_t allocateTexture(WispHost* h, void*, int32_t width, int32_t height,
                                  uint32_t internalFormat, uint32_t pixelFormat, uint32_t pixelType,
                                  const void* data, int32_t* allocatedWidth,
                                  int32_t* allocatedHeight) {
    return of(h).allocateTexture(width, height, internalFormat, pixelFormat, pixelType, data,
                                 allocatedWidth, allocatedHeight);
  }
  static void releaseTexture(WispHost* h, void*, uint32_t id) { of(h).releaseTexture(id); }
  static int32_t getSourceFrame(WispHost* h, void* context, int32_t frameIndex,
                                TextureRecord* out) {
    return of(h).getSourceFrame(context, frameIndex, out);
  }
  static int32_t renderLayerFrame(WispHost* h, void* context, const char* guid, int32_t frame,
                                  TextureRecord* out) {
    return of(h).renderLayerFrame(context, guid, frame, out);
  }
  static int32_t queryLayerState(WispHost* h, const char* guid, int32_t timeMs, LayerState* out) {
    return of(h).queryLayerState(guid, timeMs, out);
  }
  static int32_t getTimeInfo(WispHost* h, WispTimeInfo* out) { return of(h).getTimeInfo(out); }
  static uint32_t createVertexArray(WispHost* h) { return of(h).createVertexArray(); }
  static uint32_t acquireBuffer(WispHost* h, uint32_t target, int64_t size, const void* data,
                                uint32_t usage, uint32_t* hostOutput) {
    return of(h).acquireBuffer(target, size, data, usage, hostOutput);
  }
  static void releaseBuffer(WispHost* h, uint32_t id) { of(h).releaseBuffer(id); }
};

void installOperations(tagWispAPI& api) {
  api.GetHostIdentifier = &Operations::getHostIdentifier;
  api.GetHostId = &Operations::getHostId;
  api.BeginParamGroup = &Operations::beginParamGroup;
  api.EndParamGroup = &Operations::endParamGroup;
  api.AddFloatParam = &Operations::addFloatParam;
  api.AddIntParam = &Operations::addIntParam;
  api.AddBoolParam = &Operations::addBoolParam;
  api.AddChoiceParam = &Operations::addChoiceParam;
  api.AddPointParam = &Operations::addPointParam;
  api.AddAngleParam = &Operations::addAngleParam;
  api.AddColorParam = &Operations::addColorParam;
  api.AddLayerParam = &Operations::addLayerParam;
  api.SetParamEnabled = &Operations::setParamEnabled;
  api.GetIntParam = &Operations::getIntParam;
  api.GetFloatParam = &Operations::getFloatParam;
  api.GetBoolParam = &Operations::getBoolParam;
  api.GetChoiceParam = &Operations::getChoiceParam;
  api.GetAngleParam = &Operations::getAngleParam;
  api.GetPointParam = &Operations::getPointParam;
  api.GetColorParam = &Operations::getColorParam;
  api.GetLayerParam = &Operations::getLayerParam;
  api.SetIntParam = &Operations::setIntParam;
  api.SetFloatParam = &Operations::setFloatParam;
  api.SetPointParam = &Operations::setPointParam;
  api.SetAngleParam = &Operations::setAngleParam;
  api.SetLayerParam = &Operations::setLayerParam;
  api.BeginUndo = &Operations::beginUndo;
  api.EndUndo = &Operations::endUndo;
  api.Redraw = &Operations::redraw;
  api.SetCursor = &Operations::setCursor;
  api.ShowPopupMenu = &Operations::showPopupMenu;
  api.GetLayerCount = &Operations::getLayerCount;
  api.GetLayerInfo = &Operations::getLayerInfo;
  api.RequestFrames = &Operations::requestFrames;
  api.RequestLayerFrames = &Operations::requestLayerFrames;
  api.AllocateTexture = &Operations::allocateTexture;
  api.ReleaseTexture = &Operations::releaseTexture;
  api.GetSourceFrame = &Operations::getSourceFrame;
  api.RenderLayerFrame = &Operations::renderLayerFrame;
  api.QueryLayerState = &Operations::queryLayerState;
  api.GetTimeInfo = &Operations::getTimeInfo;
  api.CreateVertexArray = &Operations::createVertexArray;
  api.AcquireBuffer = &Operations::acquireBuffer;
  api.ReleaseBuffer = &Operations::releaseBuffer;
}

}  // namespace refhost
