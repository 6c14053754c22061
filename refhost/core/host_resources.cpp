// GL resources the host hands the plug-in (textures, buffers, the vertex array), their
// accounting, and the host's own framebuffer and textures.
//
// Textures: every one, the plug-in's and the host's own, comes from one pool keyed by size and
// format and goes back to it, so rendering frame after frame allocates no texture storage.
//
// Vertex arrays: the host keeps one vertex array for its whole life and answers every
// CreateVertexArray with it; the plug-in never deletes it, so nothing about it needs balancing.
#include <GL/glew.h>

#include <stdexcept>

#include "refhost/core/host.h"
#include "refhost/platform/text.h"

namespace refhost {
namespace {

// Keeps the plug-in's texture binding of the active unit across a host-side allocation.
class TextureBindingGuard {
 public:
  TextureBindingGuard() { glGetIntegerv(GL_TEXTURE_BINDING_2D, &previous_); }
  ~TextureBindingGuard() { glBindTexture(GL_TEXTURE_2D, static_cast<GLuint>(previous_)); }
  TextureBindingGuard(const TextureBindingGuard&) = delete;
  TextureBindingGuard& operator=(const TextureBindingGuard&) = delete;

 private:
  GLint previous_ = 0;
};

// Gives a texture back to the pool, or deletes one the pool did not make.
void dropTexture(TexturePool& pool, uint32_t id) {
  if (!pool.giveBack(id)) glDeleteTextures(1, &id);
}

void dropTextures(TexturePool& pool, std::set<uint32_t>& names) {
  for (uint32_t id : names) dropTexture(pool, id);
  names.clear();
}

}  // namespace

GlContext& Host::shareGl(std::shared_ptr<GlContext> context) {
  releaseGl();
  gl_ = std::move(context);
  gl_->makeCurrent();
  return *gl_;
}

GlContext& Host::attachGl(std::unique_ptr<GlContext> context) {
  releaseGl();
  gl_ = std::move(context);
  return *gl_;
}

bool Host::requireGl(const char* operation) {
  if (gl_) return true;
  problem(std::string(operation) + ": no GL context attached");
  return false;
}

void Host::bindFramebuffer() {
  if (framebuffer_ == 0) glGenFramebuffers(1, &framebuffer_);
  glBindFramebuffer(GL_FRAMEBUFFER, framebuffer_);
  if (drawTarget_ == 0) return;
  glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, drawTarget_, 0);
  glViewport(0, 0, drawTargetWidth_, drawTargetHeight_);
}

void Host::setDrawTarget(uint32_t textureId, int32_t width, int32_t height) {
  drawTarget_ = textureId;
  drawTargetWidth_ = width;
  drawTargetHeight_ = height;
}

void Host::reclaimFrames() {
  if (frames_.empty() || !gl_) return;
  gl_->makeCurrent();
  dropTextures(texturePool_, frames_);
}

void Host::releaseGl() {
  if (!gl_) return;
  gl_->makeCurrent();
  dropTextures(texturePool_, textures_);
  dropTextures(texturePool_, frames_);
  texturePool_.clear();
  for (uint32_t id : buffers_) glDeleteBuffers(1, &id);
  buffers_.clear();
  if (vertexArray_) glDeleteVertexArrays(1, &vertexArray_);
  if (framebuffer_) glDeleteFramebuffers(1, &framebuffer_);
  vertexArray_ = 0;
  framebuffer_ = 0;
  gl_.reset();
}

TextureRecord Host::createTexture(int32_t width, int32_t height, const void* pixels,
                                  uint32_t internalFormat) {
  if (!gl_) throw std::logic_error("refhost::Host::createTexture: no GL context attached");
  gl_->makeCurrent();
  TextureRecord record{};
  record.id = texture(TextureKey{width, height, internalFormat, GL_RGBA, GL_UNSIGNED_BYTE}, pixels);
  record.pixelType = GL_UNSIGNED_BYTE;
  record.format = internalFormat;
  record.allocatedWidth = record.imageWidth = width;
  record.allocatedHeight = record.imageHeight = height;
  record.s1 = record.t1 = 1.0f;
  record.scaleX = record.scaleY = 1.0f;
  return record;
}

