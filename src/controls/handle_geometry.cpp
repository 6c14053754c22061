// Handle placement shared by pointer handling and overlay drawing.
#include "controls/handle_geometry.h"

#include <algorithm>
#include <cmath>
#include <string>

#include "common/param_ids.h"
#include "controls/handle_math.h"
#include "geometry/cut_model.h"
#include "geometry/input_transform.h"

namespace veltrane {

using namespace handle_math;

namespace {

// A Local direction handle's circle radius, in scaled viewer pixels.
constexpr float kCutDirectionCircle = 10.0f;

genVec2 halfFrame(const ViewerMeasures& view) {
  return {view.frameSize.x / 2.0f, view.frameSize.y / 2.0f};
}

genVec2 readPoint(WispHost* host, const tagWispAPI* api, const std::string& id, int time) {
  genVec2 value;
  api->GetPointParam(host, id.c_str(), time, &value.x, &value.y);
  return value;
}

}  // namespace

ViewerMeasures viewerMeasuresOf(const WispViewerContext& context) {
  ViewerMeasures view;
  view.frameSize = {static_cast<float>(context.width), static_cast<float>(context.height)};
  view.viewScale = {narrowToFloat(context.viewScaleX), narrowToFloat(context.viewScaleY)};
  view.uiScale = narrowToFloat(context.uiScale);
  view.time = context.time;
  return view;
}

CutLayout readCutLayout(WispHost* host, const tagWispAPI* api, int time) {
  CutLayout layout;
  layout.cutCount = std::clamp(api->GetIntParam(host, param::kNumberOfCuts, time), 0, kMaxCuts);
  layout.radial = api->GetChoiceParam(host, param::kCutType, 0) == kCutTypeRadial;
  return layout;
}

genVec2 radialCentre(WispHost* host, const tagWispAPI* api, const ViewerMeasures& view) {
  return add(readPoint(host, api, param::kCutPositionGlobal, view.time), halfFrame(view));
}

HandleCircle cutDirectionHandle(WispHost* host, const tagWispAPI* api, const ViewerMeasures& view,
                                bool radial, int cutIndex, genVec2 pointer) {
  if (radial) {
    const genVec2 centre = radialCentre(host, api, view);
    return {centre, length(subtract(pointer, centre))};
  }
  const genVec2 centre = cutControlPosition(host, api, view.time, cutIndex, view.frameSize);
  return {centre,
          kCutDirectionCircle * std::max(view.viewScale.x, view.viewScale.y) * view.uiScale};
}

InputHandle selectedInputHandle(WispHost* host, const tagWispAPI* api, const ViewerMeasures& view,
                                int inputIndex) {
  const genVec2 translation = readPoint(
      host, api, inputParamId(param::kInputFrameTranslationPrefix, inputIndex), view.time);
  const float scale = api->GetFloatParam(
      host, inputParamId(param::kInputFrameScalePrefix, inputIndex).c_str(), view.time);
  InputHandle handle;
  handle.circle = {add(translation, halfFrame(view)), scale * 0.01f * view.frameSize.y / 2.0f};
  handle.rotation = inputRotationRadians(host, api, view.time, inputIndex);
  return handle;
}

float insertedCutHandleAngle(genVec2 centre, genVec2 pointer, bool radial) {
  const float angle = std::atan2(pointer.y - centre.y, centre.x - pointer.x);
  return radial ? angle - kHalfPi : angle;
}

}  // namespace veltrane
