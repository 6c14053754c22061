// What the plug-in sees of the GL implementation, overridable for tests: the vendor and
// renderer strings and the extension list. With nothing set, every query goes to the driver.
#pragma once

#include <optional>
#include <set>
#include <string>

namespace refhost {

struct GlOverrides {
  std::optional<std::string> vendor;
  std::optional<std::string> renderer;
  std::set<std::string> hiddenExtensions;  // left out of the indexed extension list
};

// Process-wide, like the GL entry points they stand in front of. The indexed extension list is
// re-wired after every glewInit, so a plug-in that initialises GLEW itself sees it too.
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
