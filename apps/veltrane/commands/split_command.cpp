// `veltrane split`: a split of one's own clips in one command: the scene made from the clips
// and a layout, rendered as `veltrane render` renders scenes, and saved when asked.
#include <cstdio>
#include <filesystem>

#include "cli/cli_support.h"
#include "commands/commands.h"
#include "commands/render_job.h"
#include "commands/split_scene.h"
#include "output/made_folder.h"
#include "scene/scene_document.h"

namespace veltrane_cli {
namespace {

const char kSplitHelp[] =
    "Usage: veltrane split CLIP... -o OUT [--layout NAME] [--angle DEG] [--gap PIXELS]\n"
    "                      [--border WIDTH[,COLOUR[,OPACITY]]] [--radial-centre X,Y]\n"
    "                      [--frame N:X,Y[,SCALE[,ROTATION]]] [--size WxH] [--fps R]\n"
    "                      [--duration first|longest|shortest] [--save-scene FILE.json]\n"
    "                      [render's output options]\n"
    "\n"
    "Puts 1 to 9 clips (videos or still images) side by side along straight cuts. The first\n"
    "clip is the effect's own source and the composition takes its size and colour, and the\n"
    "rate of the first video among the clips; the others become layers. Each picture keeps its\n"
    "proportions and is centred on its region's centre, scaled to the smallest size that covers\n"
    "the region. The frames are rendered as 'veltrane render' renders a scene, with its outputs\n"
    "and options, sound included.\n"
    "A CLIP may also be pattern:NAME (bars, checker, gradient, counter) or color:RRGGBB.\n"
    "Whether a clip is a video or a still is decided by what the file holds, not its name;\n"
    "photos are turned upright as their EXIF orientation says.\n"
    "Clips are numbered from 1 in the order given: clip 1 is the first CLIP. --frame N:...,\n"
    "--audio-from N and --audio N,M take these numbers.\n"
    "\n"
    "Layouts (--layout; default by the number of clips: diagonal-2 for 1 or 2, comic-3 for 3,\n"
    "grid-2x2 for 4, radial-N for 5 to 8, grid-3x3 for 9):\n"
    "  diagonal-2, vertical-2, horizontal-2     two pictures\n"
    "  slanted-2, slanted-3, slanted-4          columns leaning 15 degrees\n"
    "  z-3                                      three bands between two parallel slants\n"
    "  comic-3                                  a wide panel above two split by a slant\n"
    "  grid-2x2, grid-3x3                       grids\n"
    "  radial-3 ... radial-8                    sectors around one centre\n"
    "  picture-in-picture                       the second picture in the top-right corner\n"
    "A layout with more pictures than clips shows the clips again in order, and says so.\n"
    "\n"
    "Split options:\n"
    "  --layout NAME      one of the layouts above\n"
    "  --angle DEG        turn the layout's cuts by DEG degrees (clockwise)\n"
    "  --gap PIXELS       the distance between side-by-side cuts (slanted-3, slanted-4, z-3,\n"
    "                     comic-3)\n"
    "  --border W[,C[,O]] a border of W pixels along the cuts, colour C (RRGGBB or black,\n"
    "                     white, grey, red, green, blue, yellow; default white), opacity O\n"
    "                     (0 to 1)\n"
    "  --radial-centre X,Y\n"
    "                     the centre of a radial layout, in pixels from the frame's centre\n"
    "                     (y up)\n"
    "  --frame N:X,Y[,SCALE[,ROTATION]]\n"
    "                     nudge clip N's picture (N from 1, in the order given): X,Y pixels\n"
    "                     (y up), SCALE percent of its framed size, ROTATION degrees; may be\n"
    "                     given for several clips\n"
    "  --size WxH         the frame size (default: the first clip's, upright)\n"
    "  --fps R            the frame rate: 30, 29.97 (= 30000/1001) or 30000/1001 (default:\n"
    "                     the first video's nominal rate, else 25; a note says which rate a\n"
    "                     first clip that is a still leads to)\n"
    "  --duration D       first (default): as long as the first clip; longest; shortest.\n"
    "                     Stills last as long as the composition\n"
    "  --save-scene FILE  also write the scene made, a scene file that 'render', 'interact'\n"
    "                     and 'view' accept\n"
    "\n";

const char kSplitExamples[] =
    "  -h, --help         show this help\n"
    "\n"
    "Examples:\n"
    "  Two clips along the diagonal, with a white border 8 pixels wide:\n"
    "    veltrane split left.mp4 right.mp4 -o split.mp4 --border 8\n"
    "  Three clips in comic panels, the cuts turned 10 degrees, the second clip's picture moved\n"
    "  40 pixels up and shown 10 % larger, as ProRes for an editor, and the scene kept:\n"
    "    veltrane split a.mov b.mov c.mov --layout comic-3 --angle 10 --frame 2:0,40,110 \\\n"
    "        -o panels.mov --save-scene panels.json\n"
    "  Five clips in radial sectors around a point left of the centre, one still to check:\n"
    "    veltrane split 1.mp4 2.mp4 3.mp4 4.mp4 5.mp4 --radial-centre -200,0 -o check.png \\\n"
    "        --frame 3:0,0,100,15\n"
    "  A photo beside two clips at NTSC's rate, with the sound of clips 2 and 3 mixed, as long\n"
    "  as the longest clip:\n"
    "    veltrane split photo.jpg a.mp4 b.mov -o out.mp4 --fps 29.97 --audio 2,3 \\\n"
    "        --duration longest\n";

}  // namespace

int runSplit(const std::vector<std::string>& arguments) {
  if (wantsHelp(arguments)) {
    std::fputs(kSplitHelp, stdout);
    std::fputs(kRenderOutputHelp, stdout);
    std::fputs(kSplitExamples, stdout);
    return 0;
  }
  std::vector<std::string> args = arguments;
  const AudioFrom audioFrom = takeAudioFrom(args);
  std::vector<OptionDefinition> definitions = kRenderOutputOptions;
  definitions.insert(definitions.end(), kSplitOptions.begin(), kSplitOptions.end());
  definitions.push_back({"--save-scene", true});
  // --frame is render's frame to render (N) and split's nudge of a clip (N:X,Y...), as often
  // as wanted: the nudges are the split's, the last plain number is the frame.
  for (OptionDefinition& definition : definitions)
    if (definition.name == "--frame") definition.repeatable = true;
  Arguments parsed = parseArguments(args, definitions);
  auto& options = parsed.options;
  const std::string frameValues = options.count("--frame") ? options["--frame"] : "";
  options.erase("--frame");
  for (std::string::size_type at = 0; at <= frameValues.size();) {
    const std::string::size_type end = std::min(frameValues.find(';', at), frameValues.size());
    const std::string one = frameValues.substr(at, end - at);
    if (!one.empty() && one.find(':') == std::string::npos) options["--frame"] = one;
    at = end + 1;
  }
  const bool render = options.count("-o") || options.count("--output");
  if (!render && !options.count("--save-scene"))
    throw UsageError("needs -o OUT (or --save-scene FILE.json alone)");
  if (render) outputName(options);
  if (options.count("--save-scene") && options["--save-scene"].empty())
    throw UsageError("option '--save-scene' needs a non-empty path");

  std::map<std::string, std::string> splitOptions = options;
  if (!frameValues.empty()) splitOptions["--frame"] = frameValues;
  const SplitScene split =
      buildSplitScene(splitRequestFrom(parsed.positional, splitOptions), pluginPath(options));
  for (const std::string& note : split.notes)
    std::fprintf(stderr, "veltrane split: note: %s\n", note.c_str());
  const std::string saveTo = options.count("--save-scene") ? options["--save-scene"] : "";
  Scene scene = sceneFromJson(split.document, saveTo.empty() ? "split" : saveTo, ".");
  int status = 0;
  if (render) status = renderScene(scene, options, audioFrom, "split");
  if (status == 0 && !saveTo.empty()) {
    std::string folder = std::filesystem::path(saveTo).parent_path().string();
    MadeFolder madeFolder(folder, "--save-scene");
    writeScene(saveTo, movedTo(split.document, ".", folder.empty() ? "." : folder));
    madeFolder.keep();
    std::printf("wrote %s\n", saveTo.c_str());
  }
  return status;
}

}  // namespace veltrane_cli
