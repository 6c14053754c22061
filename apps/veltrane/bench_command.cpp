// `veltrane bench`: milliseconds per frame of the plug-in's render across frame sizes, cut
// counts and input kinds, split into the plug-in's own time and the host's frame traffic.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <nlohmann/json.hpp>
#include <sstream>

#include "cli_support.h"
#include "commands.h"
#include "scene_session.h"

namespace veltrane_cli {
namespace {

const char kBenchHelp[] =
    "Usage: veltrane bench [--sizes WxH,...] [--cuts N,...] [--inputs own,layers]\n"
    "                      [--repeat N] [--warmup N] [--profile core|compat] [--plugin PATH]\n"
    "                      [--json]\n"
    "\n"
    "Renders one frame repeatedly for every combination of frame size, number of Local cuts\n"
    "and input kind, and prints the median milliseconds per frame:\n"
    "  render   message 10, bounded by glFinish on both sides, less the host's frame fetches\n"
    "  fetch    the host producing and uploading the frames the plug-in fetched during it\n"
    "  upload   the host preparing the frame's source texture\n"
    "  readback reading the output texture back\n"
    "(GL may finish earlier drawing inside a fetch's upload, so on a software renderer the\n"
    "split between render and fetch is approximate; their sum is not.)\n"
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
    "  --json         print one JSON document instead of the table\n"
    "  -h, --help     show this help\n";

constexpr int kInputs = 9;

struct Size {
  int32_t width, height;
};

struct Timing {
  double render = 0, fetch = 0, upload = 0, readback = 0;
};

struct Result {
  Size size;
  int cuts;
  std::string inputs;
  Timing median;
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
nlohmann::json benchParams(Size size, int cuts, bool layers) {
  nlohmann::json params = {{"numberOfCuts", cuts}, {"cutType", "Local"}, {"borderWidth", 4}};
  for (int i = 0; i < 8; ++i) {
    double x = ((i + 1.0) / 9.0 - 0.5) * size.width * 0.8;
    double y = (i % 2 ? 0.2 : -0.2) * size.height;
    params["cutPosition_" + std::to_string(i)] = {x, y};
    params["cutDirection_" + std::to_string(i)] = 10 + 37 * i;
  }
  for (int input = 0; input < kInputs; ++input)
    params["inputLayer" + std::to_string(input)] = layers ? layerGuid(input) : refhost::kNoLayer;
  return params;
}

double seconds(std::chrono::steady_clock::time_point since) {
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - since).count();
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
  gl.finish();
  started = std::chrono::steady_clock::now();
  session.plugin().send(10);
  gl.finish();
  double total = seconds(started);
  host.setRenderContext(nullptr);
  timing.fetch = host.frameDeliverySeconds() - fetchedBefore;
  timing.render = total - timing.fetch;
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
                pick(&Timing::readback)};
}

void printTable(const std::vector<Result>& results, const std::string& renderer) {
  std::printf("GL renderer: %s\nmedian ms per frame\n\n", renderer.c_str());
  std::printf("%-11s %4s %-6s %9s %8s %8s %9s %8s\n", "size", "cuts", "inputs", "render", "fetch",
              "upload", "readback", "total");
  for (const Result& r : results) {
    char size[24];
    std::snprintf(size, sizeof size, "%dx%d", r.size.width, r.size.height);
    const Timing& t = r.median;
    std::printf("%-11s %4d %-6s %9.2f %8.2f %8.2f %9.2f %8.2f\n", size, r.cuts, r.inputs.c_str(),
                t.render, t.fetch, t.upload, t.readback,
                t.render + t.fetch + t.upload + t.readback);
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
  std::vector<Size> sizes = parseSizes(value("--sizes", "1280x720,1920x1080,3840x2160"));
  std::vector<int> cutCounts = parseCuts(value("--cuts", "1,4,8"));
  std::vector<std::string> inputKinds = parseInputs(value("--inputs", "own,layers"));
  int32_t repeat = parseInt32("--repeat", value("--repeat", "5"));
  int32_t warmup = parseInt32("--warmup", value("--warmup", "1"));
  if (repeat < 1 || warmup < 0) throw UsageError("--repeat needs at least 1, --warmup at least 0");
  refhost::GlProfile profile = glProfile(options);
  std::string module = pluginPath(options);

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
        results.push_back(Result{size, cuts, inputs, medianOf(runs)});
      }
    }
    session.finish();
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
                    {"readbackMs", r.median.readback}});
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
