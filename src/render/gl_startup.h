// GL start-up: loads the GL entry points and builds every GLSL program into the registry.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

// Runs with the host's GL context current. Builds the thirteen programs in their fixed order
// into the EffectData held in api->pluginData; a compile or link failure leaves by exception
// with the programs built so far kept. Returns 1.
int prepareGl(WispHost* host, tagWispAPI* api);

}  // namespace veltrane
