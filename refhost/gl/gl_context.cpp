// What every platform's context shares: GL entry points through GLEW, the debug callback and the
// string queries.
#include "refhost/gl/gl_context.h"

#include <GL/glew.h>

#include <cstdio>
#include <stdexcept>

namespace refhost {

namespace {

constexpr int kMostPolledErrors = 16;

// A context someone else made and destroys: only making it current again is ours.
class AdoptedContext : public PlatformContext {
 public:
  explicit AdoptedContext(std::function<void()> makeCurrent)
      : makeCurrent_(std::move(makeCurrent)) {}
  void makeCurrent() override { makeCurrent_(); }

 private:
  std::function<void()> makeCurrent_;
};

}  // namespace

GlContext::GlContext(GlProfile profile, std::unique_ptr<PlatformContext> platform)
    : profile_(profile), platform_(std::move(platform)) {
  watchDebugOutput();
}

std::unique_ptr<GlContext> GlContext::adoptCurrent(GlProfile profile,
                                                   std::function<void()> makeCurrent) {
  return std::make_unique<GlContext>(profile,
                                     std::make_unique<AdoptedContext>(std::move(makeCurrent)));
}

void GlContext::watchDebugOutput() {
  glewExperimental = GL_TRUE;
  glewInit();  // headless EGL answers "no GLX display" here but every entry point is loaded
  glGetError();
  // WebGL has no debug output: its errors are polled instead (see errors()). Emscripten declares
  // the entry point as a function, which is never null, so the build says so itself.
#ifdef __EMSCRIPTEN__
  debugOutput_ = false;
#else
  debugOutput_ = glDebugMessageCallback != nullptr;
#endif
  if (!debugOutput_) return;
  glEnable(GL_DEBUG_OUTPUT);
  glEnable(GL_DEBUG_OUTPUT_SYNCHRONOUS);
  glDebugMessageCallback(reinterpret_cast<GLDEBUGPROC>(&GlContext::debugCallback), this);
}

GlContext::~GlContext() {
  if (debugOutput_) {
    makeCurrent();
    glDebugMessageCallback(nullptr, nullptr);
  }
}

const std::vector<GlDebugMessage>& GlContext::errors() {
  if (!debugOutput_) {
    // Bounded: a lost WebGL context answers with an error of its own before it falls silent.
    for (int polled = 0; polled < kMostPolledErrors; ++polled) {
      const GLenum error = glGetError();
      if (error == GL_NO_ERROR) break;
      char text[48];
      std::snprintf(text, sizeof text, "glGetError reported 0x%04X", error);
      errors_.push_back(GlDebugMessage{GL_DEBUG_TYPE_ERROR, GL_DEBUG_SEVERITY_HIGH, error, text});
    }
  }
  return errors_;
}

void GlContext::clearErrors() {
  if (!debugOutput_) {
    for (int polled = 0; polled < kMostPolledErrors && glGetError() != GL_NO_ERROR; ++polled) {
    }
  }
  errors_.clear();
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
