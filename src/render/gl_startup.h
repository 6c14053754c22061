// GL start-up: loads the GL entry points and builds every GLSL program into the registry.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

class EffectData;

// Runs with the host's GL context current. Builds the thirteen programs in their fixed order
// into the EffectData held in api->pluginData; a compile or link failure leaves by exception
// with the programs built so far kept. Returns 1.
int prepareGl(WispHost* host, tagWispAPI* api);

// True when the registry holds every program GL start-up builds. A host that draws before GL
// start-up (or after a load that made a fresh registry) gets nothing drawn rather than GL
// errors from programs that do not exist.
bool programsBuilt(const EffectData* registry);

}  // namespace veltrane
