// What `veltrane bench` and the benchmark programs render and how they time it: a scene of
// colour bars with nine differently drawn layers, Local cuts spread over the frame, and one
// frame's stages timed through the engine.
#pragma once

#include <array>
#include <cstdint>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "refhost/engine.h"
#include "scene/scene_document.h"

namespace veltrane_cli {

struct BenchSize {
  int32_t width = 0, height = 0;
};

// Bars for the own source and a different picture for each of the nine layers.
Scene benchScene(BenchSize size);

// Local cut i: spread across the frame at different angles, so every cut adds a region.
std::array<float, 2> benchCutPosition(BenchSize size, int i);
float benchCutDirection(int i);
constexpr float kBenchBorderWidth = 4;

// The first `cuts` cuts with a border; every input the own source, or each a layer of its own.
nlohmann::ordered_json benchParams(const refhost::EffectVocabulary& roles, BenchSize size, int cuts,
                                   bool layers);

// Seconds of one frame's stages.
struct FrameTiming {
  double render = 0;     // messages 12 and 10 between glFinish calls, less the fetches
  double fetch = 0;      // the host producing and uploading the frames fetched meanwhile
  double upload = 0;     // the host preparing the frame's source texture
  double readback = 0;   // reading the output back
  double renderCpu = 0;  // the process's CPU time during the render, less the fetches'
};

// Renders frame 0 once through the engine, each stage timed.
FrameTiming timeFrame(refhost::Engine& engine);

// CPU seconds of every thread of the process, the renderer's workers included.
double processCpuSeconds();
double median(std::vector<double> values);
// Each field's median over the runs, in milliseconds.
FrameTiming medianMilliseconds(const std::vector<FrameTiming>& runs);

// "WxH,..." sizes from 1x1 to 16384x16384; "N,..." cut counts from 1 to 8. Each throws
// UsageError naming `option`.
std::vector<BenchSize> parseSizes(const std::string& option, const std::string& text);
std::vector<int> parseCutCounts(const std::string& option, const std::string& text);
std::vector<std::string> splitList(const std::string& text);

}  // namespace veltrane_cli
