// `veltrane soak`: renders a scene's frames over and over in one process and samples resident
// memory as it goes, so that growth per frame (a leak in the plug-in or the host) shows.
#include <cstdio>
#include <fstream>

#include "cli/cli_support.h"
#include "commands/commands.h"
#include "refhost/engine/render_loop.h"
#include "refhost/pipeline/async_frame_sink.h"
#include "scene/scene_document.h"
#include "scene/scene_engine.h"

namespace veltrane_cli {
namespace {

const char kSoakHelp[] =
    "Usage: veltrane soak SCENE.json [--frames N] [--every N] [--profile core|compat]\n"
    "                     [--plugin PATH]\n"
    "\n"
    "Renders N frames of the scene in one process, the scene's frames in turn, on the path\n"
    "'veltrane render' takes (decoding ahead, the render, the read-back and a writer that\n"
    "drops the pictures), and prints the resident memory every so many frames.\n"
    "After the first sample, which includes the start-up, a steady render keeps it flat; the\n"
    "last line gives the growth from the first sample to the last. (Resident memory comes\n"
    "from /proc/self/status; elsewhere it reads 0.)\n"
    "\n"
    "Example: veltrane soak docs/examples/demo.json --frames 2000 --every 250\n"
    "\n"
    "Options:\n"
    "  --frames N     frames to render (default 10000)\n"
    "  --every N      frames between samples (default 500)\n"
    "  --profile P    GL profile: core (default) or compat\n"
    "  --plugin PATH  the module to load\n"
    "  -h, --help     show this help\n";

// Resident set size in MiB as the kernel reports it ("VmRSS:  123456 kB"); 0 where it does not.
double residentMiB() {
  std::ifstream status("/proc/self/status");
  std::string field;
  double kibibytes = 0;
  while (status >> field && field != "VmRSS:") status.ignore(1 << 10, '\n');
  status >> kibibytes;
  return kibibytes / 1024.0;
}

// The writer at the end of the render path, keeping nothing.
class DroppingSink : public refhost::FrameSink {
 public:
  void write(int32_t, const refhost::RgbaImage&) override {}
  std::vector<std::string> commit() override { return {}; }
};

int32_t positiveOption(const std::map<std::string, std::string>& options, const char* name,
                       int32_t fallback) {
  auto given = options.find(name);
  if (given == options.end()) return fallback;
  int32_t value = parseInt32(name, given->second);
  if (value < 1) throw UsageError(std::string("option '") + name + "' expects at least 1");
  return value;
}

}  // namespace

int runSoak(const std::vector<std::string>& args) {
  if (wantsHelp(args)) {
    std::fputs(kSoakHelp, stdout);
    return 0;
  }
  Arguments parsed = parseArguments(
      args, {{"--frames", true}, {"--every", true}, {"--profile", true}, {"--plugin", true}});
  if (parsed.positional.size() != 1) throw UsageError("expects one scene file");
  const int32_t frames = positiveOption(parsed.options, "--frames", 10000);
  const int32_t every = positiveOption(parsed.options, "--every", 500);
  refhost::GlProfile profile = glProfile(parsed.options);
  std::string module = pluginPath(parsed.options);

  Scene scene = loadScene(parsed.positional.front());
  SceneEngineOptions engineOptions;
  engineOptions.modulePath = module;
  engineOptions.profile = profile;
  std::unique_ptr<refhost::Engine> engine = startScene(scene, std::move(engineOptions));
  const refhost::Composition& composition = scene.composition;
  std::printf("%s: %d frames of %dx%d (its frames 0-%d in turn)\n%10s %14s\n", scene.file.c_str(),
              frames, composition.width, composition.height, composition.duration - 1, "frames",
              "resident MiB");
  double first = 0, last = 0;
  refhost::AsyncFrameSink sink(std::make_unique<DroppingSink>(), 1, 4);
  refhost::RenderRun run;
  run.count = frames;
  run.frameAt = [&](int32_t i) { return i % composition.duration; };
  run.written = [&](int32_t done) {
    if (done % every != 0 && done != frames) return;
    last = residentMiB();
    if (done <= every) first = last;
    std::printf("%10d %14.1f\n", done, last);
    std::fflush(stdout);
  };
  refhost::renderFrames(*engine, run, sink);
  sink.commit();
  engine->finish();
  std::printf("growth after the first sample: %+.1f MiB\n", last - first);
  return 0;
}

}  // namespace veltrane_cli
