// Layer states and composition timing as the input capture needs them.
#pragma once

#include <cstdint>

#include "host/wisp_api.h"

namespace veltrane {

// The composition frame rate; 25 when the host cannot say.
double compositionFrameRate(WispHost* host, tagWispAPI* api);
int32_t frameOfTime(double milliseconds, double frameRate);
int32_t timeOfFrame(int32_t frame, double frameRate);

// Asks the host for a layer's state and puts it in the form the alignment compares: flat layers
// lose every coupling with z, 3D layers are brought into the layer space. A refused query, or a
// flat request for a layer type that has no placement of its own, gives the flat default:
// composition size, identity matrices moved by minus half the size. Returns the host's status.
int32_t getLayerState(WispHost* host, tagWispAPI* api, const WispRenderContext& context,
                      const char* layerGuid, int32_t timeMs, LayerState& state, bool flat);

}  // namespace veltrane
