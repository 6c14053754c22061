// Chooses a layer for the selected input from a popup menu of the host's layers.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

// Returns 0 when no input is selected under the pointer, else 1 (also when the menu is
// dismissed).
int pickLayerForSelectedInput(WispHost* host, tagWispAPI* api);

}  // namespace veltrane
