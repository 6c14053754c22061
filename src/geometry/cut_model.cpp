// Reading cuts from the host's parameters and ordering them into a cut list.
#include "geometry/cut_model.h"

#include <algorithm>
#include <cmath>
#include <string>

#include "common/param_ids.h"
#include "geometry/angles.h"

namespace veltrane {

namespace {

using plugin_glsl_types::genVec2;

bool isRadialCutType(int32_t cutType) { return cutType == kCutTypeRadial; }

// Moves a coordinate one pixel inside [-extent/2, extent/2]. The lower bound is tested first, so
// in a frame narrower than two pixels every value not below the lower bound ends at the upper
// one. NaN is not below the lower bound and, as std::min keeps its first argument when the
// second is unordered, ends at the upper bound too.
float clampOnePixelInside(float value, float extent) {
  const float lower = 1.0f - extent / 2.0f;
  if (lower > value) return lower;
  return std::min(extent / 2.0f - 1.0f, value);
}

genVec2 readPoint(WispHost* host, const tagWispAPI* api, const char* id, int32_t time) {
  // A host that leaves the point unwritten gives the origin.
  genVec2 point;
  api->GetPointParam(host, id, time, &point.x, &point.y);
  return point;
}

// The sort key of the list: Local cuts first, then ascending angle, then (Radial cuts of equal
// angle) ascending position x and y. NaN angles are unordered and never move past each other.
bool sortsBefore(const Cut& a, const Cut& b) {
  if (a.radial != b.radial) return a.radial == 0;
  if (a.angle < b.angle) return true;
  if (!(a.angle == b.angle) || a.radial == 0) return false;
  if (a.positionX < b.positionX) return true;
  if (!(a.positionX == b.positionX)) return false;
  return a.positionY < b.positionY;
}

bool sameCut(const Cut& a, const Cut& b) {
  return a.radial == b.radial && a.angle == b.angle && a.positionX == b.positionX &&
         a.positionY == b.positionY;
}

// Stable insertion sort: a handful of cuts, and it stays in bounds whatever the comparison
// answers for NaN keys.
template <class Before>
void insertionSort(CutList& cuts, Before before) {
  for (std::size_t i = 1; i < cuts.size(); ++i) {
    const Cut moving = cuts[i];
    std::size_t j = i;
    for (; j > 0 && before(moving, cuts[j - 1]); --j) cuts[j] = cuts[j - 1];
    cuts[j] = moving;
  }
}

}  // namespace

Cut readCut(WispHost* host, const tagWispAPI* api, int index, int32_t time, genVec2 frameSize,
            bool pixelAspectPresent, float pixelAspect) {
  const bool radial = isRadialCutType(api->GetChoiceParam(host, param::kCutType, time));
  const genVec2 position =
      radial ? readPoint(host, api, param::kCutPositionGlobal, time)
             : readPoint(host, api, cutParamId(param::kCutPositionPrefix, index).c_str(), time);

  const float aspect = pixelAspectPresent ? pixelAspect : 1.0f;
  const float y = clampOnePixelInside(position.y, frameSize.y);
  const float x = clampOnePixelInside(position.x * aspect, frameSize.x);

  const float degrees =
      api->GetAngleParam(host, cutParamId(param::kCutDirectionPrefix, index).c_str(), time);
  const float angle = wrapAngle(degreesToRadians(degrees));

  // The pixel aspect stretches the direction as it stretches positions, so the cut keeps its
  // angle on screen.
  const float dx = std::sin(angle) * aspect;
  const float dy = std::cos(angle);
  const float length = std::sqrt(dx * dx + dy * dy);

  Cut cut;
  cut.positionX = x;
  cut.positionY = y;
  cut.directionX = dx / length;
  cut.directionY = dy / length;
  cut.angle = angle;
  cut.radial = radial ? 1 : 0;
  cut.cutNumber = index + 1;
  return cut;
}

CutList readCutList(WispHost* host, const tagWispAPI* api, int32_t time, genVec2 frameSize,
                    bool pixelAspectPresent, float pixelAspect) {
  const int32_t count =
      std::min(api->GetIntParam(host, param::kNumberOfCuts, time), static_cast<int32_t>(kMaxCuts));
  CutList cuts;
  cuts.reserve(kMaxCuts);
  for (int index = 0; index < count; ++index) {
    cuts.push_back(readCut(host, api, index, time, frameSize, pixelAspectPresent, pixelAspect));
  }
  return removeRepeatedCuts(std::move(cuts));
}

CutList removeRepeatedCuts(CutList cuts) {
  insertionSort(cuts, sortsBefore);
  CutList kept;
  kept.reserve(cuts.size());
  for (const Cut& cut : cuts) {
    if (kept.empty() || !sameCut(cut, kept.back())) kept.push_back(cut);
  }
  insertionSort(kept, [](const Cut& a, const Cut& b) { return a.cutNumber < b.cutNumber; });
  return kept;
}

genVec2 cutControlPosition(WispHost* host, const tagWispAPI* api, int32_t time, int index,
                           genVec2 frameSize) {
  const genVec2 position =
      readPoint(host, api, cutParamId(param::kCutPositionPrefix, index).c_str(), time);
  return {position.x + frameSize.x / 2.0f, position.y + frameSize.y / 2.0f};
}

float cutControlAngle(WispHost* host, const tagWispAPI* api, int32_t time, int index) {
  // The cut type is a layout choice, read at time 0 like the partition's.
  const bool radial = isRadialCutType(api->GetChoiceParam(host, param::kCutType, 0));
  const float degrees =
      api->GetAngleParam(host, cutParamId(param::kCutDirectionPrefix, index).c_str(), time);
  return degreesToRadians(degrees + (radial ? 0.0f : 90.0f));
}

}  // namespace veltrane
