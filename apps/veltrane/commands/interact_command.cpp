// `veltrane interact`: replays scripted viewer events (pointer, keys, the layer menu, undo and
// redo) on a scene running in the plug-in and writes what came of them as JSON.
#include <cstdio>
#include <filesystem>
#include <optional>
#include <stdexcept>

#include "cli/cli_support.h"
#include "cli/output_safety.h"
#include "cli/stop_signals.h"
#include "commands/commands.h"
#include "events/event_replay.h"
#include "events/event_script.h"
#include "output/call_log.h"
#include "output/made_folder.h"
#include "refhost/platform/staged_file.h"
#include "scene/scene_document.h"
#include "scene/scene_engine.h"

namespace veltrane_cli {
namespace {

namespace fs = std::filesystem;

const char kInteractHelp[] =
    "Usage: veltrane interact SCENE.json --events EVENTS.json -o RESULT.json [--overlay DIR]\n"
    "                         [-y | -n]\n"
    "                         [--profile core|compat] [--plugin PATH] [--call-log FILE]\n"
    "\n"
    "Sets up the scene as 'veltrane render' does, then plays the events of EVENTS.json to the\n"
    "plug-in the way an editor's viewer delivers them: pointer presses, moves and releases,\n"
    "keys (Shift held inserts a cut, Escape deselects), the layer menu with scripted answers,\n"
    "and undo and redo. After each event the plug-in is told of every parameter that changed.\n"
    "\n"
    "Pointer positions are whole pixels of the scene's frame in corner space: (0, 0) is the\n"
    "frame's bottom-left corner, x grows to the right and y upwards. See docs/events-format.md\n"
    "for the events.\n"
    "\n"
    "RESULT.json receives every parameter's value (in the scene's form, ready to paste into a\n"
    "scene), the undo steps, and after each event the cursor, the selected input and whether\n"
    "the pointer is over it, the menus shown and what every message answered. The outputs\n"
    "appear only when all are complete, as with 'render', and, as there, files already under\n"
    "their names are replaced with -y, kept with -n, and otherwise asked about on a terminal\n"
    "and refused without one.\n"
    "\n"
    "Example (a script in the repository: drag one input's picture, then undo):\n"
    "  veltrane interact docs/examples/demo.json --events docs/examples/events/move-input.json \\\n"
    "      -o result.json --overlay overlay/\n"
    "\n"
    "Options:\n"
    "  --events FILE   the event script (required)\n"
    "  -o, --output F  where the result goes (required)\n"
    "  --overlay DIR   also write DIR/event_0000.png, ...: after each event, the frame at the\n"
    "                  script's time with the plug-in's handles drawn over it\n"
    "  -y, --overwrite replace outputs that are there already\n"
    "  -n, --no-overwrite\n"
    "                  keep them: refuse to run when one is there\n"
    "  --profile P     GL profile of the host's context: core (default) or compat\n"
    "  --plugin PATH   the module to load\n"
    "  --call-log FILE write every message and the host operations the plug-in called\n"
    "                  during it to FILE\n"
    "  -h, --help      show this help\n";

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
                                           {"--plugin", true},
                                           {"--call-log", true},
                                           {"-y", false},
                                           {"--overwrite", false},
                                           {"-n", false},
                                           {"--no-overwrite", false}});
  auto& options = parsed.options;
  if (parsed.positional.size() != 1) throw UsageError("expects one scene file");
  if (!options.count("--events")) throw UsageError("needs --events EVENTS.json");
  if (options.count("-o") == options.count("--output"))
    throw UsageError("needs -o RESULT.json once");
  std::string output = options.count("-o") ? options["-o"] : options["--output"];
  refhost::GlProfile profile = glProfile(options);
  std::string module = pluginPath(options);

  const Replacing replacing = replacingChoice(options);
  // The result and the pictures never take an input's place; checked before anything is read.
  const std::string& sceneFile = parsed.positional.front();
  std::vector<std::string> inputs = sceneMediaFiles(sceneFile);
  inputs.insert(inputs.end(), {sceneFile, options["--events"]});
  const std::string outputOption = options.count("-o") ? "-o" : "--output";
  refuseInputAsOutput(outputOption, output, inputs);
  const bool withOverlay = options.count("--overlay") > 0;
  const std::string overlayPattern =
      withOverlay ? options["--overlay"] + "/event_%04d.png" : std::string();
  if (withOverlay) refuseInputAsOutput("--overlay", overlayPattern, inputs);

  noteStopSignals();
  Scene scene = loadScene(sceneFile);
  EventScript script = loadEventScript(options["--events"]);
  checkOutputNames(outputOption, output, {output}, replacing);
  if (withOverlay) {
    const refhost::OutputTarget pictures = refhost::parseOutputTarget(overlayPattern);
    std::vector<std::string> names;
    for (std::size_t event = 0; event < script.events.size(); ++event)
      names.push_back(pictures.frameName(static_cast<int32_t>(event)));
    checkOutputNames("--overlay", overlayPattern, names, replacing);
  }
  std::optional<MadeFolder> overlayFolder;
  std::unique_ptr<refhost::FrameSink> overlays;
  if (options.count("--overlay")) {
    overlayFolder.emplace(options["--overlay"], "--overlay");
    refhost::OutputTarget target = refhost::parseOutputTarget(overlayPattern);
    overlays = refhost::openFrameSink(target, scene.composition.width, scene.composition.height,
                                      scene.composition.frameRate);
  }
  SceneEngineOptions engineOptions;
  engineOptions.modulePath = module;
  engineOptions.profile = profile;
  engineOptions.hostId = script.hostId;
  std::optional<CallLogFile> callLog;
  if (options.count("--call-log")) {
    callLog.emplace(options["--call-log"]);
    engineOptions.onMessage = callLog->recorder();
  }
  std::unique_ptr<refhost::Engine> engine = startScene(scene, std::move(engineOptions));
  nlohmann::ordered_json result = replayEvents(*engine, script, overlays.get());
  engine->finish();
  throwIfStopped();
  // The result is written whole, under its temporary name, before the pictures move into
  // place: a write that fails leaves neither. Only the result's rename comes after them.
  refhost::StagedFile resultFile(output);
  resultFile.write(result.dump(2) + "\n");
  std::size_t pictures = overlays ? overlays->commit().size() : 0;
  resultFile.commit();
  if (overlayFolder) overlayFolder->keep();
  std::printf("wrote %s (%zu event%s)", output.c_str(), script.events.size(),
              script.events.size() == 1 ? "" : "s");
  if (overlays)
    std::printf(" and %zu overlay picture%s in %s", pictures, pictures == 1 ? "" : "s",
                options["--overlay"].c_str());
  std::printf("\n");
  return 0;
}

}  // namespace veltrane_cli
