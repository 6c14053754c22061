// Fixed numbers of the on-screen controls: handle placement modes, rectangle parts, the host's
// cursor shapes and the host whose viewer keeps a pressed control's hover state.
#pragma once

#include <cstdint>

namespace veltrane {

// Where a rotation handle sits relative to its circle.
enum class HandleMode : int32_t {
  Outside = 0,  // centred half a handle beyond the circle
  Inside = 1,   // centred half a handle within it
  OnCircle = 2,
};

// The part of a rectangle under the pointer.
enum class ControlPart : int32_t {
  None = 0,
  EdgeX0 = 1,
  EdgeX1 = 2,
  EdgeY0 = 3,
  EdgeY1 = 4,
  CornerX0Y0 = 5,
  CornerX1Y0 = 6,
  CornerX0Y1 = 7,
  CornerX1Y1 = 8,
  Inside = 9,
};

// Edges a rectangle drag moves, one bit each.
enum RectEdgeBit : char {
  kEdgeBitY0 = 1,
  kEdgeBitX1 = 2,
  kEdgeBitY1 = 4,
  kEdgeBitX0 = 8,
};

// Cursor numbers the host understands. Resize cursors name the axis they move along and
// rotate cursors the octant of the handle, both with 0 degrees pointing along +y.
enum class CursorShape : int32_t {
  Default = 0,
  Move = 3,
  Resize0 = 6,  // along 0/180 degrees
  Resize45 = 7,
  Resize90 = 8,
  Resize135 = 9,
  Rotate0 = 10,  // first of eight, one per octant
  Rotate315 = 17,
  InsertCut = 19,
};

// Host product code of the viewer that keeps hover state through button-up moves of a
// pressed control, draws every rotation handle highlighted, hides the move arrows and drops
// the input selection after each release.
constexpr int32_t kStickyHoverHostId = 3000;

}  // namespace veltrane
