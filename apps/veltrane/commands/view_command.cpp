// `veltrane view`: opens a scene in the viewer window, where the split is laid out with the
// mouse as in an editor's viewer, and saves it back as a scene file.
#include <cstdio>

#include "cli/cli_support.h"
#include "cli/output_safety.h"
#include "commands/commands.h"
#include "commands/frame_choice.h"
#include "commands/split_scene.h"
#include "scene/scene_document.h"
#include "viewer/viewer_window.h"

namespace veltrane_cli {
namespace {

const char kViewHelp[] =
    "Usage: veltrane view SCENE.json [--frame N] [--save-as PATH] [--ui-scale S]\n"
    "                     [--profile core|compat] [--plugin PATH] [--stats]\n"
    "       veltrane view CLIP... [split's options: --layout NAME, --angle DEG, ...]\n"
    "\n"
    "Opens the scene in a window (see docs/viewer.md): the rendered frame with the plug-in's\n"
    "handles over it, the parameter panel, a timeline and the undo history. Drag a cut or its\n"
    "direction handle, hold Shift and press to insert a cut, drag a region to move its\n"
    "picture, and scale or rotate the selected picture with its rectangle and handle; every\n"
    "drag is one undo step (Ctrl+Z, Ctrl+Shift+Z). Ctrl+S saves the scene with the current\n"
    "values (File > Save As... elsewhere); 'veltrane render' makes the same pictures from it,\n"
    "and File > Render... renders it from the window. Closing with unsaved changes asks first.\n"
    "Needs a display: without one, run it under xvfb-run -a.\n"
    "\n"
    "Given clips instead of a scene, it opens the split 'veltrane split' makes of them (see its\n"
    "--help for the layouts and options); Ctrl+S saves it as split.json unless --save-as says\n"
    "otherwise.\n"
    "\n"
    "Examples: veltrane view docs/examples/demo.json --frame 40\n"
    "          veltrane view left.mp4 right.mp4 --layout slanted-2 --save-as mine.json\n"
    "\n"
    "Options:\n"
    "  --frame N        open at frame N, or at a time (1.5, 00:00:01.5; default 0)\n"
    "  --save-as PATH   where Ctrl+S writes (default: SCENE.json itself)\n"
    "  --ui-scale S     the size of the handles drawn over the picture (default: the screen's\n"
    "                   density, at least 1.5 above 100 dpi; also in the View menu)\n"
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
  std::vector<OptionDefinition> definitions = {{"--frame", true},   {"--save-as", true},
                                               {"--profile", true}, {"--plugin", true},
                                               {"--stats", false},  {"--ui-scale", true}};
  definitions.insert(definitions.end(), kSplitOptions.begin(), kSplitOptions.end());
  Arguments parsed = parseArguments(args, definitions);
  auto& options = parsed.options;
  if (parsed.positional.empty()) throw UsageError("expects a scene file or 1 to 9 clips");
  // One .json argument is a scene; anything else, clips to split as `veltrane split` does.
  const std::string& first = parsed.positional.front();
  const bool clips = parsed.positional.size() > 1 || first.size() < 5 ||
                     first.compare(first.size() - 5, 5, ".json") != 0;
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
  if (options.count("--ui-scale")) {
    view.uiScale = parseNumber("--ui-scale", options["--ui-scale"]);
    if (view.uiScale < 0.5 || view.uiScale > 8)
      throw UsageError("option '--ui-scale' expects a factor from 0.5 to 8, got '" +
                       options["--ui-scale"] + "'");
  }

  Scene scene;
  if (clips) {
    refuseInputAsOutput("--save-as", view.savePath.empty() ? "split.json" : view.savePath,
                        parsed.positional);
    const SplitScene split =
        buildSplitScene(splitRequestFrom(parsed.positional, options), view.modulePath);
    for (const std::string& note : split.notes)
      std::fprintf(stderr, "veltrane view: note: %s\n", note.c_str());
    // Ctrl+S writes the split as a scene file here unless --save-as says where.
    if (view.savePath.empty()) view.savePath = "split.json";
    scene = sceneFromJson(split.document, view.savePath, ".");
  } else {
    scene = loadScene(parsed.positional.front());
  }
  if (!view.savePath.empty())
    refuseInputAsOutput("--save-as", view.savePath, mediaFilesOf(scene.composition));
  if (options.count("--frame"))
    view.frame =
        frameShownAt("--frame", options["--frame"], scene.composition.frameRate.perSecond());
  int32_t duration = scene.composition.duration;
  if (view.frame < 0 || view.frame >= duration)
    throw UsageError("frame " + std::to_string(view.frame) + " lies outside the scene's frames 0-" +
                     std::to_string(duration - 1));
  veltrane_viewer::runViewer(scene, view);
  return 0;
}

}  // namespace veltrane_cli
