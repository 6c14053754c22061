// `veltrane info`: loads the module, runs it through load, declare, create, destroy and unload,
// and prints its registration and the parameter panel it declared.
#include <cstdio>
#include <stdexcept>
#include <string>

#include "cli/cli_support.h"
#include "commands/commands.h"
#include "output/panel_report.h"
#include "refhost/engine.h"

namespace veltrane_cli {
namespace {

// %d: the four product codes that number the layer labels.
const char kInfoHelp[] =
    "Usage: veltrane info [--plugin PATH] [--host-id N] [--json]\n"
    "\n"
    "Loads the plug-in module into the reference host, lets it declare its parameters,\n"
    "creates and destroys an instance and unloads it, and prints its registration and the\n"
    "parameter panel as a tree of groups. No GL context is needed.\n"
    "\n"
    "Example: veltrane info --json > panel.json\n"
    "\n"
    "Options:\n"
    "  --plugin PATH  the module to load (default: $VELTRANE_PLUGIN when set, else\n"
    "                 <dir of veltrane>/../lib/veltrane.so)\n"
    "  --host-id N    the host product code the host reports (default 0); codes %d, %d,\n"
    "                 %d and %d number the input layer labels\n"
    "  --json         print one JSON document instead of text\n"
    "  -h, --help     show this help\n";

// Every one of these messages answers done when it did its work.
const WispMessage kSteps[] = {kMessageLoad, kMessageDeclareParameters, kMessageCreateInstance,
                              kMessageDestroyInstance, kMessageUnload};

}  // namespace

int runInfo(const std::vector<std::string>& args) {
  if (wantsHelp(args)) {
    std::printf(kInfoHelp, kHostProductCompositor, kHostProductCompositorPro,
                kHostProductRenderNode, kHostProductCompositorPreview);
    return 0;
  }
  auto options = parseOptions(args, {{"--plugin", true}, {"--host-id", true}, {"--json", false}});
  int32_t hostId = options.count("--host-id") ? parseInt32("--host-id", options["--host-id"]) : 0;
  std::string path = pluginPath(options);

  refhost::EngineOptions engineOptions;
  engineOptions.modulePath = path;
  // No context: nothing here draws.
  engineOptions.hostId = hostId;
  refhost::Engine engine(std::move(engineOptions));
  refhost::Registration registration = engine.module().readRegistration();
  nlohmann::ordered_json messages = nlohmann::ordered_json::array();
  std::string failure;
  for (const WispMessage step : kSteps) {
    // Any answer is taken: a wrong one is reported below, after the panel is shown.
    int32_t result = engine.send(step, nullptr, nullptr, {});
    messages.push_back({{"message", step}, {"result", result}});
    if (result != kResultDone && failure.empty()) {
      failure = path + ": " + wispMessageText(step) + " answered " + std::to_string(result) +
                ", expected " + std::to_string(kResultDone);
    }
  }

  if (options.count("--json")) {
    nlohmann::ordered_json document = {{"module", path},
                                       {"hostId", hostId},
                                       {"registration", registrationJson(registration)},
                                       {"messages", messages},
                                       {"panel", panelJson(engine.panel())}};
    std::fputs((document.dump(2) + "\n").c_str(), stdout);
  } else {
    std::fputs(registrationText(registration).c_str(), stdout);
    std::printf("  %-12s%s\n  %-12s%d\n\n", "module", path.c_str(), "host id", hostId);
    std::fputs(panelText(engine.panel()).c_str(), stdout);
  }
  std::fflush(stdout);
  if (!failure.empty()) throw std::runtime_error(failure);
  return 0;
}

}  // namespace veltrane_cli
