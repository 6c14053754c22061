// Chooses and obtains the picture an input shows: the effect's own source, a time-shifted
// source frame, or another layer of the composition (aligned to the own layer when needed).
#pragma once

#include <cstdint>

#include "gl/render_target.h"
#include "host/wisp_api.h"

namespace veltrane {

// The fixed application identifier of the one host that serves frames outside the source's
// or layer's range itself (16 UTF-16 code units).
constexpr wchar_t kDesignatedHostIdentifier[] = L"com.wisp.directr";
static_assert(sizeof kDesignatedHostIdentifier / sizeof(wchar_t) == 16 + 1,
              "the designated host identifier is 16 code units");

// Fills `holder` with input k's picture for the render time, releasing what it owned before.
// A picture that is the render context's own source texture is borrowed; everything the host
// handed out for it is owned and given back when the holder is released.
void fetchInputFrame(int inputIndex, RenderTarget& holder, WispHost* host, tagWispAPI* api);

// The own source at a frame index; returns whether the result is owned.
bool captureSourceFrame(WispHost* host, tagWispAPI* api, int32_t frameIndex, bool clamp,
                        bool fallBackToSource, TextureRecord& out);

// The frame of the layer named by the layer parameter `layerParamId`, shifted by `frameShift`
// frames and aligned to the own layer; returns whether the result is owned.
bool captureLayerFrame(WispHost* host, tagWispAPI* api, const WispRenderContext& context,
                       const char* layerParamId, int32_t currentTimeMs, TextureRecord& out,
                       int32_t frameShift);

}  // namespace veltrane
