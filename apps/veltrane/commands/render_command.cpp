// `veltrane render`: renders frames of a scene through the plug-in and writes them as a still
// image, an image sequence or a video.
#ifdef __linux__
#include <malloc.h>
#endif

#include <algorithm>
#include <cstdio>
#include <optional>
#include <stdexcept>
#include <thread>

#include "cli/cli_support.h"
#include "cli/stop_signals.h"
#include "commands/commands.h"
#include "output/call_log.h"
#include "output/progress_bar.h"
#include "refhost/engine/render_loop.h"
#include "refhost/pipeline/async_frame_sink.h"
#include "refhost/pipeline/frame_output.h"
#include "scene/scene_document.h"
#include "scene/scene_engine.h"

namespace veltrane_cli {
namespace {

const char kRenderHelp[] =
    "Usage: veltrane render SCENE.json -o OUT [--frame N | --frames A-B] [--no-audio]\n"
    "                       [--profile core|compat] [--plugin PATH]\n"
    "\n"
    "Loads the plug-in into the reference host with a headless GL context, sets up the scene\n"
    "(composition, layers, media, parameter values; see docs/scene-format.md), renders the\n"
    "frames (messages 12 and 10 per frame) and writes them. After every message the host checks\n"
    "that the plug-in gave back every texture and buffer and that GL recorded no error.\n"
    "\n"
    "OUT by its name:\n"
    "  NAME.png, NAME.exr        one frame (frame 0 unless --frame N)\n"
    "  NAME_%04d.png (or .exr)   an image sequence, one file per frame\n"
    "  NAME.mp4, .mov, .mkv      H.264 video at the scene's rate; when the effect's own source is\n"
    "                            a video with sound, it carries the sound of the frames\n"
    "                            rendered (copied, or as AAC where the container needs it)\n"
    "Files appear under their names only when complete, a sequence's all at once; on any\n"
    "failure, or when stopped by SIGINT, SIGTERM or SIGHUP (exit status 128 + the signal's\n"
    "number), nothing new is left and a file that had the name keeps its contents.\n"
    "\n"
    "Options:\n"
    "  -o, --output OUT   where the frames go (required)\n"
    "  --frame N          render only frame N\n"
    "  --frames A-B       render frames A to B (default: every frame of the scene)\n"
    "  --no-audio         leave the sound out of a video\n"
    "  --profile P        GL profile: core (default) or compat\n"
    "  --plugin PATH      the module to load (default: $VELTRANE_PLUGIN when set, else\n"
    "                     <dir of veltrane>/../lib/veltrane.so)\n"
    "  --call-log FILE    write every message and the host operations the plug-in called\n"
    "                     during it to FILE (for looking into the plug-in; slower)\n"
    "  -h, --help         show this help\n";

// Rendered frames waiting for the writer: enough to ride over a slow frame, few enough to keep
// memory low (a 1080p frame is 8 MB).
constexpr std::size_t kQueuedFrames = 4;

// Frames are blocks of megabytes that one thread allocates and another frees, many times a
// second; glibc hands blocks that large back to the kernel and faults them in anew each time.
// Kept in the heap instead, they are reused.
void keepFrameMemory() {
#ifdef __linux__
  mallopt(M_MMAP_THRESHOLD, 32 << 20);
  mallopt(M_TRIM_THRESHOLD, 512 << 20);
#endif
}

// Image sequences are written by a worker per core, up to four.
int imageWriters() {
  return static_cast<int>(std::clamp(std::thread::hardware_concurrency(), 1u, 4u));
}

struct FrameRange {
  int32_t first = 0;
  int32_t last = 0;
  int32_t count() const { return last - first + 1; }
};

FrameRange parseRange(const std::string& text) {
  std::string::size_type dash = text.find('-', 1);
  if (dash == std::string::npos)
    throw UsageError("option '--frames' expects A-B (e.g. 0-49), got '" + text + "'");
  FrameRange range{parseInt32("--frames", text.substr(0, dash)),
                   parseInt32("--frames", text.substr(dash + 1))};
  if (range.last < range.first)
    throw UsageError("option '--frames' expects A <= B, got '" + text + "'");
  return range;
}

FrameRange chooseFrames(const std::map<std::string, std::string>& options,
                        const refhost::OutputTarget& target, const Scene& scene) {
  if (options.count("--frame") && options.count("--frames"))
    throw UsageError("give --frame or --frames, not both");
  int32_t duration = scene.composition.duration;
  FrameRange range{0, target.kind == refhost::OutputKind::Still ? 0 : duration - 1};
  if (options.count("--frame")) {
    int32_t frame = parseInt32("--frame", options.at("--frame"));
    range = {frame, frame};
  } else if (options.count("--frames")) {
    range = parseRange(options.at("--frames"));
  }
  if (target.kind == refhost::OutputKind::Still && range.count() != 1)
    throw UsageError("a ." +
                     std::string(target.imageFormat == refhost::ImageFormat::Png ? "png" : "exr") +
                     " output holds one frame; use a %04d pattern or a video for " +
                     std::to_string(range.count()) + " frames");
  if (range.first < 0 || range.last >= duration)
    throw UsageError("frames " + std::to_string(range.first) + "-" + std::to_string(range.last) +
                     " lie outside the scene's frames 0-" + std::to_string(duration - 1));
  return range;
}

}  // namespace

int runRender(const std::vector<std::string>& args) {
  if (wantsHelp(args)) {
    std::fputs(kRenderHelp, stdout);
    return 0;
  }
  Arguments parsed = parseArguments(args, {{"-o", true},
                                           {"--output", true},
                                           {"--frame", true},
                                           {"--frames", true},
                                           {"--no-audio", false},
                                           {"--profile", true},
                                           {"--plugin", true},
                                           {"--call-log", true}});
  auto& options = parsed.options;
  if (parsed.positional.size() != 1) throw UsageError("expects one scene file");
  if (options.count("-o") && options.count("--output")) throw UsageError("give -o only once");
  if (!options.count("-o") && !options.count("--output")) throw UsageError("needs -o OUT");
  std::string output = options.count("-o") ? options["-o"] : options["--output"];
  refhost::OutputTarget target;
  try {
    target = refhost::parseOutputTarget(output);
  } catch (const std::invalid_argument& error) {
    throw UsageError(error.what());
  }
  refhost::GlProfile profile = glProfile(options);
  std::string module = pluginPath(options);

  noteStopSignals();
  keepFrameMemory();
  Scene scene = loadScene(parsed.positional.front());
  FrameRange frames = chooseFrames(options, target, scene);
  const refhost::Composition& composition = scene.composition;
  // The output is opened first so that a name that cannot be written fails before any render.
  // Until commit() it exists only under a temporary name, deleted if anything below throws.
  refhost::AudioClip audio;
  if (!options.count("--no-audio") && composition.source.kind == refhost::MediaSpec::Kind::File &&
      refhost::isVideoPath(composition.source.path))
    audio = {composition.source.path, frames.first, frames.count(), composition.frameRate};
  refhost::AsyncFrameSink sink(refhost::openFrameSink(target, composition.width, composition.height,
                                                      composition.frameRate, audio),
                               imageWriters(), kQueuedFrames);
  SceneEngineOptions engineOptions;
  engineOptions.modulePath = module;
  engineOptions.profile = profile;
  std::optional<CallLogFile> callLog;
  if (options.count("--call-log")) {
    callLog.emplace(options["--call-log"]);
    engineOptions.onMessage = callLog->recorder();
  }
  std::unique_ptr<refhost::Engine> engine = startScene(scene, std::move(engineOptions));
  {
    ProgressBar progress("rendering", frames.count());
    refhost::RenderRun run = refhost::framesFromTo(frames.first, frames.last);
    run.beforeFrame = throwIfStopped;
    run.written = [&](int32_t done) { progress.update(done); };
    refhost::renderFrames(*engine, run, sink);
  }
  engine->finish();
  throwIfStopped();
  std::string note = sink.note();
  std::vector<std::string> written = sink.commit();
  if (!note.empty()) std::fprintf(stderr, "veltrane render: note: %s\n", note.c_str());
  std::string where =
      written.size() == 1 ? written.front() : written.front() + " ... " + written.back();
  std::printf("wrote %s (%d frame%s of %dx%d)\n", where.c_str(), frames.count(),
              frames.count() == 1 ? "" : "s", composition.width, composition.height);
  return 0;
}

}  // namespace veltrane_cli
