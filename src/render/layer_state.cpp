// Timing conversions round with the f32 value of 0.49999 so that a time exactly between two
// frames stays on the earlier one.
#include "render/layer_state.h"

#include <cmath>
#include <cstring>

#include "render/matrix_math.h"

namespace veltrane {
namespace {

constexpr double kDefaultFrameRate = 25.0;
constexpr double kRounding = static_cast<double>(0.49999f);

void flattenMatrix(float* m) {
  for (int element : {2, 6, 8, 9, 11, 14}) m[element] = 0.0f;
  m[10] = 1.0f;
}

void intoLayerSpace(float* m, const WispRenderContext& context) {
  if (!context.hasLayerSpaceMatrix) return;
  Matrix4 layerSpace, placement;
  std::memcpy(layerSpace.data(), context.layerSpaceMatrix, sizeof layerSpace);
  std::memcpy(placement.data(), m, sizeof placement);
  const Matrix4 product = multiplyColumnMajor(layerSpace, placement);
  std::memcpy(m, product.data(), sizeof product);
}

void setFlatDefault(WispHost* host, tagWispAPI* api, const WispRenderContext& context,
                    LayerState& state) {
  WispTimeInfo info{context.width, context.height, kDefaultFrameRate};
  if (api->GetTimeInfo(host, &info) != 0) {
    info.width = context.width;
    info.height = context.height;
  }
  state.width = info.width;
  state.height = info.height;
  state.is3D = 0;
  const Matrix4 placement = translationMatrix4(-static_cast<float>(info.width) / 2.0f,
                                               -static_cast<float>(info.height) / 2.0f, 0.0f);
  std::memcpy(state.placement, placement.data(), sizeof state.placement);
  std::memcpy(state.secondMatrix, placement.data(), sizeof state.secondMatrix);
}

}  // namespace

double compositionFrameRate(WispHost* host, tagWispAPI* api) {
  WispTimeInfo info{0, 0, kDefaultFrameRate};
  if (api->GetTimeInfo(host, &info) != 0) return kDefaultFrameRate;
  return info.frameRate;
}

int32_t frameOfTime(double milliseconds, double frameRate) {
  const double frame = std::trunc(milliseconds * frameRate / 1000.0 + kRounding);
  // Out-of-range and NaN times land on frame 0 instead of an undefined conversion.
  if (!(std::fabs(frame) < 2.0e9)) return 0;
  return static_cast<int32_t>(frame);
}

int32_t timeOfFrame(int32_t frame, double frameRate) {
  if (frameRate == 0.0) frameRate = kDefaultFrameRate;
  const double milliseconds = std::trunc(frame * 1000.0 / frameRate + kRounding);
  if (!(std::fabs(milliseconds) < 2.0e9)) return 0;
  return static_cast<int32_t>(milliseconds);
}

int32_t getLayerState(WispHost* host, tagWispAPI* api, const WispRenderContext& context,
                      const char* layerGuid, int32_t timeMs, LayerState& state, bool flat) {
  const int32_t status = api->QueryLayerState(host, layerGuid ? layerGuid : "", timeMs, &state);
  if (status == 0) {
    if (state.is3D == 0) {
      flattenMatrix(state.placement);
      flattenMatrix(state.secondMatrix);
    } else {
      intoLayerSpace(state.placement, context);
      if (layerTypeIn(state.type, kLayerTypesWithSecondMatrix))
        intoLayerSpace(state.secondMatrix, context);
    }
    if (!(flat && layerTypeIn(state.type, kLayerTypesFlattened))) return status;
  }
  setFlatDefault(host, api, context, state);
  return status;
}

}  // namespace veltrane
