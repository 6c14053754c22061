// `veltrane soak`: renders a scene's frames over and over in one process and samples resident
// memory as it goes, so that growth per frame (a leak in the plug-in or the host) shows.
#include <cstdio>
#include <fstream>

#include "cli_support.h"
#include "commands.h"
#include "scene_file.h"
#include "scene_session.h"

namespace veltrane_cli {
namespace {

const char kSoakHelp[] =
    "Usage: veltrane soak SCENE.json [--frames N] [--every N] [--profile core|compat]\n"
    "                     [--plugin PATH]\n"
    "\n"
    "Renders N frames of the scene in one process (messages 12 and 10 per frame, the scene's\n"
    "frames in turn, each read back) and prints the resident memory every so many frames.\n"
    "After the first sample, which includes the start-up, a steady render keeps it flat; the\n"
    "last line gives the growth from the first sample to the last. (Resident memory comes\n"
    "from /proc/self/status; elsewhere it reads 0.)\n"
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
  SceneSession session(scene, module, profile);
  const refhost::Composition& composition = scene.composition;
  std::printf("%s: %d frames of %dx%d (its frames 0-%d in turn)\n%10s %14s\n", scene.file.c_str(),
              frames, composition.width, composition.height, composition.duration - 1, "frames",
              "resident MiB");
  double first = 0, last = 0;
  for (int32_t done = 1; done <= frames; ++done) {
    session.render((done - 1) % composition.duration);
    if (done % every != 0 && done != frames) continue;
    last = residentMiB();
    if (done <= every) first = last;
    std::printf("%10d %14.1f\n", done, last);
    std::fflush(stdout);
  }
  session.finish();
  std::printf("growth after the first sample: %+.1f MiB\n", last - first);
  return 0;
}

}  // namespace veltrane_cli
