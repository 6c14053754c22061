// A cut's position handle. The whole visible segment of the cut is the grab area; dragging it
// moves the cut's line parallel to itself with the pointer.
#pragma once

#include <cstdint>

#include "controls/accessors.h"

namespace veltrane {

class SplitScreenCutPositionControl {
 public:
  // How close to the segment the pointer must be, in scaled pixels.
  static constexpr float kReach = 15.0f;

  SplitScreenCutPositionControl(PointSetter setter, PointGetter getter, int32_t index);

  // While this control owns a drag and the button is held, one drag step; otherwise a hover
  // test against the segment from segmentStart to segmentEnd (corner space). True when the
  // pointer is on the segment (always during a drag).
  bool test(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 segmentStart,
            genVec2 segmentEnd, genVec2 pointer, genVec2 viewScale, float button, int time);

  // Starts a drag when the pointer is on the segment: opens the undo step and moves the cut's
  // position point onto the clicked point of its line, which leaves the line where it is.
  // True when the drag started.
  bool press(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 segmentStart,
             genVec2 segmentEnd, genVec2 pointer, genVec2 viewScale, float button, int time);

  PointSetter setter;
  PointGetter getter;
  int32_t index = 0;          // the cut this control moves
  uint8_t pressed = 0;        // this control owns the current drag
  uint8_t hot = 0;            // pointer on the segment, or dragging
  genVec2 grabPointer;        // pointer at press
  genVec2 grabValue;          // cut position (corner space) at press
  genVec2 lastPointer;        // pointer at the previous test
  genVec2 handlePosition;     // pointer projected onto the segment; the drawn arrow's centre
  float segmentAngle = 0.0f;  // direction of the segment, radians

 private:
  bool hoverTest(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 segmentStart,
                 genVec2 segmentEnd, genVec2 pointer, genVec2 viewScale, float button, int time);
  bool dragStep(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 pointer, int time);
};

}  // namespace veltrane
