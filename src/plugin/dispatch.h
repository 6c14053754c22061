// Message dispatch: decodes a host message, runs its handler and turns the plug-in's own
// exceptions into result 5.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

// Message numbers the host sends.
enum Message : int32_t {
  kMessageLoad = 0,
  kMessageUnload = 1,
  kMessageDeclareParameters = 2,
  kMessageCreateInstance = 3,
  kMessageDestroyInstance = 4,
  kMessageParameterChanged = 7,
  kMessagePrepareGl = 8,
  kMessageRender = 10,
  kMessageRequestFrames = 12,
  kMessageParameterReport13 = 13,
  kMessageParameterReport14 = 14,
  kMessageAcknowledged1001 = 1001,
  kMessageAcknowledged1002 = 1002,
  kMessageDrawOverlay = 1003,
  kMessagePointerMove = 1004,
  kMessagePointerPress = 1005,
  kMessagePointerRelease = 1006,
  kMessageKeyDown = 1007,
  kMessageKeyUp = 1008,
  kMessageAcknowledged1009 = 1009,
  kMessageAcknowledged1010 = 1010,
  kMessageAcknowledged1011 = 1011,
  kMessagePointerOverSelection = 1012,
  kMessagePickLayer = 1013,
  kMessageCopyInstance = 1014,
};

// Results beyond a handler's own 0 and 1.
constexpr int32_t kResultNotHandled = 2;
constexpr int32_t kResultException = 5;

int32_t dispatchMessage(WispHost* host, tagWispAPI* api, int32_t message);

}  // namespace veltrane
