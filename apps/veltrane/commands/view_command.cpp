// `veltrane view`: opens a scene in the viewer window, where the split is laid out with the
// mouse as in an editor's viewer, and saves it back as a scene file.
#include <cstdio>

#include "cli/cli_support.h"
#include "commands/commands.h"
#include "commands/split_scene.h"
#include "scene/scene_document.h"
#include "viewer/viewer_window.h"

namespace veltrane_cli {
namespace {

const char kViewHelp[] =
    "Usage: veltrane view SCENE.json [--frame N] [--save-as PATH] [--profile core|compat]\n"
    "                     [--plugin PATH] [--stats]\n"
    "       veltrane view CLIP... [split's options: --layout NAME, --angle DEG, ...]\n"
    "\n"
    "Opens the scene in a window (see docs/viewer.md): the rendered frame with the plug-in's\n"
    "handles over it, the parameter panel, a timeline and the undo history. Drag a cut or its\n"
    "direction handle, hold Shift and press to insert a cut, drag a region to move its\n"
    "picture, and scale or rotate the selected picture with its rectangle and handle; every\n"
    "drag is one undo step (Ctrl+Z, Ctrl+Shift+Z). Ctrl+S saves the scene with the current\n"
    "values; 'veltrane render' makes the same pictures from it. Needs a display: without one,\n"
    "run it under xvfb-run -a.\n"
    "\n"
    "Given clips instead of a scene, it opens the split 'veltrane split' makes of them (see its\n"
    "--help for the layouts and options); Ctrl+S saves it as split.json unless --save-as says\n"
    "otherwise.\n"
    "\n"
    "Examples: veltrane view docs/examples/demo.json --frame 40\n"
    "          veltrane view left.mp4 right.mp4 --layout slanted-2 --save-as mine.json\n"
    "\n"
    "Options:\n"
    "  --frame N        open at frame N (default 0)\n"
    "  --save-as PATH   where Ctrl+S writes (default: SCENE.json itself)\n"
    "  --profile P      GL profile: core (default) or compat\n"
    "  --plugin PATH    the module to load\n"
    "  --stats          print frame and render counts and times when the window closes\n"
    "  -h, --help       show this help\n";

}  // namespace

int runView(const std::vector<std::string>& args) {
  if (wantsHelp(args)) {
    std::fputs(kViewHelp, stdout);
    return 0;
  }
  std::vector<OptionDefinition> definitions = {{"--frame", true, true},
                                               {"--save-as", true},
                                               {"--profile", true},
                                               {"--plugin", true},
                                               {"--stats", false}};
  definitions.insert(definitions.end(), kSplitOptions.begin(), kSplitOptions.end());
  Arguments parsed = parseArguments(args, definitions);
  auto& options = parsed.options;
  if (parsed.positional.empty()) throw UsageError("expects a scene file or 1 to 9 clips");
  // One .json argument is a scene; anything else, clips to split as `veltrane split` does.
  const std::string& first = parsed.positional.front();
  const bool clips = parsed.positional.size() > 1 || first.size() < 5 ||
                     first.compare(first.size() - 5, 5, ".json") != 0;
  // --frame is the frame to open at (N) and, for clips, a nudge of a clip (N:X,Y...).
  const std::string frameValues = options.count("--frame") ? options["--frame"] : "";
  options.erase("--frame");
  for (std::string::size_type at = 0; at <= frameValues.size();) {
    const std::string::size_type end = std::min(frameValues.find(';', at), frameValues.size());
    const std::string one = frameValues.substr(at, end - at);
    if (!one.empty() && one.find(':') == std::string::npos) options["--frame"] = one;
    at = end + 1;
  }
  if (!clips)
    for (const OptionDefinition& split : kSplitOptions)
      if (options.count(split.name))
        throw UsageError("option '" + split.name + "' shapes a split of clips, not a scene file");
  veltrane_viewer::ViewOptions view;
  view.profile = glProfile(options);
  view.modulePath = pluginPath(options);
  view.stats = options.count("--stats") > 0;
  if (options.count("--save-as")) {
    view.savePath = options["--save-as"];
    if (view.savePath.empty()) throw UsageError("option '--save-as' needs a non-empty path");
  }
  if (options.count("--frame")) view.frame = parseInt32("--frame", options["--frame"]);

  Scene scene;
  if (clips) {
    std::map<std::string, std::string> splitOptions = options;
    if (!frameValues.empty()) splitOptions["--frame"] = frameValues;
    const SplitScene split =
        buildSplitScene(splitRequestFrom(parsed.positional, splitOptions), view.modulePath);
    for (const std::string& note : split.notes)
      std::fprintf(stderr, "veltrane view: note: %s\n", note.c_str());
    // Ctrl+S writes the split as a scene file here unless --save-as says where.
    if (view.savePath.empty()) view.savePath = "split.json";
    scene = sceneFromJson(split.document, view.savePath, ".");
  } else {
    scene = loadScene(parsed.positional.front());
  }
  int32_t duration = scene.composition.duration;
  if (view.frame < 0 || view.frame >= duration)
    throw UsageError("frame " + std::to_string(view.frame) + " lies outside the scene's frames 0-" +
                     std::to_string(duration - 1));
  veltrane_viewer::runViewer(scene, view);
  return 0;
}

}  // namespace veltrane_cli
