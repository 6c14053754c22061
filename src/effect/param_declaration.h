// Declares the effect's parameters to the host, in their fixed order and group nesting.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

// Host product codes whose panels number the input layer labels ("Layer 0" ... "Layer 8").
bool hostNumbersLayerLabels(int32_t hostId);

// Declares every parameter. Throws PluginException when the host refuses any call; what was
// declared before the refusal stays declared. Returns 1.
int declareParameters(WispHost* host, tagWispAPI* api);

}  // namespace veltrane
