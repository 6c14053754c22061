// Tells the host which frames the next render will fetch.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

// Requests the current frame of the own input and of every layer an input in use names.
// Returns 1.
int requestFrames(WispHost* host, tagWispAPI* api);

}  // namespace veltrane
