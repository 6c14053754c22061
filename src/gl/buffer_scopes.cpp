// Acquiring, binding and giving back host vertex arrays and buffers.
#include "gl/buffer_scopes.h"

namespace Plugin {
namespace gl {

VertexBufferObjectRAII::VertexBufferObjectRAII(tagWispAPI* api, WispHost* host, GLenum target,
                                               std::size_t bytes, const void* data, GLenum usage,
                                               bool keep)
    : api_(api), host_(host), id_(0), target_(target), keep_(keep) {
  id_ = api_->AcquireBuffer(host_, target_, static_cast<int64_t>(bytes), data, usage, &hostOutput_);
}

VertexBufferObjectRAII::~VertexBufferObjectRAII() {
  glBindBuffer(target_, 0);
  if (!keep_) api_->ReleaseBuffer(host_, id_);
}

}  // namespace gl
}  // namespace Plugin

namespace veltrane {

VertexArrayScope::VertexArrayScope(tagWispAPI* api, WispHost* host, const void* vertexData,
                                   std::size_t bytes)
    : vertexArray_(api->CreateVertexArray(host)) {
  glBindVertexArray(vertexArray_);
  vertices_ = std::make_shared<Plugin::gl::VertexBufferObjectRAII>(
      api, host, GL_ARRAY_BUFFER, bytes, vertexData, GL_DYNAMIC_DRAW);
  vertices_->bind();
}

VertexArrayScope::~VertexArrayScope() {
  vertices_.reset();
  glBindVertexArray(0);
}

BufferScope::BufferScope(tagWispAPI* api, WispHost* host, GLenum target, std::size_t bytes,
                         const void* data, GLenum usage, bool keep)
    : buffer_(api, host, target, bytes, data, usage, keep) {
  buffer_.bind();
}

}  // namespace veltrane
