// One GL shader object, compiled on creation and deleted when the last shared reference goes.
#pragma once

#include <GL/glew.h>

#include <memory>
#include <string>

#include "gl/shader_log.h"

namespace Plugin {
namespace gl {

class FXShader {
  struct Key {};  // keeps construction to make(), so every shader lives in a shared pointer

 public:
  // Creates and compiles a shader of `type` from `source`, appending its info log to `log`.
  // Throws FXGLSLexception (compile) when GL reports the compile as failed.
  static std::shared_ptr<FXShader> make(GLenum type, const std::string& source,
                                        veltrane::ShaderLog& log);

  FXShader(Key, GLenum type) : type_(type) {}
  ~FXShader();
  FXShader(const FXShader&) = delete;
  FXShader& operator=(const FXShader&) = delete;

  GLuint id() const { return id_; }
  GLenum type() const { return type_; }
  bool compiled() const { return compiled_; }
  const std::string& log() const { return log_; }

 private:
  void compile(const std::string& source);

  GLuint id_ = 0;
  GLenum type_;
  bool compiled_ = false;
  std::string log_;
};

}  // namespace gl
}  // namespace Plugin
