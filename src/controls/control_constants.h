// Fixed numbers of the on-screen controls: handle placement modes, rectangle parts and the edges
// a rectangle drag moves. The host's cursor shapes and product codes are in wisp_protocol.h.
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

}  // namespace veltrane
