// Shader creation and compilation; the info log is read only when GL has one to give.
#include "gl/fx_shader.h"

#include <vector>

#include "common/glsl_exception.h"

namespace Plugin {
namespace gl {

std::shared_ptr<FXShader> FXShader::make(GLenum type, const std::string& source,
                                         veltrane::ShaderLog& log) {
  auto shader = std::make_shared<FXShader>(Key{}, type);
  shader->id_ = glCreateShader(type);
  if (shader->id_ != 0) {
    shader->compile(source);
    log.append(shader->log_);
    if (!shader->compiled_) throw FXGLSLexception::compileFailure();
  }
  return shader;
}

FXShader::~FXShader() { glDeleteShader(id_); }

void FXShader::compile(const std::string& source) {
  const GLchar* text = source.data();
  const GLint length = static_cast<GLint>(source.size());
  glShaderSource(id_, 1, &text, &length);
  glCompileShader(id_);
  GLint status = GL_FALSE;
  glGetShaderiv(id_, GL_COMPILE_STATUS, &status);
  compiled_ = (status & 0xFF) != 0;
  if (!log_.empty()) return;
  GLint logLength = 0;
  glGetShaderiv(id_, GL_INFO_LOG_LENGTH, &logLength);
  if (logLength <= 0) return;
  std::vector<GLchar> buffer(static_cast<size_t>(logLength), '\0');
  GLsizei written = 0;
  glGetShaderInfoLog(id_, logLength, &written, buffer.data());
  if (written > 0) log_ = buffer.data();
}

}  // namespace gl
}  // namespace Plugin
