// The host's OpenGL context, with a debug callback that records every GL error so tests can
// assert there were none: one a platform made for the host (headless_context.h) or one adopted
// from a window, an editor or a browser canvas. Nothing here depends on how it was made.
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

// The side of a context that belongs to the platform that made it: making it current again,
// and giving it back when destroyed.
class PlatformContext {
 public:
  virtual ~PlatformContext() = default;
  virtual void makeCurrent() = 0;
};

class GlContext {
 public:
  // Takes over a context the platform made and made current (see headless_context.h):
  // entry points and the debug callback are set up in it, and it is given back with this.
  GlContext(GlProfile profile, std::unique_ptr<PlatformContext> platform);
  // Adopts the context current on this thread (a window's, an editor's, a browser canvas's)
  // instead: set up in the same way; `makeCurrent` is how its owner makes it current again. The
  // owner destroys the context, after this object is gone.
  static std::unique_ptr<GlContext> adoptCurrent(GlProfile profile,
                                                 std::function<void()> makeCurrent);
  ~GlContext();
  GlContext(const GlContext&) = delete;
  GlContext& operator=(const GlContext&) = delete;

  void makeCurrent() { platform_->makeCurrent(); }
  // Makes the context current and waits until GL has finished every command given so far.
  void finish();
  GlProfile profile() const { return profile_; }
  std::string versionString() const;
  std::string rendererString() const;

  // GL errors reported since the last clear. Where the context has no debug output (WebGL),
  // errors are asked of glGetError when read.
  const std::vector<GlDebugMessage>& errors();
  void clearErrors();
  // Every message of the debug callback (errors included), for diagnostics.
  const std::vector<GlDebugMessage>& messages() const { return messages_; }

 private:
  // Loads the entry points through GLEW and installs the debug callback in the current context.
  void watchDebugOutput();
  static void debugCallback(unsigned source, unsigned type, unsigned id, unsigned severity,
                            int length, const char* message, const void* user);

  GlProfile profile_;
  std::unique_ptr<PlatformContext> platform_;
  bool debugOutput_ = false;
  std::vector<GlDebugMessage> errors_;
  std::vector<GlDebugMessage> messages_;
};

}  // namespace refhost
