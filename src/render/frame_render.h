// Renders one frame of the split screen into the host's output texture.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

int renderFrame(WispHost* host, tagWispAPI* api);

}  // namespace veltrane
