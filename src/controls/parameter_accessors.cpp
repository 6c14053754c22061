// Accessor implementations and their per-index bindings. The bindings are plain function
// pointers, one instantiation per index, so a control's accessors hold no heap memory.
#include "controls/parameter_accessors.h"

#include <array>
#include <cstddef>
#include <string>
#include <utility>

#include "common/param_ids.h"
#include "controls/control_constants.h"
#include "controls/handle_math.h"
#include "geometry/cut_model.h"
#include "geometry/input_transform.h"

namespace veltrane {

using namespace handle_math;

namespace {

genVec2 halfFrame(genVec2 frameSize) { return {frameSize.x / 2.0f, frameSize.y / 2.0f}; }

genVec2 readCutPosition(WispHost* host, tagWispAPI* api, int time, genVec2 frameSize, int index) {
  return cutControlPosition(host, api, time, index, frameSize);
}

template <int Index>
float cutDirectionAt(WispHost* host, tagWispAPI* api, int time) {
  return cutControlAngle(host, api, time, Index);
}
template <int Index>
void writeCutDirectionAt(WispHost* host, tagWispAPI* api, float radians, int time) {
  writeCutDirection(host, api, radians, time, Index);
}
template <int Index>
float inputRotationAt(WispHost* host, tagWispAPI* api, int time) {
  return inputRotationRadians(host, api, time, Index);
}
template <int Index>
void writeInputRotationAt(WispHost* host, tagWispAPI* api, float radians, int time) {
  writeInputRotation(host, api, radians, time, Index);
}
template <int Index>
genVec4 inputRectAt(WispHost* host, tagWispAPI* api, int time, genVec2 frameSize) {
  return inputControlRect(host, api, time, frameSize, Index);
}
template <int Index>
void writeInputRectAt(WispHost* host, tagWispAPI* api, genVec4 grabRect, genVec4 newRect,
                      char edgeMask, int time, genVec2 frameSize) {
  writeInputRect(host, api, grabRect, newRect, edgeMask, time, frameSize, Index);
}

using AngleReader = float (*)(WispHost*, tagWispAPI*, int);
using AngleWriter = void (*)(WispHost*, tagWispAPI*, float, int);
using QuadReader = genVec4 (*)(WispHost*, tagWispAPI*, int, genVec2);
using QuadWriter = void (*)(WispHost*, tagWispAPI*, genVec4, genVec4, char, int, genVec2);

template <std::size_t... I>
constexpr std::array<AngleReader, sizeof...(I)> cutDirectionReaders(std::index_sequence<I...>) {
  return {&cutDirectionAt<static_cast<int>(I)>...};
}
template <std::size_t... I>
constexpr std::array<AngleWriter, sizeof...(I)> cutDirectionWriters(std::index_sequence<I...>) {
  return {&writeCutDirectionAt<static_cast<int>(I)>...};
}
template <std::size_t... I>
constexpr std::array<AngleReader, sizeof...(I)> inputRotationReaders(std::index_sequence<I...>) {
  return {&inputRotationAt<static_cast<int>(I)>...};
}
template <std::size_t... I>
constexpr std::array<AngleWriter, sizeof...(I)> inputRotationWriters(std::index_sequence<I...>) {
  return {&writeInputRotationAt<static_cast<int>(I)>...};
}
template <std::size_t... I>
constexpr std::array<QuadReader, sizeof...(I)> inputRectReaders(std::index_sequence<I...>) {
  return {&inputRectAt<static_cast<int>(I)>...};
}
template <std::size_t... I>
constexpr std::array<QuadWriter, sizeof...(I)> inputRectWriters(std::index_sequence<I...>) {
  return {&writeInputRectAt<static_cast<int>(I)>...};
}

using CutIndices = std::make_index_sequence<kMaxCuts>;
using InputIndices = std::make_index_sequence<kInputCount>;

constexpr auto kCutDirectionReaders = cutDirectionReaders(CutIndices{});
constexpr auto kCutDirectionWriters = cutDirectionWriters(CutIndices{});
constexpr auto kInputRotationReaders = inputRotationReaders(InputIndices{});
constexpr auto kInputRotationWriters = inputRotationWriters(InputIndices{});
constexpr auto kInputRectReaders = inputRectReaders(InputIndices{});
constexpr auto kInputRectWriters = inputRectWriters(InputIndices{});

std::size_t slot(int index) { return static_cast<std::size_t>(index); }

float clampScalePercent(float percent) {
  // A NaN scale (from a zero-sized frame) is held at the minimum too.
  if (!(percent >= kMinimumScalePercent)) return kMinimumScalePercent;
  return percent > kMaximumScalePercent ? kMaximumScalePercent : percent;
}

}  // namespace

void writeCutPosition(WispHost* host, tagWispAPI* api, genVec2 value, int time, genVec2 frameSize,
                      int index) {
  const genVec2 framePoint = subtract(value, halfFrame(frameSize));
  const std::string id = cutParamId(param::kCutPositionPrefix, index);
  api->SetPointParam(host, id.c_str(), time, &framePoint.x, &framePoint.y, 0);
}

void writeCutDirection(WispHost* host, tagWispAPI* api, float radians, int time, int index) {
  const bool radial = api->GetChoiceParam(host, param::kCutType, 0) == kCutTypeRadial;
  const float degrees = radiansToDegrees(radians) - (radial ? 0.0f : 90.0f);
  const std::string id = cutParamId(param::kCutDirectionPrefix, index);
  api->SetAngleParam(host, id.c_str(), time, degrees, 0);
}

void writeInputRotation(WispHost* host, tagWispAPI* api, float radians, int time, int index) {
  const std::string id = inputParamId(param::kInputFrameRotationPrefix, index);
  api->SetAngleParam(host, id.c_str(), time, radiansToDegrees(radians), 0);
}

InputPlacement placementForRect(genVec4 grabRect, genVec4 newRect, char edgeMask, float rotation,
                                genVec2 frameSize) {
  const float w = frameSize.x;
  const float h = frameSize.y;
  float cx = (newRect.x + newRect.z) / 2.0f;
  float cy = (newRect.y + newRect.w) / 2.0f;
  const float sx = (newRect.z - newRect.x) / w;
  const float sy = (newRect.w - newRect.y) / h;
  const bool anyX = (edgeMask & (kEdgeBitX0 | kEdgeBitX1)) != 0;
  const bool anyY = (edgeMask & (kEdgeBitY0 | kEdgeBitY1)) != 0;

  float s = 0.0f;
  if (anyY && !anyX) {
    s = sy;
  } else if (anyX && !anyY) {
    s = sx;
  } else if (sx < sy) {
    // The taller side wins; the x edge that was not grabbed stays put.
    s = sy;
    if (edgeMask & kEdgeBitX0) {
      cx = newRect.z - s * w / 2.0f;
    } else if (edgeMask & kEdgeBitX1) {
      cx = newRect.x + s * w / 2.0f;
    }
  } else {
    s = sx;
    if (edgeMask & kEdgeBitY0) {
      cy = newRect.w - s * h / 2.0f;
    } else if (edgeMask & kEdgeBitY1) {
      cy = newRect.y + s * h / 2.0f;
    }
  }

  const genVec2 grabCentre{(grabRect.x + grabRect.z) / 2.0f, (grabRect.y + grabRect.w) / 2.0f};
  const genVec2 onScreen = rotateAbout({cx, cy}, grabCentre, rotation);
  return {subtract(onScreen, halfFrame(frameSize)), clampScalePercent(s * 100.0f)};
}

void writeInputRect(WispHost* host, tagWispAPI* api, genVec4 grabRect, genVec4 newRect,
                    char edgeMask, int time, genVec2 frameSize, int index) {
  const float rotation = inputRotationRadians(host, api, time, index);
  const InputPlacement placement =
      placementForRect(grabRect, newRect, edgeMask, rotation, frameSize);
  const std::string translationId = inputParamId(param::kInputFrameTranslationPrefix, index);
  api->SetPointParam(host, translationId.c_str(), time, &placement.translation.x,
                     &placement.translation.y, 0);
  const std::string scaleId = inputParamId(param::kInputFrameScalePrefix, index);
  api->SetFloatParam(host, scaleId.c_str(), time, placement.scalePercent, 0);
}

PointGetter cutPositionGetter() { return &readCutPosition; }
PointSetter cutPositionSetter() { return &writeCutPosition; }
AngleGetter cutDirectionGetter(int cutIndex) { return kCutDirectionReaders.at(slot(cutIndex)); }
AngleSetter cutDirectionSetter(int cutIndex) { return kCutDirectionWriters.at(slot(cutIndex)); }
AngleGetter inputRotationGetter(int inputIndex) {
  return kInputRotationReaders.at(slot(inputIndex));
}
AngleSetter inputRotationSetter(int inputIndex) {
  return kInputRotationWriters.at(slot(inputIndex));
}
QuadGetter inputRectGetter(int inputIndex) { return kInputRectReaders.at(slot(inputIndex)); }
QuadSetter inputRectSetter(int inputIndex) { return kInputRectWriters.at(slot(inputIndex)); }

}  // namespace veltrane
