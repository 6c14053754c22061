// The window's cursor for each cursor number the plug-in asks for: the nearest of the standard
// cursors every platform offers (arrow, I-beam, crosshair, hand, horizontal and vertical resize).
#pragma once

#include <cstdint>

namespace veltrane_viewer {

// A GLFW standard cursor shape (GLFW_ARROW_CURSOR, ...); unknown numbers get the arrow.
int standardCursorFor(int32_t shape);

}  // namespace veltrane_viewer
