// Input placement read from the per-input parameters.
#include "geometry/input_transform.h"

#include <cmath>

#include "common/param_ids.h"
#include "geometry/angles.h"

namespace veltrane {

namespace {

using plugin_glsl_types::genVec2;
using plugin_glsl_types::genVec4;

genVec2 readTranslation(WispHost* host, const tagWispAPI* api, int32_t time, int inputIndex) {
  // A host that leaves the point unwritten gives no translation.
  genVec2 translation;
  api->GetPointParam(host, inputParamId(param::kInputFrameTranslationPrefix, inputIndex).c_str(),
                     time, &translation.x, &translation.y);
  return translation;
}

float readScalePercent(WispHost* host, const tagWispAPI* api, int32_t time, int inputIndex) {
  return api->GetFloatParam(host, inputParamId(param::kInputFrameScalePrefix, inputIndex).c_str(),
                            time);
}

float readRotationDegrees(WispHost* host, const tagWispAPI* api, int32_t time, int inputIndex) {
  return api->GetAngleParam(
      host, inputParamId(param::kInputFrameRotationPrefix, inputIndex).c_str(), time);
}

}  // namespace

InputSampling makeInputSampling(genVec2 translation, float scalePercent, float rotationDegrees,
                                int32_t frameWidth, int32_t frameHeight, float pixelAspect) {
  const float width = static_cast<float>(frameWidth);
  const float height = static_cast<float>(frameHeight);
  const float scale = scalePercent * 0.01f;
  InputSampling sampling;
  sampling.sampleOffset = {-translation.x / (width * pixelAspect), -translation.y / height};
  sampling.inverseScale = scale == 0.0f ? 1.0f : 1.0f / scale;
  sampling.sampleRotation = -degreesToRadians(rotationDegrees);
  sampling.aspectRatio = frameHeight == 0 ? 1.0f : width / height;
  return sampling;
}

InputSampling readInputSampling(WispHost* host, const tagWispAPI* api, int32_t time,
                                int32_t frameWidth, int32_t frameHeight, bool pixelAspectPresent,
                                float pixelAspect, int inputIndex) {
  const float rotation = readRotationDegrees(host, api, time, inputIndex);
  const float scale = readScalePercent(host, api, time, inputIndex);
  const genVec2 translation = readTranslation(host, api, time, inputIndex);
  return makeInputSampling(translation, scale, rotation, frameWidth, frameHeight,
                           pixelAspectPresent ? pixelAspect : 1.0f);
}

genVec2 inputTextureCoordinate(const InputSampling& sampling, genVec2 frameCoordinate) {
  float x = (frameCoordinate.x - 0.5f + sampling.sampleOffset.x) * sampling.inverseScale;
  float y = (frameCoordinate.y - 0.5f + sampling.sampleOffset.y) * sampling.inverseScale;
  x *= sampling.aspectRatio;
  const float c = std::cos(sampling.sampleRotation);
  const float s = std::sin(sampling.sampleRotation);
  const float turnedX = c * x + s * y;
  const float turnedY = -s * x + c * y;
  return {turnedX / sampling.aspectRatio + 0.5f, turnedY + 0.5f};
}

genVec4 inputControlRect(WispHost* host, const tagWispAPI* api, int32_t time, genVec2 frameSize,
                         int inputIndex) {
  const genVec2 translation = readTranslation(host, api, time, inputIndex);
  const genVec2 centre{translation.x + frameSize.x / 2.0f, translation.y + frameSize.y / 2.0f};
  const float scale = readScalePercent(host, api, time, inputIndex);
  const genVec2 size{frameSize.x * scale * 0.01f, frameSize.y * scale * 0.01f};
  return {centre.x - size.x / 2.0f, centre.y - size.y / 2.0f, centre.x + size.x / 2.0f,
          centre.y + size.y / 2.0f};
}

float inputRotationRadians(WispHost* host, const tagWispAPI* api, int32_t time, int inputIndex) {
  return degreesToRadians(readRotationDegrees(host, api, time, inputIndex));
}

}  // namespace veltrane
