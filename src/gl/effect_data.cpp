// Program building, linking, name lookup and uniform setting of the program registry.
#include "gl/effect_data.h"

#include <algorithm>
#include <utility>

#include "common/glsl_exception.h"
#include "gl/fx_shader.h"
#include "gl/shader_log.h"
#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace {

bool nameLess(const ProgramName& a, const ProgramName& b) { return a.name < b.name; }

// Deletes a program that never made it into the registry (a stage failed to compile).
class PendingProgram {
 public:
  PendingProgram() : id_(glCreateProgram()) {}
  ~PendingProgram() {
    if (id_ != 0) glDeleteProgram(id_);
  }
  GLuint id() const { return id_; }
  GLuint keep() { return std::exchange(id_, 0u); }

 private:
  GLuint id_;
};

std::string programInfoLog(GLuint id) {
  GLint length = 0;
  glGetProgramiv(id, GL_INFO_LOG_LENGTH, &length);
  if (length <= 0) return {};
  std::vector<GLchar> buffer(static_cast<size_t>(length), '\0');
  GLsizei written = 0;
  glGetProgramInfoLog(id, length, &written, buffer.data());
  return written > 0 ? std::string(buffer.data()) : std::string();
}

}  // namespace

void EffectData::createProgramWithGeometry(const std::string& vertex, const std::string& geometry,
                                           const std::string& fragment, bool verbose,
                                           const std::string& name) {
  ShaderLog log(verbose);
  auto record = std::make_unique<ProgramRecord>();
  PendingProgram program;
  {
    // The shader objects go when this block ends; GL keeps attached shaders alive until the
    // program itself is deleted.
    auto vertexShader = Plugin::gl::FXShader::make(GL_VERTEX_SHADER, vertex, log);
    glAttachShader(program.id(), vertexShader->id());
    auto fragmentShader = Plugin::gl::FXShader::make(GL_FRAGMENT_SHADER, fragment, log);
    glAttachShader(program.id(), fragmentShader->id());
    if (!geometry.empty()) {
      auto geometryShader = Plugin::gl::FXShader::make(GL_GEOMETRY_SHADER, geometry, log);
      glAttachShader(program.id(), geometryShader->id());
    }
  }
  record->id = program.keep();
  const int32_t index = programCount_;
  programs_.push_back(std::move(record));
  ++programCount_;
  programNames_.push_back(ProgramName{name, index});
  std::stable_sort(programNames_.begin(), programNames_.end(), nameLess);
}

void EffectData::createProgram(const std::string& vertex, const std::string& fragment, bool verbose,
                               const std::string& name) {
  createProgramWithGeometry(vertex, std::string(), fragment, verbose, name);
}

bool EffectData::linkProgram(const std::string& name, bool verbose) {
  return linkProgramAt(programIndex(name), verbose);
}

bool EffectData::linkProgramAt(int32_t index, bool verbose) {
  if (index < 0 || index >= programCount_) return false;
  ShaderLog log(verbose);
  ProgramRecord& record = *programs_[static_cast<size_t>(index)];
  glLinkProgram(record.id);
  GLint status = GL_FALSE;
  glGetProgramiv(record.id, GL_LINK_STATUS, &status);
  record.linked = (status & 0xFF) != 0;
  if (record.log.empty() && record.id != 0) record.log = programInfoLog(record.id);
  log.append(record.log);
  if (!record.linked) throw Plugin::gl::FXGLSLexception::linkFailure();
  return record.linked;
}

int EffectData::addGeometryProgram(const std::string& vertex, const std::string& geometry,
                                   const std::string& fragment, bool verbose,
                                   const std::string& name, bool useSourceNames) {
  createProgramWithGeometry(vertex, geometry, fragment, verbose, name);
  const int32_t index = programCount_ - 1;
  bindAttributeAt(index, shader_ids::kPositionLocation,
                  useSourceNames ? shader_ids::kVertexPosition : shader_ids::kLiteralPosition);
  bindAttributeAt(index, shader_ids::kTexCoordLocation,
                  useSourceNames ? shader_ids::kVertexTexCoord : shader_ids::kLiteralTexCoord);
  linkProgramAt(index, verbose);
  return 1;
}

int EffectData::addProgram(const std::string& vertex, const std::string& fragment, bool verbose,
                           const std::string& name, bool useSourceNames, bool withTexCoord) {
  createProgram(vertex, fragment, verbose, name);
  const int32_t index = programCount_ - 1;
  bindAttributeAt(index, shader_ids::kPositionLocation,
                  useSourceNames ? shader_ids::kVertexPosition : shader_ids::kLiteralPosition);
  if (withTexCoord) {
    bindAttributeAt(index, shader_ids::kTexCoordLocation,
                    useSourceNames ? shader_ids::kVertexTexCoord : shader_ids::kLiteralTexCoord);
  }
  linkProgramAt(index, verbose);
  return 1;
}

