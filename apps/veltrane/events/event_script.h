// Event scripts: the viewer settings and the sequence of pointer, key, menu and undo events
// that `veltrane interact` replays, read and checked field by field.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "host/wisp_protocol.h"

namespace veltrane_cli {

struct ViewerEvent {
  enum class Kind { Press, Move, Release, KeyDown, KeyUp, Pick, LayerMenu, Undo, Redo };
  Kind kind = Kind::Move;
  int32_t x = 0, y = 0;  // pointer events: corner space
  uint32_t key = 0;      // key events
  int32_t count = 0;     // pick: the menu answer; undo and redo: how many steps
};

struct EventScript {
  double viewScaleX = 1.0;
  double viewScaleY = 1.0;
  double uiScale = 1.0;
  int32_t hostId = 0;
  int32_t time = 0;
  std::vector<ViewerEvent> events;
};

// Throws FieldError naming the file, the field and what was expected.
EventScript loadEventScript(const std::string& path);

}  // namespace veltrane_cli
