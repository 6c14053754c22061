// Fuzzes the geometry path with arbitrary parameter values and frame sizes: it must neither crash,
// hang nor read out of bounds, and its results must keep their bounds.
#include <fuzzer/FuzzedDataProvider.h>

#include <cstdint>
#include <cstring>
#include <vector>

#include "common/param_ids.h"
#include "geometry/cut_model.h"
#include "geometry/cut_segments.h"
#include "geometry/input_transform.h"
#include "geometry/region_partition.h"
#include "support/in_memory_host.h"

namespace {

using namespace veltrane;

// Any float bit pattern, NaN and infinities included, or else a plain value in a useful range.
float consumeFloat(FuzzedDataProvider& data, float range) {
  if (data.ConsumeBool()) {
    const uint32_t bits = data.ConsumeIntegral<uint32_t>();
    float value;
    std::memcpy(&value, &bits, sizeof value);
    return value;
  }
  return data.ConsumeFloatingPointInRange(-range, range);
}

void require(bool holds) {
  if (!holds) __builtin_trap();
}

void fillParameters(FuzzedDataProvider& data, testsupport::InMemoryHost& host) {
  host.setInt(param::kNumberOfCuts, data.ConsumeBool() ? data.ConsumeIntegralInRange(-2, 10)
                                                       : data.ConsumeIntegral<int32_t>());
  host.setInt(param::kCutType, data.ConsumeBool() ? data.ConsumeIntegralInRange(0, 1)
                                                  : data.ConsumeIntegral<int32_t>());
  host.setPoint(param::kCutPositionGlobal, consumeFloat(data, 5000), consumeFloat(data, 5000));
  for (int i = 0; i < kMaxCuts; ++i) {
    if (data.ConsumeBool()) {
      host.setPoint(cutParamId(param::kCutPositionPrefix, i), consumeFloat(data, 5000),
                    consumeFloat(data, 5000));
    }
    host.set(cutParamId(param::kCutDirectionPrefix, i), consumeFloat(data, 1000));
  }
  for (int k = 0; k < kInputCount; ++k) {
    host.setPoint(inputParamId(param::kInputFrameTranslationPrefix, k), consumeFloat(data, 5000),
                  consumeFloat(data, 5000));
    host.set(inputParamId(param::kInputFrameScalePrefix, k), consumeFloat(data, 500));
    host.set(inputParamId(param::kInputFrameRotationPrefix, k), consumeFloat(data, 1000));
  }
}

// One event's geometry, as the render and the pointer handlers run it.
void runEvent(FuzzedDataProvider& data, testsupport::InMemoryHost& host) {
  const int32_t width =
      data.ConsumeBool() ? data.ConsumeIntegralInRange(0, 8192) : data.ConsumeIntegral<int32_t>();
  const int32_t height =
      data.ConsumeBool() ? data.ConsumeIntegralInRange(0, 4320) : data.ConsumeIntegral<int32_t>();
  const plugin_glsl_types::genVec2 frame{static_cast<float>(width), static_cast<float>(height)};
  const bool aspectPresent = data.ConsumeBool();
  const float aspect = consumeFloat(data, 4);
  WispHost* handle = host.handle();
  tagWispAPI* api = host.record();

  const CutList cuts = readCutList(handle, api, 0, frame, aspectPresent, aspect);
  require(cuts.size() <= static_cast<std::size_t>(kMaxCuts));
  const int32_t cutType = api->GetChoiceParam(handle, param::kCutType, 0);
  const RegionList regions = partitionFrame(cuts, frame, cutType);
  require(regions.size() <= cuts.size() + 1);
  for (const Region& region : regions) require(region.id >= 0 && region.id <= kMaxCuts);
  require(clipCutSegments(cuts, frame).size() == cuts.size());

  const int32_t hit = findRegionAt(regions, {consumeFloat(data, 5000), consumeFloat(data, 5000)});
  require(hit >= -1 && hit <= kMaxCuts);
  for (const Region& region : regions) {
    const InputSampling sampling =
        readInputSampling(handle, api, 0, width, height, aspectPresent, aspect, region.id);
    inputTextureCoordinate(sampling, {consumeFloat(data, 2), consumeFloat(data, 2)});
  }
  for (int i = 0; i < kMaxCuts; ++i) {
    cutControlPosition(handle, api, 0, i, frame);
    cutControlAngle(handle, api, 0, i);
  }
  for (int k = 0; k < kInputCount; ++k) {
    inputControlRect(handle, api, 0, frame, k);
    inputRotationRadians(handle, api, 0, k);
  }
}

// A split with an arbitrary angular range and cut, as no partition would make: the whole-turn
// shifts must stay bounded for any values.
void runSplit(FuzzedDataProvider& data) {
  Cut cut;
  cut.positionX = consumeFloat(data, 100);
  cut.positionY = consumeFloat(data, 100);
  cut.angle = consumeFloat(data, 1e6f);
  cut.directionX = consumeFloat(data, 1);
  cut.directionY = consumeFloat(data, 1);
  cut.radial = data.ConsumeBool() ? 1 : 0;
  cut.cutNumber = 1;
  RegionList regions = makeInitialRegions({consumeFloat(data, 300), consumeFloat(data, 300)}, cut);
  regions[0].angleStart = consumeFloat(data, 1e6f);
  regions[0].angleEnd = consumeFloat(data, 1e6f);
  const Region split = splitRegion(regions[0], cut);
  require(split.triangles.size() + regions[0].triangles.size() <= 12);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, std::size_t size) {
  FuzzedDataProvider data(bytes, size);
  // One host for every input, as a host keeps its values: what an input leaves unwritten keeps
  // an earlier input's value.
  static testsupport::InMemoryHost host;
  host.clearCallLog();  // the calls of one input at most
  fillParameters(data, host);
  runEvent(data, host);
  runSplit(data);
  return 0;
}
