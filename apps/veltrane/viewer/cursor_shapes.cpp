// The cursor table; docs/viewer.md shows it to users.
#include "viewer/cursor_shapes.h"

#include <GLFW/glfw3.h>

namespace veltrane_viewer {

int standardCursorFor(int32_t shape) {
  switch (shape) {
    case 3:  // move: a region's picture follows the hand
      return GLFW_HAND_CURSOR;
    case 6:  // resize along 0/180 degrees, that is along y
      return GLFW_VRESIZE_CURSOR;
    case 8:  // resize along 90/270 degrees, along x
      return GLFW_HRESIZE_CURSOR;
    case 7:  // the diagonals and the eight rotation octants have no standard cursor of their
    case 9:  // own; the crosshair says "drag in any direction"
    case 10:
    case 11:
    case 12:
    case 13:
    case 14:
    case 15:
    case 16:
    case 17:
      return GLFW_CROSSHAIR_CURSOR;
    case 19:  // insert a cut: the insertion cursor
      return GLFW_IBEAM_CURSOR;
    default:
      return GLFW_ARROW_CURSOR;
  }
}

}  // namespace veltrane_viewer
