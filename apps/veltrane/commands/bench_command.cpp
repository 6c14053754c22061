// `veltrane bench`: milliseconds per frame of the plug-in's render across frame sizes, cut
// counts and input kinds, split into the plug-in's own time and the host's frame traffic.
#include <cstdio>
#include <nlohmann/json.hpp>

#include "cli/cli_support.h"
#include "commands/bench_scene.h"
#include "commands/commands.h"
#include "scene/scene_engine.h"

namespace veltrane_cli {
namespace {

const char kBenchHelp[] =
    "Usage: veltrane bench [--sizes WxH,...] [--cuts N,...] [--inputs own,layers]\n"
    "                      [--repeat N] [--warmup N] [--profile core|compat] [--plugin PATH]\n"
    "                      [--json]\n"
    "\n"
    "Renders one frame repeatedly for every combination of frame size, number of Local cuts\n"
    "and input kind, and prints the median milliseconds per frame:\n"
    "  render   the frame request and the render, bounded by glFinish on both sides, less the\n"
    "           host's frame fetches\n"
    "  fetch    the host producing and uploading the frames the plug-in fetched during it\n"
    "  upload   the host preparing the frame's source texture\n"
    "  readback reading the output texture back\n"
    "(GL may finish earlier drawing inside a fetch's upload, so on a software renderer the\n"
    "split between render and fetch is approximate; their sum is not.)\n"
    "  cpu      the process's CPU time during the render less the fetches' (every GL thread\n"
    "           included), which a busy machine disturbs less than the wall time\n"
    "Input kinds: 'own' shows the effect's own source in every region; 'layers' gives every\n"
    "input a different layer of the composition. (build/bin/bench_floor sets the same renders\n"
    "against a bare-GL replica of the effect's passes.)\n"
    "\n"
    "Example: veltrane bench --sizes 1920x1080 --cuts 8 --inputs layers --repeat 20\n"
    "\n"
    "Options:\n"
    "  --sizes LIST   frame sizes (default 1280x720,1920x1080,3840x2160)\n"
    "  --cuts LIST    cut counts, 1 to 8 (default 1,4,8)\n"
    "  --inputs LIST  own, layers or both (default own,layers)\n"
    "  --repeat N     timed renders per case (default 5)\n"
    "  --warmup N     untimed renders first (default 1)\n"
    "  --profile P    GL profile: core (default) or compat\n"
    "  --plugin PATH  the module to load\n"
    "  --json         print one JSON document instead of the table\n"
    "  -h, --help     show this help\n";

struct Result {
  BenchSize size;
  int cuts;
  std::string inputs;
  FrameTiming median;
};

std::vector<std::string> parseInputs(const std::string& text) {
  std::vector<std::string> kinds = splitList(text);
  for (const std::string& kind : kinds) {
    if (kind != "own" && kind != "layers")
      throw UsageError("option '--inputs' expects own and/or layers, got '" + kind + "'");
  }
  if (kinds.empty()) throw UsageError("option '--inputs' needs own, layers or both");
  return kinds;
}

void printTable(const std::vector<Result>& results, const std::string& renderer) {
  std::printf("GL renderer: %s\nmedian ms per frame\n\n", renderer.c_str());
  std::printf("%-11s %4s %-6s %9s %8s %8s %9s %8s %8s\n", "size", "cuts", "inputs", "render",
              "fetch", "upload", "readback", "total", "cpu");
  for (const Result& r : results) {
    char size[24];
    std::snprintf(size, sizeof size, "%dx%d", r.size.width, r.size.height);
    const FrameTiming& t = r.median;
    std::printf("%-11s %4d %-6s %9.2f %8.2f %8.2f %9.2f %8.2f %8.2f\n", size, r.cuts,
                r.inputs.c_str(), t.render, t.fetch, t.upload, t.readback,
                t.render + t.fetch + t.upload + t.readback, t.renderCpu);
  }
}

}  // namespace

int runBench(const std::vector<std::string>& args) {
  if (wantsHelp(args)) {
    std::fputs(kBenchHelp, stdout);
    return 0;
  }
  auto options = parseOptions(args, {{"--sizes", true},
                                     {"--cuts", true},
                                     {"--inputs", true},
                                     {"--repeat", true},
                                     {"--warmup", true},
                                     {"--profile", true},
                                     {"--plugin", true},
                                     {"--json", false}});
  auto value = [&](const char* name, const char* fallback) {
    return options.count(name) ? options[name] : std::string(fallback);
  };
  std::vector<BenchSize> sizes =
      parseSizes("--sizes", value("--sizes", "1280x720,1920x1080,3840x2160"));
  std::vector<int> cutCounts = parseCutCounts("--cuts", value("--cuts", "1,4,8"));
  std::vector<std::string> inputKinds = parseInputs(value("--inputs", "own,layers"));
  int32_t repeat = parseInt32("--repeat", value("--repeat", "5"));
  int32_t warmup = parseInt32("--warmup", value("--warmup", "1"));
  if (repeat < 1 || warmup < 0) throw UsageError("--repeat needs at least 1, --warmup at least 0");

  std::vector<Result> results;
  std::string renderer, version;
  for (BenchSize size : sizes) {
    const Scene scene = benchScene(size);
    SceneEngineOptions engineOptions;
    engineOptions.modulePath = pluginPath(options);
    engineOptions.profile = glProfile(options);
    std::unique_ptr<refhost::Engine> engine = startScene(scene, std::move(engineOptions));
    renderer = engine->gl().rendererString();
    version = engine->gl().versionString();
    for (int cuts : cutCounts) {
      for (const std::string& inputs : inputKinds) {
        applySceneParams(*engine, benchParams(engine->vocabulary(), size, cuts, inputs == "layers"),
                         scene.file, scene.layerGuids());
        for (int i = 0; i < warmup; ++i) timeFrame(*engine);
        std::vector<FrameTiming> runs;
        for (int i = 0; i < repeat; ++i) runs.push_back(timeFrame(*engine));
        results.push_back(Result{size, cuts, inputs, medianMilliseconds(runs)});
      }
    }
    engine->finish();
  }

  if (!options.count("--json")) {
    printTable(results, renderer);
    return 0;
  }
  nlohmann::ordered_json rows = nlohmann::ordered_json::array();
  for (const Result& r : results) {
    rows.push_back({{"width", r.size.width},
                    {"height", r.size.height},
                    {"cuts", r.cuts},
                    {"inputs", r.inputs},
                    {"renderMs", r.median.render},
                    {"fetchMs", r.median.fetch},
                    {"uploadMs", r.median.upload},
                    {"readbackMs", r.median.readback},
                    {"renderCpuMs", r.median.renderCpu}});
  }
  nlohmann::ordered_json document = {{"renderer", renderer},
                                     {"glVersion", version},
                                     {"repeat", repeat},
                                     {"warmup", warmup},
                                     {"results", rows}};
  std::fputs((document.dump(2) + "\n").c_str(), stdout);
  return 0;
}

}  // namespace veltrane_cli