TextureRecord Host::createFrameTexture(int32_t width, int32_t height, const void* pixels) {
  if (!gl_) throw std::logic_error("refhost::Host::createFrameTexture: no GL context attached");
  gl_->makeCurrent();
  TextureRecord record{};
  record.id = texture(
      TextureKey{width, height, glInternalFormat(frameFormat_), GL_RGBA, glDataType(frameFormat_)},
      pixels);
  record.pixelType = glDataType(frameFormat_);
  record.format = glInternalFormat(frameFormat_);
  record.allocatedWidth = record.imageWidth = width;
  record.allocatedHeight = record.imageHeight = height;
  record.s1 = record.t1 = 1.0f;
  record.scaleX = record.scaleY = 1.0f;
  return record;
}

void Host::deleteTexture(uint32_t id) {
  if (!gl_) return;
  gl_->makeCurrent();
  dropTexture(texturePool_, id);
}

uint32_t Host::texture(const TextureKey& key, const void* pixels) {
  uint32_t id = texturePool_.acquire(key, pixels != nullptr);
  if (pixels) {
    TextureBindingGuard guard;
    glBindTexture(GL_TEXTURE_2D, id);
    glTexSubImage2D(GL_TEXTURE_2D, 0, 0, 0, key.width, key.height, key.pixelFormat, key.pixelType,
                    pixels);
  }
  return id;
}

uint32_t Host::allocateTexture(int32_t width, int32_t height, uint32_t internalFormat,
                               uint32_t pixelFormat, uint32_t pixelType, const void* data,
                               int32_t* allocatedWidth, int32_t* allocatedHeight) {
  log([&] {
    return std::string("AllocateTexture " + std::to_string(width) + " " + std::to_string(height) +
                       " " + logHex(internalFormat) + " " + logHex(pixelFormat) + " " +
                       logHex(pixelType) + " " + (data ? "data" : "null"));
  });
  if (allocatedWidth) *allocatedWidth = 0;
  if (allocatedHeight) *allocatedHeight = 0;
  if (!requireGl("AllocateTexture")) return 0;
  GLint largest = 0;
  glGetIntegerv(GL_MAX_TEXTURE_SIZE, &largest);
  if (width < 0 || height < 0 || width > largest || height > largest) {
    problem("AllocateTexture: no texture of " + std::to_string(width) + "x" +
            std::to_string(height) + " (GL allows 0 to " + std::to_string(largest) + ")");
    return 0;
  }
  // This host allocates exactly the size asked for, so the image fills its texture.
  uint32_t id = texture(TextureKey{width, height, internalFormat, pixelFormat, pixelType}, data);
  textures_.insert(id);
  if (allocatedWidth) *allocatedWidth = width;
  if (allocatedHeight) *allocatedHeight = height;
  return id;
}

void Host::releaseTexture(uint32_t id) {
  log([&] { return std::string("ReleaseTexture " + std::to_string(id)); });
  // A fetched frame may be given back like an allocated texture, or left to the host.
  std::set<uint32_t>* owner = textures_.count(id) ? &textures_
                              : frames_.count(id) ? &frames_
                                                  : nullptr;
  if (!owner) {
    problem("ReleaseTexture: texture " + std::to_string(id) +
            " is not one the host handed out, or was given back already");
    return;
  }
  owner->erase(id);
  if (gl_) dropTexture(texturePool_, id);
}

uint32_t Host::createVertexArray() {
  log([&] { return std::string("CreateVertexArray"); });
  if (!requireGl("CreateVertexArray")) return 0;
  if (vertexArray_ == 0) glGenVertexArrays(1, &vertexArray_);
  return vertexArray_;
}

uint32_t Host::acquireBuffer(uint32_t target, int64_t size, const void* data, uint32_t usage,
                             uint32_t* hostOutput) {
  log([&] {
    return std::string("AcquireBuffer " + logHex(target) + " " + std::to_string(size) + " " +
                       (data ? "data" : "null") + " " + logHex(usage));
  });
  if (!requireGl("AcquireBuffer")) return 0;
  if (size < 0) {
    problem("AcquireBuffer: negative size " + std::to_string(size) + ", 0 used");
    size = 0;
  }
  GLuint id = 0;
  glGenBuffers(1, &id);
  glBindBuffer(target, id);
  glBufferData(target, static_cast<GLsizeiptr>(size), data, usage);
  buffers_.insert(id);
  // The field is the host's to use; this host leaves the buffer name there.
  if (hostOutput) *hostOutput = id;
  return id;
}

void Host::releaseBuffer(uint32_t id) {
  log([&] { return std::string("ReleaseBuffer " + std::to_string(id)); });
  if (!buffers_.erase(id)) {
    problem("ReleaseBuffer: buffer " + std::to_string(id) +
            " is not one the host handed out, or was given back already");
    return;
  }
  if (gl_) glDeleteBuffers(1, &id);
}

}  // namespace refhost
