// Quads in strip order: lower left, lower right, upper left, upper right.
#include "gl/textured_quad.h"

namespace veltrane {

TexturedQuad makeTextureQuad(const TextureRecord& texture, float width, float height) {
  return {{{0.0f, 0.0f, texture.s0, texture.t0},
           {width, 0.0f, texture.s1, texture.t0},
           {0.0f, height, texture.s0, texture.t1},
           {width, height, texture.s1, texture.t1}}};
}

TexturedQuad makeFrameQuad(const WispRenderContext& context) {
  return makeTextureQuad(context.source, static_cast<float>(context.width),
                         static_cast<float>(context.height));
}

}  // namespace veltrane
