// The host's own OpenGL context, with a debug callback that records every GL error so tests can
// assert there were none: headless EGL on Linux, WGL on a hidden window on Windows.
#pragma once

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
  static void debugCallback(unsigned source, unsigned type, unsigned id, unsigned severity,
                            int length, const char* message, const void* user);
  // The platform's side (gl_context_egl.cpp, gl_context_wgl.cpp): create a 4.1 debug context of
  // the profile and make it current, or throw saying which step failed; give it back.
  void createPlatformContext();
  void destroyPlatformContext();

  GlProfile profile_;
  void* display_ = nullptr;  // the EGL display, or the hidden window's device context (WGL)
  void* context_ = nullptr;  // the EGL context or the WGL rendering context
  void* window_ = nullptr;   // the hidden window (WGL)
  std::vector<GlDebugMessage> errors_;
  std::vector<GlDebugMessage> messages_;
};

}  // namespace refhost
