// What the page makes of the facts the browser's decoders give about a clip (see
// browser_media.cpp, which answers the host's media files with them).
#pragma once

#include "refhost/media/frame_rate.h"

namespace veltrane_web {

// The browser measures a clip's rate from its packets' timestamps; taken to the microsecond of
// frame time, it snaps to the rate the clip was shot at, as the host's nominal rate does. No
// rate for a measure not above 0.
refhost::FrameRate clipRate(double perSecond);

}  // namespace veltrane_web
