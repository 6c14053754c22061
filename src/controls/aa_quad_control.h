// The selected input's rectangle: an axis-aligned rectangle in the input's own axes, shown
// turned by the input's rotation. Its edges and corners scale the input.
#pragma once

#include <cstdint>

#include "controls/accessors.h"
#include "controls/control_constants.h"
#include "host/wisp_protocol.h"

namespace veltrane {

class AAQuadControl {
 public:
  AAQuadControl(QuadSetter setter, QuadGetter getter, uint8_t allowMove);

  // While this control owns a drag and the button is held, one drag step; otherwise a hover
  // test that picks the part under the pointer and shows its cursor. `rotation` is the
  // input's rotation in radians. True when a part is under the pointer (or being dragged).
  bool test(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 pointer, genVec2 viewScale,
            float button, int time, float rotation);

  // Picks the part under the pointer and remembers the rectangle and the pointer for the
  // drag. True when a part was grabbed.
  bool press(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 pointer, genVec2 viewScale,
             float button, int time, float rotation);

  // The edges (RectEdgeBit) that dragging a part moves.
  static char edgeMaskOf(ControlPart part);

  QuadSetter setter;
  QuadGetter getter;
  uint8_t pressed = 0;                        // this control owns the current drag
  ControlPart part = ControlPart::None;       // part under the pointer at the last hover test
  genVec2 grabPointer;                        // pointer at press, in the rectangle's own axes
  genVec2 grabOffset;                         // grabbed feature point minus the pointer
  genVec4 grabRect;                           // rectangle at press
  uint8_t allowMove = 0;                      // the inside drags the whole rectangle
  CursorShape cursor = CursorShape::Default;  // chosen by the last hover test

 private:
  bool hoverTest(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 pointer,
                 genVec2 viewScale, float button, int time, float rotation);
  bool dragStep(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 pointer, int time,
                float rotation);
};

}  // namespace veltrane
