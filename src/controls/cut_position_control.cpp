// Hover, press and drag of a cut's position handle. The hover remembers where the pointer
// meets the segment so that a press can pin the cut's position there without moving the line.
#include "controls/cut_position_control.h"

#include <cmath>
#include <utility>

#include "controls/control_constants.h"
#include "controls/handle_math.h"
#include "controls/undo_names.h"

namespace veltrane {

using namespace handle_math;

SplitScreenCutPositionControl::SplitScreenCutPositionControl(PointSetter setter, PointGetter getter,
                                                             int32_t index)
    : setter(std::move(setter)), getter(std::move(getter)), index(index) {}

bool SplitScreenCutPositionControl::test(WispHost* host, tagWispAPI* api, genVec2 frameSize,
                                         genVec2 segmentStart, genVec2 segmentEnd, genVec2 pointer,
                                         genVec2 viewScale, float button, int time) {
  if (pressed && button > 0.5f) return dragStep(host, api, frameSize, pointer, time);
  return hoverTest(host, api, frameSize, segmentStart, segmentEnd, pointer, viewScale, button,
                   time);
}

bool SplitScreenCutPositionControl::press(WispHost* host, tagWispAPI* api, genVec2 frameSize,
                                          genVec2 segmentStart, genVec2 segmentEnd, genVec2 pointer,
                                          genVec2 viewScale, float /*button*/, int time) {
  hoverTest(host, api, frameSize, segmentStart, segmentEnd, pointer, viewScale, 1.0f, time);
  grabPointer = pointer;
  lastPointer = pointer;
  pressed = hot;
  if (!hot) return false;
  api->BeginUndo(host, cutPositionUndoName(index).c_str());
  grabValue = handlePosition;
  setter(host, api, handlePosition, time, frameSize, index);
  return true;
}

bool SplitScreenCutPositionControl::hoverTest(WispHost* host, tagWispAPI* api, genVec2 frameSize,
                                              genVec2 segmentStart, genVec2 segmentEnd,
                                              genVec2 pointer, genVec2 viewScale, float button,
                                              int time) {
  const bool moved = pointer.x != lastPointer.x || pointer.y != lastPointer.y;
  lastPointer = pointer;
  const genVec2 value = getter(host, api, time, frameSize, index);
  const bool keepPressedHover =
      pressed && button <= 0.5f && api->GetHostId(host) == kHostProductTouch;

  // Only the open segment counts; a zero-length one gives no t and is never hit.
  const genVec2 along = subtract(segmentEnd, segmentStart);
  const float t = dot(subtract(pointer, segmentStart), along) / dot(along, along);
  if (!(t > 0.0f && t < 1.0f)) {
    if (!keepPressedHover && hot) {
      hot = 0;
      api->Redraw(host, 0);
    }
    return false;
  }

  const genVec2 onSegment = add(scaled(segmentStart, 1.0f - t), scaled(segmentEnd, t));
  const float angle = std::atan2(along.x, along.y);
  const genVec2 offset = subtract(pointer, onSegment);
  const bool on = length({offset.x * viewScale.x, offset.y * viewScale.y}) < kReach;

  // The cursor shows the sideways move, across the segment.
  const CursorShape cursor =
      on ? resizeCursorForOctant(octantOfRadians(angle) + 2) : CursorShape::Default;
  api->SetCursor(host, static_cast<int32_t>(cursor));

  if (keepPressedHover) return on;
  grabValue = value;
  handlePosition = onSegment;
  segmentAngle = angle;
  const uint8_t nowHot = on ? 1 : 0;
  const bool hotChanged = nowHot != hot;
  hot = nowHot;
  if (hotChanged || moved) api->Redraw(host, 0);
  return on;
}

bool SplitScreenCutPositionControl::dragStep(WispHost* host, tagWispAPI* api, genVec2 frameSize,
                                             genVec2 pointer, int time) {
  handlePosition = add(subtract(pointer, grabPointer), grabValue);
  setter(host, api, handlePosition, time, frameSize, index);
  hot = 1;
  return true;
}

}  // namespace veltrane
