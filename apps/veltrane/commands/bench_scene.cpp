// The benchmark scene and the timing of one frame.
#include "commands/bench_scene.h"

#include <time.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <sstream>

#include "cli/cli_support.h"
#include "refhost/pipeline/frame_readback.h"

namespace veltrane_cli {
namespace {

// One layer for each input the effect can have.
constexpr int kLayers = 9;

std::string layerGuid(int input) {
  char text[40];
  std::snprintf(text, sizeof text, "be4c0000-0000-4000-8000-%012d", input + 1);
  return text;
}

double seconds(std::chrono::steady_clock::time_point since) {
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - since).count();
}

}  // namespace

Scene benchScene(BenchSize size) {
  Scene scene;
  scene.file = "(bench)";
  refhost::Composition& composition = scene.composition;
  composition.width = size.width;
  composition.height = size.height;
  composition.source = refhost::MediaSpec::ofPattern(refhost::Pattern::Bars);
  for (int input = 0; input < kLayers; ++input) {
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

std::array<float, 2> benchCutPosition(BenchSize size, int i) {
  return {static_cast<float>(((i + 1.0) / 9.0 - 0.5) * size.width * 0.8),
          static_cast<float>((i % 2 ? 0.2 : -0.2) * size.height)};
}

float benchCutDirection(int i) { return static_cast<float>(10 + 37 * i); }

nlohmann::ordered_json benchParams(const refhost::EffectVocabulary& roles, BenchSize size, int cuts,
                                   bool layers) {
  using refhost::CutParam;
  using refhost::EffectParam;
  nlohmann::ordered_json params = {
      {roles.id(EffectParam::NumberOfCuts), cuts},
      {roles.id(EffectParam::CutType), roles.choiceOf(refhost::CutType::Local)},
      {roles.id(EffectParam::BorderWidth), kBenchBorderWidth}};
  for (int i = 0; i < roles.cuts(); ++i) {
    std::array<float, 2> position = benchCutPosition(size, i);
    params[roles.id(CutParam::Position, i)] = {position[0], position[1]};
    params[roles.id(CutParam::Direction, i)] = benchCutDirection(i);
  }
  for (int input = 0; input < roles.inputs(); ++input)
    params[roles.id(refhost::InputParam::Layer, input)] =
        layers ? layerGuid(input) : refhost::kNoLayer;
  return params;
}

double processCpuSeconds() {
  timespec now{};
  clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

FrameTiming timeFrame(refhost::Engine& engine) {
  refhost::GlContext& gl = engine.gl();
  FrameTiming timing;
  gl.finish();
  auto started = std::chrono::steady_clock::now();
  std::unique_ptr<refhost::RenderFrame> frame = engine.prepare(0);
  gl.finish();
  timing.upload = seconds(started);
  const double fetchedBefore = engine.frameDeliverySeconds();
  const double fetchCpuBefore = engine.frameDeliveryCpuSeconds();
  started = std::chrono::steady_clock::now();
  const double cpuBefore = processCpuSeconds();
  engine.render(*frame);
  gl.finish();
  const double total = seconds(started);
  const double cpu = processCpuSeconds() - cpuBefore;
  timing.fetch = engine.frameDeliverySeconds() - fetchedBefore;
  timing.render = total - timing.fetch;
  timing.renderCpu = cpu - (engine.frameDeliveryCpuSeconds() - fetchCpuBefore);
  started = std::chrono::steady_clock::now();
  const WispRenderContext& context = frame->context();
  refhost::readBack(context.output.id, context.width, context.height);
  timing.readback = seconds(started);
  return timing;
}

double median(std::vector<double> values) {
  if (values.empty()) return 0;
  std::sort(values.begin(), values.end());
  std::size_t n = values.size();
  return n % 2 ? values[n / 2] : (values[n / 2 - 1] + values[n / 2]) / 2;
}

FrameTiming medianMilliseconds(const std::vector<FrameTiming>& runs) {
  auto pick = [&](double FrameTiming::*field) {
    std::vector<double> values;
    for (const FrameTiming& run : runs) values.push_back(run.*field * 1000.0);
    return median(values);
  };
  return FrameTiming{pick(&FrameTiming::render), pick(&FrameTiming::fetch),
                     pick(&FrameTiming::upload), pick(&FrameTiming::readback),
                     pick(&FrameTiming::renderCpu)};
}

std::vector<std::string> splitList(const std::string& text) {
  std::vector<std::string> items;
  std::stringstream stream(text);
  for (std::string item; std::getline(stream, item, ',');) {
    if (!item.empty()) items.push_back(item);
  }
  return items;
}

std::vector<BenchSize> parseSizes(const std::string& option, const std::string& text) {
  std::vector<BenchSize> sizes;
  for (const std::string& item : splitList(text)) {
    std::string::size_type x = item.find('x');
    if (x == std::string::npos)
      throw UsageError("option '" + option + "' expects WxH items, got '" + item + "'");
    BenchSize size{parseInt32(option, item.substr(0, x)), parseInt32(option, item.substr(x + 1))};
    if (size.width < 1 || size.height < 1 || size.width > 16384 || size.height > 16384)
      throw UsageError("option '" + option + "' expects sizes from 1x1 to 16384x16384, got '" +
                       item + "'");
    sizes.push_back(size);
  }
  if (sizes.empty()) throw UsageError("option '" + option + "' needs at least one size");
  return sizes;
}

std::vector<int> parseCutCounts(const std::string& option, const std::string& text) {
  std::vector<int> cuts;
  for (const std::string& item : splitList(text)) {
    int32_t count = parseInt32(option, item);
    if (count < 1 || count > 8)
      throw UsageError("option '" + option + "' expects counts from 1 to 8");
    cuts.push_back(count);
  }
  if (cuts.empty()) throw UsageError("option '" + option + "' needs at least one count");
  return cuts;
}

}  // namespace veltrane_cli
