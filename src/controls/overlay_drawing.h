// Draws the on-screen controls over the viewer.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

int drawOverlay(WispHost* host, tagWispAPI* api);

}  // namespace veltrane
