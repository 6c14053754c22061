// Vertices with a pixel position and a texture coordinate, and the full-frame quads built from
// them (four vertices, one triangle strip).
#pragma once

#include <array>

#include "host/wisp_api.h"

namespace veltrane {

struct TexturedVertex {
  float x = 0.0f;
  float y = 0.0f;
  float s = 0.0f;
  float t = 0.0f;
};
static_assert(sizeof(TexturedVertex) == 16, "vertex data is uploaded as packed floats");

using TexturedQuad = std::array<TexturedVertex, 4>;

// The frame rectangle (0, 0)-(width, height) of the render context, mapped onto the image part
// of its source texture.
TexturedQuad makeFrameQuad(const WispRenderContext& context);

// The rectangle (0, 0)-(width, height) mapped onto the image part of `texture`.
TexturedQuad makeTextureQuad(const TextureRecord& texture, float width, float height);

}  // namespace veltrane
