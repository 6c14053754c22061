// The failure type of GLSL compilation and linking: a fixed static text and which of the two
// steps failed. Thrown by value and caught only by the message dispatch.
#pragma once

#include <exception>

namespace Plugin {
namespace gl {

enum GLSLErrorType {
  GLSLErrorType_ShaderCompile = 0,
  GLSLErrorType_ShaderLink = 1,
};

class FXGLSLexception : public std::exception {
 public:
  FXGLSLexception(const char* message, GLSLErrorType type) noexcept
      : message_(message), type_(type) {}

  static FXGLSLexception compileFailure() noexcept {
    return FXGLSLexception("GLSLErrorType_ShaderCompile - The Shader failed to compile.",
                           GLSLErrorType_ShaderCompile);
  }
  static FXGLSLexception linkFailure() noexcept {
    return FXGLSLexception("GLSLErrorType_ShaderLink - The shader program failed to link.",
                           GLSLErrorType_ShaderLink);
  }

  const char* what() const noexcept override { return message_; }
  GLSLErrorType type() const noexcept { return type_; }

 private:
  const char* message_;  // static storage; never freed
  GLSLErrorType type_;
};

}  // namespace gl
}  // namespace Plugin
