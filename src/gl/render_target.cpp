// Host texture allocation and release for render targets, and framebuffer attachment.
#include "gl/render_target.h"

#include <utility>

namespace veltrane {
namespace {

TextureRecord defaultTemplate() {
  TextureRecord record{};
  record.pixelType = GL_FLOAT;
  record.format = GL_RGBA;
  record.scaleX = 1.0f;
  record.scaleY = 1.0f;
  return record;
}

TextureRecord chooseTemplate(const tagWispAPI& api) {
  const auto* context = static_cast<const WispRenderContext*>(api.renderContext);
  if (context == nullptr) return defaultTemplate();
  switch (api.textureFormatMode) {
    case kTextureFormatLikeOutput:
      return context->output;
    case kTextureFormatLikeSecond:
      return context->second;
    default:
      return defaultTemplate();
  }
}

// An allocation the host reports as empty gives corner 0 rather than a division by zero.
float corner(int32_t imageSize, int32_t allocatedSize) {
  return allocatedSize > 0 ? static_cast<float>(imageSize) / static_cast<float>(allocatedSize)
                           : 0.0f;
}

}  // namespace

RenderTarget RenderTarget::borrowed(const TextureRecord& texture) {
  RenderTarget target;
  target.texture = texture;
  return target;
}

RenderTarget::RenderTarget(RenderTarget&& other) noexcept
    : texture(other.texture), owned(other.owned), host(other.host), api(other.api) {
  other.owned = false;
}

RenderTarget& RenderTarget::operator=(RenderTarget&& other) noexcept {
  if (this != &other) {
    releaseRenderTarget(*this);
    texture = other.texture;
    owned = std::exchange(other.owned, false);
    host = other.host;
    api = other.api;
  }
  return *this;
}

RenderTarget::~RenderTarget() { releaseRenderTarget(*this); }

RenderTarget createRenderTarget(WispHost* host, tagWispAPI* api, bool floatFormat) {
  RenderTarget target;
  target.texture = chooseTemplate(*api);
  if (target.texture.format == GL_RGBA && floatFormat) target.texture.format = GL_RGBA16F;
  TextureRecord& texture = target.texture;
  texture.id = api->AllocateTexture(host, api->renderContext, texture.imageWidth,
                                    texture.imageHeight, texture.format, GL_RGBA, GL_UNSIGNED_BYTE,
                                    nullptr, &texture.allocatedWidth, &texture.allocatedHeight);
  texture.s0 = 0.0f;
  texture.t0 = 0.0f;
  texture.s1 = corner(texture.imageWidth, texture.allocatedWidth);
  texture.t1 = corner(texture.imageHeight, texture.allocatedHeight);
  target.owned = true;
  target.host = host;
  target.api = api;
  return target;
}

void releaseRenderTarget(RenderTarget& target) {
  if (target.owned && target.host != nullptr && target.api != nullptr) {
    target.api->ReleaseTexture(target.host, target.api->renderContext, target.texture.id);
  }
  target.owned = false;
  target.texture.id = 0;
}

void attachRenderTarget(const TextureRecord& texture, GLint level, GLenum attachment,
                        GLenum textureTarget) {
  glFramebufferTexture2D(GL_FRAMEBUFFER, attachment, textureTarget, texture.id, level);
  glViewport(0, 0, texture.imageWidth >> level, texture.imageHeight >> level);
}

}  // namespace veltrane
