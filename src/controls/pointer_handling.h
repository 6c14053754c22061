// Pointer messages of the viewer: hover, press, drag and release of the on-screen controls.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

// One pass of a pointer move: with `pressedPass` only controls that own a drag answer, without
// it only those that do not. Returns 1 when something took the pointer.
int onPointerMove(WispHost* host, tagWispAPI* api, bool pressedPass);
int onPointerPress(WispHost* host, tagWispAPI* api);
int onPointerRelease(WispHost* host, tagWispAPI* api);

}  // namespace veltrane
