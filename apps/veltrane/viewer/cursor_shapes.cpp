// The cursor table; docs/viewer.md shows it to users.
#include "viewer/cursor_shapes.h"

#include <GLFW/glfw3.h>

#include "host/wisp_protocol.h"

namespace veltrane_viewer {

int standardCursorFor(int32_t shape) {
  switch (static_cast<CursorShape>(shape)) {
    case CursorShape::Move:  // a region's picture follows the hand
      return GLFW_HAND_CURSOR;
    case CursorShape::Resize0:  // along 0/180 degrees, that is along y
      return GLFW_VRESIZE_CURSOR;
    case CursorShape::Resize90:  // along 90/270 degrees, along x
      return GLFW_HRESIZE_CURSOR;
    // The diagonals and the eight rotation octants have no standard cursor of their own; the
    // crosshair says "drag in any direction".
    case CursorShape::Resize45:
    case CursorShape::Resize135:
    case CursorShape::Rotate0:
    case CursorShape::Rotate45:
    case CursorShape::Rotate90:
    case CursorShape::Rotate135:
    case CursorShape::Rotate180:
    case CursorShape::Rotate225:
    case CursorShape::Rotate270:
    case CursorShape::Rotate315:
      return GLFW_CROSSHAIR_CURSOR;
    case CursorShape::InsertCut:  // the insertion cursor
      return GLFW_IBEAM_CURSOR;
    case CursorShape::Default:
      break;
  }
  return GLFW_ARROW_CURSOR;
}

}  // namespace veltrane_viewer
