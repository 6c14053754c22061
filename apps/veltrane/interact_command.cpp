// `veltrane interact`: replays scripted viewer events (pointer, keys, the layer menu, undo and
// redo) on a scene running in the plug-in and writes what came of them as JSON.
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <stdexcept>

#include "cli_support.h"
#include "commands.h"
#include "event_replay.h"
#include "event_script.h"
#include "refhost/staged_file.h"
#include "scene_file.h"
#include "scene_session.h"

namespace veltrane_cli {
namespace {

const char kInteractHelp[] =
    "Usage: veltrane interact SCENE.json --events EVENTS.json -o RESULT.json [--overlay DIR]\n"
    "                         [--profile core|compat] [--plugin PATH]\n"
    "\n"
    "Sets up the scene as 'veltrane render' does, then delivers the events of EVENTS.json\n"
    "(see docs/events-format.md) to the plug-in as a viewer would: pointer press, move and\n"
    "release (1005, 1004, 1006), key down and up (1007, 1008), the layer menu (1012, 1013)\n"
    "with scripted answers, and the host's undo and redo. After each event the host reports\n"
    "changed parameters with message 7. RESULT.json receives every parameter's value in the\n"
    "scene's form, the undo steps (and one left open), the cursor, the selected input and\n"
    "whether the pointer hovers over it after each event, the menus shown and each message's\n"
    "answer.\n"
    "\n"
    "Options:\n"
    "  --events FILE   the event script (required)\n"
    "  -o, --output F  where the result goes (required)\n"
    "  --overlay DIR   also write DIR/event_0000.png, ...: the frame at the script's time with\n"
    "                  the plug-in's overlay (message 1003) over it, after each event\n"
    "  --profile P     GL profile: core (default) or compat\n"
    "  --plugin PATH   the module to load\n"
    "  -h, --help      show this help\n";

void writeResult(const std::string& path, const nlohmann::ordered_json& result) {
  refhost::StagedFile file(path);
  {
    std::ofstream out(file.temporaryPath());
    out << result.dump(2) << "\n";
    if (!out) throw std::runtime_error(path + ": cannot be written");
  }
  file.commit();
}

}  // namespace

int runInteract(const std::vector<std::string>& args) {
  if (wantsHelp(args)) {
    std::fputs(kInteractHelp, stdout);
    return 0;
  }
  Arguments parsed = parseArguments(args, {{"--events", true},
                                           {"-o", true},
                                           {"--output", true},
                                           {"--overlay", true},
                                           {"--profile", true},
                                           {"--plugin", true}});
  auto& options = parsed.options;
  if (parsed.positional.size() != 1) throw UsageError("expects one scene file");
  if (!options.count("--events")) throw UsageError("needs --events EVENTS.json");
  if (options.count("-o") == options.count("--output"))
    throw UsageError("needs -o RESULT.json once");
  std::string output = options.count("-o") ? options["-o"] : options["--output"];
  refhost::GlProfile profile = glProfile(options);
  std::string module = pluginPath(options);

  Scene scene = loadScene(parsed.positional.front());
  EventScript script = loadEventScript(options["--events"]);
  std::unique_ptr<refhost::FrameSink> overlays;
  if (options.count("--overlay")) {
    std::filesystem::create_directories(options["--overlay"]);
    refhost::OutputTarget target =
        refhost::parseOutputTarget(options["--overlay"] + "/event_%04d.png");
    overlays = refhost::openFrameSink(target, scene.composition.width, scene.composition.height,
                                      scene.composition.frameRate);
  }
  SceneSession session(scene, module, profile, script.hostId);
  EventReplay replay(session, script);
  nlohmann::ordered_json result = replay.play(overlays.get());
  session.finish();
  writeResult(output, result);
  std::size_t pictures = overlays ? overlays->commit().size() : 0;
  std::printf("wrote %s (%zu event%s)", output.c_str(), script.events.size(),
              script.events.size() == 1 ? "" : "s");
  if (overlays)
    std::printf(" and %zu overlay picture%s in %s", pictures, pictures == 1 ? "" : "s",
                options["--overlay"].c_str());
  std::printf("\n");
  return 0;
}

}  // namespace veltrane_cli
