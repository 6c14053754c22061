// What the plug-in sees of the GL implementation, overridable for tests: the vendor and
// renderer strings, the extension list and a shader compiler that refuses everything. With
// nothing set, every call goes to the driver.
#pragma once

#include <optional>
#include <set>
#include <string>

namespace refhost {

struct GlOverrides {
  std::optional<std::string> vendor;
  std::optional<std::string> renderer;
  std::set<std::string> hiddenExtensions;  // left out of the indexed extension list
  bool refuseShaderCompiles = false;       // every shader stays uncompiled, as after an error
};

// Process-wide, like the GL entry points they stand in front of. The indexed extension list and
// the shader compiler are re-wired after every glewInit, so a plug-in that initialises GLEW
// itself sees them too.
void setGlOverrides(const GlOverrides& overrides);
void clearGlOverrides();

// Restores the driver's view when it goes out of scope.
class ScopedGlOverrides {
 public:
  explicit ScopedGlOverrides(const GlOverrides& overrides) { setGlOverrides(overrides); }
  ~ScopedGlOverrides() { clearGlOverrides(); }
  ScopedGlOverrides(const ScopedGlOverrides&) = delete;
  ScopedGlOverrides& operator=(const ScopedGlOverrides&) = delete;
};

}  // namespace refhost
