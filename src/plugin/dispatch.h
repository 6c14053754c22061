// Message dispatch: decodes a host message, runs its handler and turns the plug-in's own
// exceptions into the exception result.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

int32_t dispatchMessage(WispHost* host, tagWispAPI* api, int32_t message);

}  // namespace veltrane
