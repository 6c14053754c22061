// The render against its floor: for each frame size and cut count, the plug-in's render of the
// benchmark scene (every input its own source) timed through the engine, and the same passes
// drawn by a bare-GL replica in the same context (no host operations, no module), with the
// ratios of wall and CPU time. The replica's picture is checked against the render's first, so
// its times stand for the effect's passes.
#include <algorithm>
#include <array>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <stdexcept>
#include <string>
#include <vector>

#include "cli/cli_support.h"
#include "commands/bench_scene.h"
#include "floor_replica.h"
#include "refhost/pipeline/frame_readback.h"
#include "scene/scene_engine.h"

namespace {

using namespace veltrane_cli;
using veltrane_bench::FloorLayout;
using veltrane_bench::FloorReplica;

const char kHelp[] =
    "Usage: bench_floor [--sizes WxH,...] [--cuts N,...] [--repeat N] [--warmup N]\n"
    "                   [--profile core|compat] [--plugin PATH]\n"
    "\n"
    "Times the plug-in's render of the benchmark scene (every input its own source) and a\n"
    "bare-GL replica of the same passes in the same context, and prints median milliseconds\n"
    "of wall and CPU time and render / floor. 'diff' is the largest channel difference between\n"
    "the two pictures; beyond 8 the replica no longer draws the effect's passes and the\n"
    "program stops.\n"
    "\n"
    "Options:\n"
    "  --sizes LIST   frame sizes (default 1280x720,1920x1080,3840x2160)\n"
    "  --cuts LIST    cut counts, 1 to 8 (default 1,8)\n"
    "  --repeat N     timed renders per case (default 9)\n"
    "  --warmup N     untimed renders first (default 1)\n"
    "  --profile P    GL profile: core (default) or compat\n"
    "  --plugin PATH  the module to load (default: $VELTRANE_PLUGIN, else beside the program)\n";

// The replica draws the effect's picture up to rounding where a border edge crosses a pixel
// (its segments come from its own arithmetic); further apart, it has stopped drawing the
// effect's passes and its times mean nothing.
constexpr int kFloorTolerance = 8;

struct Row {
  BenchSize size;
  int cuts = 0;
  FrameTiming render;
  double floorWall = 0, floorCpu = 0;
  int difference = 0;
};

// The replica's picture of the same layout: one region per cut plus the first (its regions
// are strips, but with every input the own source unmoved they show the same picture), and
// the cuts' border segments.
FloorLayout floorLayout(BenchSize size, int cuts) {
  FloorLayout layout;
  layout.width = size.width;
  layout.height = size.height;
  layout.regions = cuts + 1;
  std::vector<std::array<float, 2>> positions;
  std::vector<float> directions;
  for (int i = 0; i < cuts; ++i) {
    positions.push_back(benchCutPosition(size, i));
    directions.push_back(benchCutDirection(i));
  }
  layout.segments = veltrane_bench::cutSegments(size.width, size.height, positions, directions);
  layout.borderRadius = kBenchBorderWidth * 0.5f + 1;
  return layout;
}

// Times the replica over one rendered frame's own textures and compares the pictures.
void timeFloor(refhost::Engine& engine, Row& row, int warmup, int repeat) {
  refhost::GlContext& gl = engine.gl();
  std::unique_ptr<refhost::RenderFrame> frame = engine.render(0);
  const WispRenderContext& context = frame->context();
  const refhost::RgbaImage rendered =
      refhost::readBack(context.output.id, context.width, context.height);
  FloorReplica replica(floorLayout(row.size, row.cuts), context.source.id, context.output.id);
  for (int i = 0; i < warmup; ++i) replica.render();
  std::vector<double> walls, cpus;
  for (int i = 0; i < repeat; ++i) {
    gl.finish();
    auto started = std::chrono::steady_clock::now();
    double cpuBefore = processCpuSeconds();
    replica.render();
    gl.finish();
    walls.push_back(
        std::chrono::duration<double>(std::chrono::steady_clock::now() - started).count() * 1000);
    cpus.push_back((processCpuSeconds() - cpuBefore) * 1000.0);
  }
  if (!gl.errors().empty())
    throw std::runtime_error("the floor replica caused a GL error: " + gl.errors().front().text);
  row.floorWall = median(walls);
  row.floorCpu = median(cpus);
  const refhost::RgbaImage drawn =
      refhost::readBack(context.output.id, context.width, context.height);
  for (std::size_t i = 0; i < drawn.pixels.size(); ++i)
    row.difference = std::max(row.difference, std::abs(drawn.pixels[i] - rendered.pixels[i]));
  if (row.difference > kFloorTolerance)
    throw std::runtime_error("the floor replica's picture differs from the render's by up to " +
                             std::to_string(row.difference) + " levels at " +
                             std::to_string(row.size.width) + "x" +
                             std::to_string(row.size.height) + " with " + std::to_string(row.cuts) +
                             " cuts, so it no longer draws the effect's passes");
}

int run(const std::vector<std::string>& args) {
  if (wantsHelp(args)) {
    std::fputs(kHelp, stdout);
    return 0;
  }
  auto options = parseOptions(args, {{"--sizes", true},
                                     {"--cuts", true},
                                     {"--repeat", true},
                                     {"--warmup", true},
                                     {"--profile", true},
                                     {"--plugin", true}});
  auto value = [&](const char* name, const char* fallback) {
    return options.count(name) ? options[name] : std::string(fallback);
  };
  const std::vector<BenchSize> sizes =
      parseSizes("--sizes", value("--sizes", "1280x720,1920x1080,3840x2160"));
  const std::vector<int> cutCounts = parseCutCounts("--cuts", value("--cuts", "1,8"));
  const int32_t repeat = parseInt32("--repeat", value("--repeat", "9"));
  const int32_t warmup = parseInt32("--warmup", value("--warmup", "1"));
  if (repeat < 1 || warmup < 0) throw UsageError("--repeat needs at least 1, --warmup at least 0");

  std::printf("%-11s %4s %9s %8s %6s %10s %9s %6s %5s\n", "size", "cuts", "render ms", "floor ms",
              "ratio", "render cpu", "floor cpu", "ratio", "diff");
  for (BenchSize size : sizes) {
    const Scene scene = benchScene(size);
    SceneEngineOptions engineOptions;
    engineOptions.modulePath = pluginPath(options);
    engineOptions.profile = glProfile(options);
    std::unique_ptr<refhost::Engine> engine = startScene(scene, std::move(engineOptions));
    for (int cuts : cutCounts) {
      applySceneParams(*engine, benchParams(engine->vocabulary(), size, cuts, false), scene.file,
                       scene.layerGuids());
      Row row;
      row.size = size;
      row.cuts = cuts;
      for (int i = 0; i < warmup; ++i) timeFrame(*engine);
      std::vector<FrameTiming> runs;
      for (int i = 0; i < repeat; ++i) runs.push_back(timeFrame(*engine));
      row.render = medianMilliseconds(runs);
      timeFloor(*engine, row, warmup, repeat);
      char shown[24];
      std::snprintf(shown, sizeof shown, "%dx%d", size.width, size.height);
      std::printf("%-11s %4d %9.2f %8.2f %6.2f %10.2f %9.2f %6.2f %5d\n", shown, cuts,
                  row.render.render, row.floorWall, row.render.render / row.floorWall,
                  row.render.renderCpu, row.floorCpu, row.render.renderCpu / row.floorCpu,
                  row.difference);
      std::fflush(stdout);
    }
    engine->finish();
  }
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return run(std::vector<std::string>(argv + 1, argv + argc));
  } catch (const UsageError& error) {
    std::fprintf(stderr, "bench_floor: %s (see 'bench_floor --help')\n", error.what());
    return 2;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "bench_floor: %s\n", error.what());
    return 1;
  }
}
