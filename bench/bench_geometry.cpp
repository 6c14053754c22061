// Cost of one pointer event's geometry: the cut list read from a host, the region partition, the
// cut segments and the region under the pointer.
#include <benchmark/benchmark.h>

#include "common/param_ids.h"
#include "effect/param_declaration.h"
#include "geometry/cut_model.h"
#include "geometry/cut_segments.h"
#include "geometry/region_partition.h"
#include "refhost/core/host.h"

namespace {

using namespace veltrane;

// A 1920 x 1080 layout of `cuts` cuts spread over the frame at assorted angles.
// The reference host serves the parameters, with no call log, as in a long render.
void fillLayout(refhost::Host& host, int cuts, bool radial) {
  using refhost::ParamValue;
  declareParameters(host.handle(), &host.api());
  host.setValue(param::kNumberOfCuts, ParamValue::ofInt(cuts));
  host.setValue(param::kCutType, ParamValue::ofInt(radial ? kCutTypeRadial : 0));
  host.setValue(param::kCutPositionGlobal, ParamValue::ofPoint(37.0f, -21.0f));
  const float positions[kMaxCuts][2] = {{0, 0},     {-400, 120}, {380, -200}, {-150, -300},
                                        {600, 250}, {-700, -90}, {220, 330},  {90, -420}};
  const float degrees[kMaxCuts] = {10, 95, -40, 170, 60, -120, 30, -75};
  for (int i = 0; i < kMaxCuts; ++i) {
    host.setValue(cutParamId(param::kCutPositionPrefix, i),
                  ParamValue::ofPoint(positions[i][0], positions[i][1]));
    host.setValue(cutParamId(param::kCutDirectionPrefix, i), ParamValue::ofFloat(degrees[i]));
  }
}

void PointerEventGeometry(benchmark::State& state) {
  refhost::Host host;
  const int cuts = static_cast<int>(state.range(0));
  const bool radial = state.range(1) != 0;
  fillLayout(host, cuts, radial);
  const plugin_glsl_types::genVec2 frame{1920.0f, 1080.0f};
  std::size_t triangles = 0;
  for (auto _ : state) {
    const CutList list = readCutList(host.handle(), &host.api(), 0, frame, false, 1.0f);
    const int32_t cutType = host.api().GetChoiceParam(host.handle(), param::kCutType, 0);
    const RegionList regions = partitionFrame(list, frame, cutType);
    const std::vector<CutSegment> segments = clipCutSegments(list, frame);
    benchmark::DoNotOptimize(findRegionAt(regions, {-500.0f, 200.0f}));
    benchmark::DoNotOptimize(segments.data());
    triangles = 0;
    for (const Region& region : regions) triangles += region.triangles.size();
  }
  state.counters["triangles"] = static_cast<double>(triangles);
}
BENCHMARK(PointerEventGeometry)
    ->ArgNames({"cuts", "radial"})
    ->ArgsProduct({{1, 4, 8}, {0, 1}})
    ->Unit(benchmark::kMicrosecond);

}  // namespace

BENCHMARK_MAIN();
