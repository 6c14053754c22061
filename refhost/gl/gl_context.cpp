// What every platform's context shares: GL entry points through GLEW, the debug callback and the
// string queries.
#include "refhost/gl/gl_context.h"

#include <GL/glew.h>

#include <stdexcept>

namespace refhost {

GlContext::GlContext(GlProfile profile) : profile_(profile) {
  createPlatformContext();
  watchDebugOutput();
}

GlContext::GlContext(GlProfile profile, std::function<void()> makeCurrent)
    : profile_(profile), adoptedMakeCurrent_(std::move(makeCurrent)) {
  watchDebugOutput();
}

std::unique_ptr<GlContext> GlContext::adoptCurrent(GlProfile profile,
                                                   std::function<void()> makeCurrent) {
  return std::unique_ptr<GlContext>(new GlContext(profile, std::move(makeCurrent)));
}

void GlContext::watchDebugOutput() {
  glewExperimental = GL_TRUE;
  glewInit();  // headless EGL answers "no GLX display" here but every entry point is loaded
  glGetError();
  if (!glDebugMessageCallback)
    throw std::runtime_error("the OpenGL context offers no glDebugMessageCallback");
  glEnable(GL_DEBUG_OUTPUT);
  glEnable(GL_DEBUG_OUTPUT_SYNCHRONOUS);
  glDebugMessageCallback(reinterpret_cast<GLDEBUGPROC>(&GlContext::debugCallback), this);
}

GlContext::~GlContext() {
  if (adoptedMakeCurrent_) {
    glDebugMessageCallback(nullptr, nullptr);
    return;
  }
  if (context_) {
    glDebugMessageCallback(nullptr, nullptr);
    destroyPlatformContext();
  }
}

void GlContext::makeCurrent() {
  if (adoptedMakeCurrent_) return adoptedMakeCurrent_();
  makePlatformContextCurrent();
}

void GlContext::finish() {
  makeCurrent();
  glFinish();
}

std::string GlContext::versionString() const {
  const GLubyte* text = glGetString(GL_VERSION);
  return text ? reinterpret_cast<const char*>(text) : "";
}

std::string GlContext::rendererString() const {
  const GLubyte* text = glGetString(GL_RENDERER);
  return text ? reinterpret_cast<const char*>(text) : "";
}

void GlContext::debugCallback(unsigned, unsigned type, unsigned id, unsigned severity, int length,
                              const char* message, const void* user) {
  auto* self = const_cast<GlContext*>(static_cast<const GlContext*>(user));
  GlDebugMessage record{
      type, severity, id,
      length >= 0 ? std::string(message, static_cast<size_t>(length)) : std::string(message)};
  if (type == GL_DEBUG_TYPE_ERROR) self->errors_.push_back(record);
  self->messages_.push_back(std::move(record));
}

}  // namespace refhost
