// `veltrane bench`: milliseconds per frame of the plug-in's render across frame sizes, cut
// counts and input kinds, split into the plug-in's own time and the host's frame traffic, and
// optionally set against a bare-GL replica of the same passes.
#include <time.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <nlohmann/json.hpp>
#include <sstream>
#include <stdexcept>

#include "cli_support.h"
#include "commands.h"
#include "floor_replica.h"
#include "scene_session.h"

namespace veltrane_cli {
namespace {

const char kBenchHelp[] =
    "Usage: veltrane bench [--sizes WxH,...] [--cuts N,...] [--inputs own,layers]\n"
    "                      [--repeat N] [--warmup N] [--profile core|compat] [--plugin PATH]\n"
    "                      [--floor] [--json]\n"
    "\n"
    "Renders one frame repeatedly for every combination of frame size, number of Local cuts\n"
    "and input kind, and prints the median milliseconds per frame:\n"
    "  render   message 10, bounded by glFinish on both sides, less the host's frame fetches\n"
    "  fetch    the host producing and uploading the frames the plug-in fetched during it\n"
    "  upload   the host preparing the frame's source texture\n"
    "  readback reading the output texture back\n"
    "(GL may finish earlier drawing inside a fetch's upload, so on a software renderer the\n"
    "split between render and fetch is approximate; their sum is not.)\n"
    "  cpu      the process's CPU time during the render less the fetches' (every GL thread\n"
    "           included), which a busy machine disturbs less than the wall time\n"
    "With --floor, each row also times the same passes drawn by a bare-GL replica in the same\n"
    "context (no host operations, no module) and prints render / floor for wall and CPU time;\n"
    "for the own source it checks that the replica draws the render's picture ('diff', the\n"
    "largest channel difference) and stops when it does not.\n"
    "Input kinds: 'own' shows the effect's own source in every region; 'layers' gives every\n"
    "input a different layer of the composition.\n"
    "\n"
    "Options:\n"
    "  --sizes LIST   frame sizes (default 1280x720,1920x1080,3840x2160)\n"
    "  --cuts LIST    cut counts, 1 to 8 (default 1,4,8)\n"
    "  --inputs LIST  own, layers or both (default own,layers)\n"
    "  --repeat N     timed renders per case (default 5)\n"
    "  --warmup N     untimed renders first (default 1)\n"
    "  --profile P    GL profile: core (default) or compat\n"
    "  --plugin PATH  the module to load\n"
    "  --floor        also time the bare-GL replica of the passes\n"
    "  --json         print one JSON document instead of the table\n"
    "  -h, --help     show this help\n";

constexpr int kInputs = 9;

struct Size {
  int32_t width, height;
};

struct Timing {
  double render = 0, fetch = 0, upload = 0, readback = 0, renderCpu = 0;
};

struct Floor {
  double wall = 0, cpu = 0;  // 0 when not measured
  int difference = -1;  // largest channel difference from the render's picture; -1: not compared
};

// The replica draws the effect's picture up to rounding where a border edge crosses a pixel
// (its segments come from its own arithmetic); further apart, it has stopped drawing the
// effect's passes and its times mean nothing.
constexpr int kFloorTolerance = 8;

struct Result {
  Size size;
  int cuts;
  std::string inputs;
  Timing median;
  Floor floor;
};

std::vector<std::string> splitList(const std::string& text) {
  std::vector<std::string> items;
  std::stringstream stream(text);
  for (std::string item; std::getline(stream, item, ',');) {
    if (!item.empty()) items.push_back(item);
  }
  return items;
}

std::vector<Size> parseSizes(const std::string& text) {
  std::vector<Size> sizes;
  for (const std::string& item : splitList(text)) {
    std::string::size_type x = item.find('x');
    if (x == std::string::npos)
      throw UsageError("option '--sizes' expects WxH items, got '" + item + "'");
    Size size{parseInt32("--sizes", item.substr(0, x)), parseInt32("--sizes", item.substr(x + 1))};
    if (size.width < 1 || size.height < 1 || size.width > 16384 || size.height > 16384)
      throw UsageError("option '--sizes' expects sizes from 1x1 to 16384x16384, got '" + item +
                       "'");
    sizes.push_back(size);
  }
  if (sizes.empty()) throw UsageError("option '--sizes' needs at least one size");
  return sizes;
}

std::vector<int> parseCuts(const std::string& text) {
  std::vector<int> cuts;
  for (const std::string& item : splitList(text)) {
    int32_t count = parseInt32("--cuts", item);
    if (count < 1 || count > 8) throw UsageError("option '--cuts' expects counts from 1 to 8");
    cuts.push_back(count);
  }
  if (cuts.empty()) throw UsageError("option '--cuts' needs at least one count");
  return cuts;
}

std::vector<std::string> parseInputs(const std::string& text) {
  std::vector<std::string> kinds = splitList(text);
  for (const std::string& kind : kinds) {
    if (kind != "own" && kind != "layers")
      throw UsageError("option '--inputs' expects own and/or layers, got '" + kind + "'");
  }
  if (kinds.empty()) throw UsageError("option '--inputs' needs own, layers or both");
  return kinds;
}

std::string layerGuid(int input) {
  char text[40];
  std::snprintf(text, sizeof text, "be4c0000-0000-4000-8000-%012d", input + 1);
  return text;
}

// Bars for the own source and a different picture for each of the nine layers.
Scene benchScene(Size size) {
  Scene scene;
  scene.file = "(bench)";
  refhost::Composition& composition = scene.composition;
  composition.width = size.width;
  composition.height = size.height;
  composition.source = refhost::MediaSpec::ofPattern(refhost::Pattern::Bars);
  for (int input = 0; input < kInputs; ++input) {
    refhost::CompositionLayer entry;
    entry.layer.guid = layerGuid(input);
    entry.layer.name = "Input " + std::to_string(input);
    entry.layer.width = size.width;
    entry.layer.height = size.height;
    entry.media = input % 3 == 0   ? refhost::MediaSpec::ofPattern(refhost::Pattern::Checker)
                  : input % 3 == 1 ? refhost::MediaSpec::ofPattern(refhost::Pattern::Gradient)
                                   : refhost::MediaSpec::ofColour({0.1f * input, 0.5f, 0.3f, 1});
    composition.layers.push_back(entry);
  }
  return scene;
}

// Local cuts spread across the frame at different angles, so every cut adds a region.
std::array<float, 2> cutPosition(Size size, int i) {
  return {static_cast<float>(((i + 1.0) / 9.0 - 0.5) * size.width * 0.8),
          static_cast<float>((i % 2 ? 0.2 : -0.2) * size.height)};
}
float cutDirection(int i) { return static_cast<float>(10 + 37 * i); }
constexpr float kBorderWidth = 4;

nlohmann::json benchParams(Size size, int cuts, bool layers) {
  nlohmann::json params = {
      {"numberOfCuts", cuts}, {"cutType", "Local"}, {"borderWidth", kBorderWidth}};
  for (int i = 0; i < 8; ++i) {
    std::array<float, 2> position = cutPosition(size, i);
    params["cutPosition_" + std::to_string(i)] = {position[0], position[1]};
    params["cutDirection_" + std::to_string(i)] = cutDirection(i);
  }
  for (int input = 0; input < kInputs; ++input)
    params["inputLayer" + std::to_string(input)] = layers ? layerGuid(input) : refhost::kNoLayer;
  return params;
}

// The replica's picture of the same layout: one region per cut plus the first (its regions are
// strips, but with every input the own source unmoved they show the same picture), and the
// cuts' border segments.
FloorLayout floorLayout(Size size, int cuts) {
  FloorLayout layout;
  layout.width = size.width;
  layout.height = size.height;
  layout.regions = cuts + 1;
  std::vector<std::array<float, 2>> positions;
  std::vector<float> directions;
  for (int i = 0; i < cuts; ++i) {
    positions.push_back(cutPosition(size, i));
    directions.push_back(cutDirection(i));
  }
  layout.segments = cutSegments(size.width, size.height, positions, directions);
  layout.borderRadius = kBorderWidth * 0.5f + 1;
  return layout;
}

double seconds(std::chrono::steady_clock::time_point since) {
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - since).count();
}

// CPU seconds of every thread of the process, the renderer's workers included.
double processCpuSeconds() {
  timespec now{};
  clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

Timing renderOnce(SceneSession& session) {
  refhost::Host& host = session.host();
  refhost::GlContext& gl = *host.gl();
  Timing timing;
  gl.finish();
  auto started = std::chrono::steady_clock::now();
  refhost::RenderFrame frame(host, session.frameSettings(), 0);
  gl.finish();
  timing.upload = seconds(started);
  host.setRenderContext(&frame.context());
  session.plugin().send(12);
  double fetchedBefore = host.frameDeliverySeconds();
  double fetchCpuBefore = host.frameDeliveryCpuSeconds();
  gl.finish();
  started = std::chrono::steady_clock::now();
  double cpuBefore = processCpuSeconds();
  session.plugin().send(10);
  gl.finish();
  double total = seconds(started);
  double cpu = processCpuSeconds() - cpuBefore;
  host.setRenderContext(nullptr);
  timing.fetch = host.frameDeliverySeconds() - fetchedBefore;
  timing.render = total - timing.fetch;
  timing.renderCpu = cpu - (host.frameDeliveryCpuSeconds() - fetchCpuBefore);
  started = std::chrono::steady_clock::now();
  frame.readOutput();
  timing.readback = seconds(started);
  return timing;
}

double median(std::vector<double> values) {
  std::sort(values.begin(), values.end());
  std::size_t n = values.size();
  return n % 2 ? values[n / 2] : (values[n / 2 - 1] + values[n / 2]) / 2;
}

Timing medianOf(const std::vector<Timing>& runs) {
  auto pick = [&](double Timing::*field) {
    std::vector<double> values;
    for (const Timing& run : runs) values.push_back(run.*field * 1000.0);
    return median(values);
  };
  return Timing{pick(&Timing::render), pick(&Timing::fetch), pick(&Timing::upload),
                pick(&Timing::readback), pick(&Timing::renderCpu)};
}

// Median wall and CPU milliseconds of the replica's passes over the frame's own textures; with
// `compare` (every input the own source), its picture checked against the effect's.
Floor timeFloor(SceneSession& session, Size size, int cuts, int warmup, int repeat, bool compare) {
  refhost::Host& host = session.host();
  refhost::GlContext& gl = *host.gl();
  refhost::RenderFrame frame(host, session.frameSettings(), 0);
  host.setRenderContext(&frame.context());
  session.plugin().send(12);
  session.plugin().send(10);
  host.setRenderContext(nullptr);
  const refhost::RgbaImage rendered = frame.readOutput();
  FloorReplica replica(floorLayout(size, cuts), frame.context().source.id,
                       frame.context().output.id);
  for (int i = 0; i < warmup; ++i) replica.render();
  std::vector<double> walls, cpus;
  for (int i = 0; i < repeat; ++i) {
    gl.finish();
    auto started = std::chrono::steady_clock::now();
    double cpuBefore = processCpuSeconds();
    replica.render();
    gl.finish();
    walls.push_back(seconds(started) * 1000.0);
    cpus.push_back((processCpuSeconds() - cpuBefore) * 1000.0);
  }
  if (!gl.errors().empty())
    throw std::runtime_error("the floor replica caused a GL error: " + gl.errors().front().text);
  Floor floor{median(walls), median(cpus), -1};
  if (!compare) return floor;
  const refhost::RgbaImage drawn = frame.readOutput();
  floor.difference = 0;
  for (std::size_t i = 0; i < drawn.pixels.size(); ++i)
    floor.difference = std::max(floor.difference, std::abs(drawn.pixels[i] - rendered.pixels[i]));
  if (floor.difference > kFloorTolerance)
    throw std::runtime_error("the floor replica's picture differs from the render's by up to " +
                             std::to_string(floor.difference) + " levels at " +
                             std::to_string(size.width) + "x" + std::to_string(size.height) +
                             " with " + std::to_string(cuts) +
                             " cuts, so it no longer draws the "
                             "effect's passes");
  return floor;
}

void printTable(const std::vector<Result>& results, const std::string& renderer, bool floor) {
  std::printf("GL renderer: %s\nmedian ms per frame\n\n", renderer.c_str());
  std::printf("%-11s %4s %-6s %9s %8s %8s %9s %8s %8s", "size", "cuts", "inputs", "render", "fetch",
              "upload", "readback", "total", "cpu");
  if (floor) std::printf(" %8s %6s %9s %6s %5s", "floor", "ratio", "floor cpu", "ratio", "diff");
  std::printf("\n");
  for (const Result& r : results) {
    char size[24];
    std::snprintf(size, sizeof size, "%dx%d", r.size.width, r.size.height);
    const Timing& t = r.median;
    std::printf("%-11s %4d %-6s %9.2f %8.2f %8.2f %9.2f %8.2f %8.2f", size, r.cuts,
                r.inputs.c_str(), t.render, t.fetch, t.upload, t.readback,
                t.render + t.fetch + t.upload + t.readback, t.renderCpu);
    if (floor)
      std::printf(" %8.2f %6.2f %9.2f %6.2f %5s", r.floor.wall, t.render / r.floor.wall,
                  r.floor.cpu, t.renderCpu / r.floor.cpu,
                  r.floor.difference < 0 ? "-" : std::to_string(r.floor.difference).c_str());
    std::printf("\n");
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
                                     {"--floor", false},
                                     {"--json", false}});
  auto value = [&](const char* name, const char* fallback) {
    return options.count(name) ? options[name] : std::string(fallback);
  };
  std::vector<Size> sizes = parseSizes(value("--sizes", "1280x720,1920x1080,3840x2160"));
  std::vector<int> cutCounts = parseCuts(value("--cuts", "1,4,8"));
  std::vector<std::string> inputKinds = parseInputs(value("--inputs", "own,layers"));
  int32_t repeat = parseInt32("--repeat", value("--repeat", "5"));
  int32_t warmup = parseInt32("--warmup", value("--warmup", "1"));
  if (repeat < 1 || warmup < 0) throw UsageError("--repeat needs at least 1, --warmup at least 0");
  refhost::GlProfile profile = glProfile(options);
  std::string module = pluginPath(options);
  const bool floor = options.count("--floor") > 0;

  std::vector<Result> results;
  std::string renderer, version;
  for (Size size : sizes) {
    SceneSession session(benchScene(size), module, profile);
    renderer = session.host().gl()->rendererString();
    version = session.host().gl()->versionString();
    for (int cuts : cutCounts) {
      for (const std::string& inputs : inputKinds) {
        session.applyParams(benchParams(size, cuts, inputs == "layers"), "(bench)");
        for (int i = 0; i < warmup; ++i) renderOnce(session);
        std::vector<Timing> runs;
        for (int i = 0; i < repeat; ++i) runs.push_back(renderOnce(session));
        Floor floorTime =
            floor ? timeFloor(session, size, cuts, warmup, repeat, inputs == "own") : Floor{};
        results.push_back(Result{size, cuts, inputs, medianOf(runs), floorTime});
      }
    }
    session.finish();
  }

  if (!options.count("--json")) {
    printTable(results, renderer, floor);
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
    if (floor) {
      rows.back()["floorMs"] = r.floor.wall;
      rows.back()["floorCpuMs"] = r.floor.cpu;
      if (r.floor.difference >= 0) rows.back()["floorDifference"] = r.floor.difference;
    }
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