int EffectData::addDualTexCoordProgram(const std::string& vertex, const std::string& fragment,
                                       bool verbose, const std::string& name, bool useSourceNames) {
  createProgram(vertex, fragment, verbose, name);
  const int32_t index = programCount_ - 1;
  bindAttributeAt(index, shader_ids::kPositionLocation,
                  useSourceNames ? shader_ids::kVertexPosition : shader_ids::kLiteralPosition);
  bindAttributeAt(index, shader_ids::kTexCoord0Location,
                  useSourceNames ? shader_ids::kVertexTexCoord0 : shader_ids::kLiteralTexCoord0);
  bindAttributeAt(index, shader_ids::kTexCoord1Location,
                  useSourceNames ? shader_ids::kVertexTexCoord1 : shader_ids::kLiteralTexCoord1);
  linkProgramAt(index, verbose);
  return 1;
}

EffectData::~EffectData() noexcept(false) {
  programNames_.clear();
  for (auto it = programs_.rbegin(); it != programs_.rend(); ++it) {
    const GLuint id = (*it)->id;
    if (id == 0) continue;  // creation failed: nothing was made in GL
    GLuint shaders[10] = {};
    GLsizei count = 0;
    glGetAttachedShaders(id, 10, &count, shaders);
    for (GLsizei i = 0; i < count; ++i) glDetachShader(id, shaders[i]);
    glDeleteProgram(id);
  }
  programs_.clear();
  programCount_ = 0;
}

void EffectData::bindAttributeAt(int32_t index, GLuint location, const char* attributeName) {
  glBindAttribLocation(programs_[static_cast<size_t>(index)]->id, location, attributeName);
}

void EffectData::bindAttribute(const std::string& name, GLuint location,
                               const std::string& attributeName) {
  const int32_t index = programIndex(name);
  if (index >= 0) bindAttributeAt(index, location, attributeName.c_str());
}

int32_t EffectData::programIndex(const std::string& name) const {
  auto end =
      std::upper_bound(programNames_.begin(), programNames_.end(), ProgramName{name, -1}, nameLess);
  if (end == programNames_.begin()) return -1;
  const ProgramName& found = *(end - 1);
  return found.name == name ? found.index : -1;
}

int32_t EffectData::programId(const std::string& name) const {
  const int32_t index = programIndex(name);
  return index < 0 ? -1 : static_cast<int32_t>(programs_[static_cast<size_t>(index)]->id);
}

int32_t EffectData::currentProgramIndex() const {
  GLint current = 0;
  glGetIntegerv(GL_CURRENT_PROGRAM, &current);
  for (int32_t i = 0; i < programCount_; ++i) {
    if (programs_[static_cast<size_t>(i)]->id == static_cast<GLuint>(current)) return i;
  }
  return -1;
}

void EffectData::useProgram(const std::string& name) const { useProgramAt(programIndex(name)); }

void EffectData::useProgramAt(int32_t index) const {
  if (index >= 0 && index < programCount_) glUseProgram(programs_[static_cast<size_t>(index)]->id);
}

void EffectData::releaseProgram() const { glUseProgram(0); }

GLint EffectData::uniformLocation(const std::string& name) const {
  if (programCount_ == 0) return -1;
  int32_t index = currentProgramIndex();
  if (index < 0) index = 0;
  return glGetUniformLocation(programs_[static_cast<size_t>(index)]->id, name.c_str());
}

void EffectData::setUniform1i(GLint location, GLint v) const { glUniform1i(location, v); }

void EffectData::setUniform4i(GLint location, GLint a, GLint b, GLint c, GLint d) const {
  glUniform4i(location, a, b, c, d);
}

void EffectData::setUniform1f(GLint location, GLfloat x) const { glUniform1f(location, x); }

void EffectData::setUniform2f(GLint location, GLfloat x, GLfloat y) const {
  glUniform2f(location, x, y);
}

void EffectData::setUniform3f(GLint location, GLfloat x, GLfloat y, GLfloat z) const {
  glUniform3f(location, x, y, z);
}

void EffectData::setUniform4f(GLint location, GLfloat x, GLfloat y, GLfloat z, GLfloat w) const {
  glUniform4f(location, x, y, z, w);
}

void EffectData::setUniformMatrix(GLint location, int dimension, GLsizei count, bool transpose,
                                  const GLfloat* data) const {
  const GLboolean transposeFlag = transpose ? GL_TRUE : GL_FALSE;
  switch (dimension) {
    case 2:
      glUniformMatrix2fv(location, count, transposeFlag, data);
      break;
    case 3:
      glUniformMatrix3fv(location, count, transposeFlag, data);
      break;
    case 4:
      glUniformMatrix4fv(location, count, transposeFlag, data);
      break;
    default:
      break;
  }
}

}  // namespace veltrane
