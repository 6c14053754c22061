// Parameter ids of the effect and the rules that build the indexed ones. Every subsystem reads
// and writes parameters only through these names.
#pragma once

#include <string>

namespace veltrane {

constexpr int kMaxCuts = 8;
constexpr int kInputCount = 9;

namespace param {
constexpr const char* kPreset = "preset";
constexpr const char* kCutType = "cutType";
constexpr const char* kNumberOfCuts = "numberOfCuts";
constexpr const char* kViewCutRegions = "viewCutRegions";
constexpr const char* kCutPositionGlobal = "cutPosition_global";
constexpr const char* kCutPositionPrefix = "cutPosition_";
constexpr const char* kCutDirectionPrefix = "cutDirection_";
constexpr const char* kInputLayerPrefix = "inputLayer";
constexpr const char* kInputFrameShiftPrefix = "inputFrameShift";
constexpr const char* kInputFrameTranslationPrefix = "inputFrameTranslation";
constexpr const char* kInputFrameScalePrefix = "inputFrameScale";
constexpr const char* kInputFrameRotationPrefix = "inputFrameRotation";
constexpr const char* kBorderWidth = "borderWidth";
constexpr const char* kBorderColor = "borderColor";
constexpr const char* kBorderAlpha = "borderAlpha";
}  // namespace param

// cutType choice index of Radial cuts.
constexpr int kCutTypeRadial = 1;

// Layer GUID text meaning "no layer".
constexpr const char* kNullLayerGuid = "00000000-0000-0000-0000-000000000000";
constexpr int kGuidTextLength = 36;
// Buffers handed to GetLayerParam and GetLayerInfo.
constexpr int kGuidBufferSize = 40;

// Cut ids carry an underscore before the index ("cutPosition_3"), already part of the prefix.
inline std::string cutParamId(const char* prefix, int cutIndex) {
  return std::string(prefix) + std::to_string(cutIndex);
}

// Input ids append the index with no separator ("inputLayer4").
inline std::string inputParamId(const char* prefix, int inputIndex) {
  return std::string(prefix) + std::to_string(inputIndex);
}

// Which inputs the layout shows: input j is in use for j <= n cuts, except that Radial layouts
// never show input 0.
inline bool inputInUse(int inputIndex, int numberOfCuts, bool radial) {
  return inputIndex <= numberOfCuts && !(radial && inputIndex == 0);
}

}  // namespace veltrane
