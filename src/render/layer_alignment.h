// Re-renders a layer's frame so that it lines up with the effect's own layer when the two sit
// in the composition with different sizes, depth or placement.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

// Draws `texture` through the layer-alignment program into a new host texture of the output's
// size and replaces the record with it. The caller owns the new texture.
void alignLayer(WispHost* host, tagWispAPI* api, const WispRenderContext& context,
                TextureRecord& texture, LayerState ownState, LayerState chosenState);

// Whether the chosen layer's frame must be re-rendered to line up with the own layer.
bool placementsDiffer(const LayerState& own, const LayerState& chosen);

}  // namespace veltrane
