// `veltrane view` in a build without the viewer window (no GLFW or Dear ImGui there).
#include <stdexcept>

#include "commands/commands.h"

namespace veltrane_cli {

int runView(const std::vector<std::string>&) {
  throw std::runtime_error(
      "this build has no viewer window (configured with VELTRANE_VIEWER=OFF); use 'veltrane "
      "render' or 'veltrane interact'");
}

}  // namespace veltrane_cli
