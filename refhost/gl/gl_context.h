// The host's OpenGL context, with a debug callback that records every GL error so tests can
// assert there were none: its own (headless EGL on Linux, WGL on a hidden window on Windows) or
// one adopted from a window.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace refhost {

enum class GlProfile { Core, Compatibility };

struct GlDebugMessage {
  unsigned type = 0;
  unsigned severity = 0;
  unsigned id = 0;
  std::string text;
};

class GlContext {
 public:
  // Creates a 4.1+ context of the given profile and makes it current. Throws std::runtime_error
  // naming the step that failed when no context can be made.
  explicit GlContext(GlProfile profile = GlProfile::Core);
  // Adopts the context current on this thread (a window's) instead of making one: entry points
  // and the debug callback are set up as for an own context; `makeCurrent` is how its owner
  // makes it current again. The owner destroys the context, after this object is gone.
  static std::unique_ptr<GlContext> adoptCurrent(GlProfile profile,
                                                 std::function<void()> makeCurrent);
  ~GlContext();
  GlContext(const GlContext&) = delete;
  GlContext& operator=(const GlContext&) = delete;

  void makeCurrent();
  // Makes the context current and waits until GL has finished every command given so far.
  void finish();
  GlProfile profile() const { return profile_; }
  std::string versionString() const;
  std::string rendererString() const;

  // GL errors reported by the debug callback since the last clear.
  const std::vector<GlDebugMessage>& errors() const { return errors_; }
  void clearErrors() { errors_.clear(); }
  // Every message of the debug callback (errors included), for diagnostics.
  const std::vector<GlDebugMessage>& messages() const { return messages_; }

 private:
  GlContext(GlProfile profile, std::function<void()> makeCurrent);
  // Loads the entry points through GLEW and installs the debug callback in the current context.
  void watchDebugOutput();
  static void debugCallback(unsigned source, unsigned type, unsigned id, unsigned severity,
                            int length, const char* message, const void* user);
  // The platform's side (gl_context_egl.cpp, gl_context_wgl.cpp): create a 4.1 debug context of
  // the profile and make it current, or throw saying which step failed; make it current again;
  // give it back.
  void createPlatformContext();
  void makePlatformContextCurrent();
  void destroyPlatformContext();

  GlProfile profile_;
  void* display_ = nullptr;  // the EGL display, or the hidden window's device context (WGL)
  void* context_ = nullptr;  // the EGL context or the WGL rendering context
  void* window_ = nullptr;   // the hidden window (WGL)
  std::function<void()> adoptedMakeCurrent_;  // set only for an adopted context
  std::vector<GlDebugMessage> errors_;
  std::vector<GlDebugMessage> messages_;
};

}  // namespace refhost
