// Pixel-buffer read-back: glReadPixels into a buffer, a fence behind it, and the buffer mapped
// only when the picture is wanted.
#include "refhost/pipeline/frame_readback.h"

#include <GL/glew.h>

#include <algorithm>
#include <cstring>
#include <stdexcept>

namespace refhost {
namespace {

std::size_t rowBytes(int32_t width, PixelFormat format) {
  return static_cast<std::size_t>(std::max(width, 0)) * bytesPerPixel(format);
}

}  // namespace

FrameReadback::FrameReadback(int32_t width, int32_t height, int32_t depth, PixelFormat format)
    : width_(std::max(width, 0)), height_(std::max(height, 0)), format_(format) {
  buffers_.resize(static_cast<std::size_t>(std::max(depth, 1)));
  glGenBuffers(static_cast<GLsizei>(buffers_.size()), buffers_.data());
  const auto bytes =
      static_cast<GLsizeiptr>(rowBytes(width_, format_) * static_cast<std::size_t>(height_));
  for (uint32_t buffer : buffers_) {
    glBindBuffer(GL_PIXEL_PACK_BUFFER, buffer);
    glBufferData(GL_PIXEL_PACK_BUFFER, bytes, nullptr, GL_STREAM_READ);
  }
  glBindBuffer(GL_PIXEL_PACK_BUFFER, 0);
  free_ = buffers_;
  glGenFramebuffers(1, &framebuffer_);
}

FrameReadback::~FrameReadback() {
  for (const Pending& read : pending_) glDeleteSync(static_cast<GLsync>(read.fence));
  glDeleteBuffers(static_cast<GLsizei>(buffers_.size()), buffers_.data());
  glDeleteFramebuffers(1, &framebuffer_);
}

bool FrameReadback::start(uint32_t texture) {
  if (free_.empty()) return false;
  GLint previousRead = 0;
  glGetIntegerv(GL_READ_FRAMEBUFFER_BINDING, &previousRead);
  glBindFramebuffer(GL_READ_FRAMEBUFFER, framebuffer_);
  glFramebufferTexture2D(GL_READ_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, texture, 0);
  const uint32_t buffer = free_.back();
  free_.pop_back();
  glBindBuffer(GL_PIXEL_PACK_BUFFER, buffer);
  glPixelStorei(GL_PACK_ALIGNMENT, 4);
  glReadPixels(0, 0, width_, height_, GL_RGBA, glDataType(format_), nullptr);
  glBindBuffer(GL_PIXEL_PACK_BUFFER, 0);
  // Detached again, so the texture can go back to its owner's pool at once.
  glFramebufferTexture2D(GL_READ_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, 0, 0);
  glBindFramebuffer(GL_READ_FRAMEBUFFER, static_cast<GLuint>(previousRead));
  pending_.push_back(Pending{buffer, glFenceSync(GL_SYNC_GPU_COMMANDS_COMPLETE, 0)});
  // Sent on its way now, so GL works on it while the caller prepares the next frame.
  glFlush();
  return true;
}

RgbaImage FrameReadback::collect() {
  RgbaImage picture(width_, height_, format_);
  collectInto(picture.pixels.data());
  return picture;
}

void FrameReadback::collectInto(uint8_t* to) {
  if (pending_.empty()) throw std::logic_error("refhost::FrameReadback::collect: nothing read");
  const Pending read = pending_.front();
  pending_.pop_front();
  auto fence = static_cast<GLsync>(read.fence);
  while (glClientWaitSync(fence, GL_SYNC_FLUSH_COMMANDS_BIT, 1000000000) == GL_TIMEOUT_EXPIRED) {
  }
  glDeleteSync(fence);

  const std::size_t row = rowBytes(width_, format_);
  glBindBuffer(GL_PIXEL_PACK_BUFFER, read.buffer);
  const auto bytes = static_cast<GLsizeiptr>(row * static_cast<std::size_t>(height_));
  const auto* mapped = static_cast<const uint8_t*>(
      glMapBufferRange(GL_PIXEL_PACK_BUFFER, 0, bytes, GL_MAP_READ_BIT));
  // GL's rows run bottom up; the copy out of the buffer turns them the right way up.
  if (mapped) copyRowsFlipped(mapped, to, row, height_);
  if (mapped) glUnmapBuffer(GL_PIXEL_PACK_BUFFER);
  glBindBuffer(GL_PIXEL_PACK_BUFFER, 0);
  free_.push_back(read.buffer);
  if (!mapped) throw std::runtime_error("cannot map the read-back buffer of a rendered frame");
}

RgbaImage readBack(uint32_t texture, int32_t width, int32_t height, PixelFormat format) {
  FrameReadback readback(width, height, 1, format);
  readback.start(texture);
  return readback.collect();
}

}  // namespace refhost
