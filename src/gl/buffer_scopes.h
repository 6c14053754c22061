// Host-provided vertex arrays and buffers held for one draw. The buffers are the host's: each
// scope gives its buffer back when it ends, also when an exception passes.
#pragma once

#include <GL/glew.h>

#include <cstddef>
#include <cstdint>
#include <memory>

#include "host/wisp_api.h"

namespace Plugin {
namespace gl {

// One buffer acquired from the host and filled with data. Destruction unbinds its target and,
// unless `keep`, gives the buffer back.
class VertexBufferObjectRAII {
 public:
  VertexBufferObjectRAII(tagWispAPI* api, WispHost* host, GLenum target, std::size_t bytes,
                         const void* data, GLenum usage, bool keep = false);
  ~VertexBufferObjectRAII();
  VertexBufferObjectRAII(const VertexBufferObjectRAII&) = delete;
  VertexBufferObjectRAII& operator=(const VertexBufferObjectRAII&) = delete;

  void bind() const { glBindBuffer(target_, id_); }
  GLuint id() const { return id_; }

 private:
  tagWispAPI* api_;
  WispHost* host_;
  uint32_t id_;
  uint32_t target_;
  uint32_t hostOutput_ = 0;  // written by AcquireBuffer, never read
  bool keep_;
};

}  // namespace gl
}  // namespace Plugin

namespace veltrane {

// A host vertex array, bound for the scope, with an array buffer of vertex data bound to it.
// Ending the scope gives the buffer back and unbinds the vertex array, which stays the host's.
class VertexArrayScope {
 public:
  VertexArrayScope(tagWispAPI* api, WispHost* host, const void* vertexData, std::size_t bytes);
  ~VertexArrayScope();
  VertexArrayScope(const VertexArrayScope&) = delete;
  VertexArrayScope& operator=(const VertexArrayScope&) = delete;

 private:
  GLuint vertexArray_;
  std::shared_ptr<Plugin::gl::VertexBufferObjectRAII> vertices_;
};

// A host buffer (an element buffer in every use), bound for the scope and given back after.
class BufferScope {
 public:
  BufferScope(tagWispAPI* api, WispHost* host, GLenum target, std::size_t bytes, const void* data,
              GLenum usage, bool keep = false);
  GLuint id() const { return buffer_.id(); }

 private:
  Plugin::gl::VertexBufferObjectRAII buffer_;
};

}  // namespace veltrane
