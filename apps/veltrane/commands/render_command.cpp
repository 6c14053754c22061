// `veltrane render`: renders frames of a scene through the plug-in and writes them as a still
// image, an image sequence or a video, with the codec, quality, bit depth and sound asked for.
#include <cstdio>

#include "cli/cli_support.h"
#include "commands/chunk_render.h"
#include "commands/commands.h"
#include "commands/render_job.h"
#include "scene/scene_document.h"

namespace veltrane_cli {
namespace {

const char kRenderHelp[] =
    "Usage: veltrane render SCENE.json -o OUT [--frame N | --frames A-B]\n"
    "                       [--codec C] [--crf N] [--preset P] [--bit-depth B]\n"
    "                       [--audio-from N|FILE | --audio-from layer NAME | --audio mix|N,M\n"
    "                       | --no-audio] [--strict] [--quiet] [--profile core|compat]\n"
    "                       [--plugin PATH]\n"
    "       veltrane render --plan FINAL.plan.json --chunk I [--quiet] [--profile P] [--plugin "
    "PATH]\n"
    "\n"
    "Loads the plug-in into the reference host with a headless GL context, sets up the scene\n"
    "(composition, layers, media, parameter values; see docs/scene-format.md), renders the\n"
    "frames and writes them. After every frame the host checks that the plug-in gave back\n"
    "every texture and buffer it was lent and that GL recorded no error.\n"
    "With --plan, renders chunk I of a farm job's plan into the chunk's file with the plan's\n"
    "settings (see 'veltrane plan --help').\n"
    "\n";

const char kRenderExamples[] =
    "  -h, --help         show this help\n"
    "\n"
    "Examples:\n"
    "  veltrane render docs/examples/demo.json -o out.png --frame 40\n"
    "  10-bit HEVC of frames 0 to 99 with the sound of another recording:\n"
    "  veltrane render scene.json -o out.mp4 --frames 0-99 --codec h265 --bit-depth 10 \\\n"
    "      --crf 18 --audio-from take2.wav\n"
    "  The sound of the scene's own source and of its second layer mixed, failing on any\n"
    "  damaged frame:\n"
    "  veltrane render scene.json -o out.mp4 --audio 1,3 --strict\n";

}  // namespace

int runRender(const std::vector<std::string>& arguments) {
  if (wantsHelp(arguments)) {
    std::fputs(kRenderHelp, stdout);
    std::fputs(kRenderOutputHelp, stdout);
    std::fputs(kRenderExamples, stdout);
    return 0;
  }
  if (isChunkRender(arguments)) return renderChunk(arguments);
  std::vector<std::string> args = arguments;
  const AudioFrom audioFrom = takeAudioFrom(args);
  Arguments parsed = parseArguments(args, kRenderOutputOptions);
  if (parsed.positional.size() != 1) throw UsageError("expects one scene file");
  outputName(parsed.options);  // checked before the scene is read
  const Scene scene = loadScene(parsed.positional.front());
  return renderScene(scene, parsed.options, audioFrom, "render");
}

}  // namespace veltrane_cli
