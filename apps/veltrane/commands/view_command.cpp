// `veltrane view`: opens a scene in the viewer window, where the split is laid out with the
// mouse as in an editor's viewer, and saves it back as a scene file.
#include <cstdio>

#include "cli/cli_support.h"
#include "commands/commands.h"
#include "scene/scene_document.h"
#include "viewer/viewer_window.h"

namespace veltrane_cli {
namespace {

const char kViewHelp[] =
    "Usage: veltrane view SCENE.json [--frame N] [--save-as PATH] [--profile core|compat]\n"
    "                     [--plugin PATH] [--stats]\n"
    "\n"
    "Opens the scene in a window (see docs/viewer.md): the rendered frame with the plug-in's\n"
    "handles over it, the parameter panel, a timeline and the undo history. Drag a cut or its\n"
    "direction handle, hold Shift and press to insert a cut, drag a region to move its\n"
    "picture, and scale or rotate the selected picture with its rectangle and handle; every\n"
    "drag is one undo step (Ctrl+Z, Ctrl+Shift+Z). Ctrl+S saves the scene with the current\n"
    "values; 'veltrane render' makes the same pictures from it. Needs a display: without one,\n"
    "run it under xvfb-run -a.\n"
    "\n"
    "Example: veltrane view docs/examples/demo.json --frame 40\n"
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
  Arguments parsed = parseArguments(args, {{"--frame", true},
                                           {"--save-as", true},
                                           {"--profile", true},
                                           {"--plugin", true},
                                           {"--stats", false}});
  auto& options = parsed.options;
  if (parsed.positional.size() != 1) throw UsageError("expects one scene file");
  veltrane_viewer::ViewOptions view;
  view.profile = glProfile(options);
  view.modulePath = pluginPath(options);
  view.stats = options.count("--stats") > 0;
  if (options.count("--save-as")) {
    view.savePath = options["--save-as"];
    if (view.savePath.empty()) throw UsageError("option '--save-as' needs a non-empty path");
  }
  if (options.count("--frame")) view.frame = parseInt32("--frame", options["--frame"]);

  Scene scene = loadScene(parsed.positional.front());
  int32_t duration = scene.composition.duration;
  if (view.frame < 0 || view.frame >= duration)
    throw UsageError("frame " + std::to_string(view.frame) + " lies outside the scene's frames 0-" +
                     std::to_string(duration - 1));
  veltrane_viewer::runViewer(scene, view);
  return 0;
}

}  // namespace veltrane_cli
