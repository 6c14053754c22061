// Textures the effect asks the host for during one message, and redirecting the host's bound
// framebuffer to draw into one of them.
#pragma once

#include <GL/glew.h>

#include "host/wisp_api.h"

namespace veltrane {

// A host texture used as a render target or as a picture. When `owned` is set the effect asked
// the host for the texture and gives it back (through `host` and `api`) when released or
// destroyed; a borrowed texture (owned false) stays the host's and is never given back.
// Move-only, so exactly one record is responsible for giving a texture back.
struct RenderTarget {
  TextureRecord texture{};
  bool owned = false;
  WispHost* host = nullptr;
  tagWispAPI* api = nullptr;

  RenderTarget() = default;
  // Wraps a texture that someone else owns.
  static RenderTarget borrowed(const TextureRecord& texture);
  RenderTarget(RenderTarget&& other) noexcept;
  RenderTarget& operator=(RenderTarget&& other) noexcept;
  RenderTarget(const RenderTarget&) = delete;
  RenderTarget& operator=(const RenderTarget&) = delete;
  ~RenderTarget();
};

// Allocates a texture of the template's image size; the template is the render context's output
// or second texture as textureFormatMode says (WispTextureFormatMode), or a built-in RGBA
// default (any other mode, or no render context). `floatFormat` turns an RGBA template into
// RGBA16F.
RenderTarget createRenderTarget(WispHost* host, tagWispAPI* api, bool floatFormat);

// Gives an owned texture back to the host once; afterwards the target is empty and borrowed.
void releaseRenderTarget(RenderTarget& target);

// Points `attachment` of the host's bound framebuffer at the texture's `level` and sets the
// viewport to that level's image size.
void attachRenderTarget(const TextureRecord& texture, GLint level, GLenum attachment,
                        GLenum textureTarget);

}  // namespace veltrane
