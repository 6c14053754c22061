// Reaction to a changed parameter: tells the host which cut and input parameters are usable.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

// Handles a change of the parameter `id`. Returns 1.
int onParameterChanged(WispHost* host, tagWispAPI* api, const char* id);

}  // namespace veltrane
