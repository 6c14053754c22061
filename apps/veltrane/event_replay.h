// Replays an event script on a scene running in the plug-in, as a viewer would deliver the
// events, and gathers the outcome: parameter values, undo steps, cursors and every message's
// answer; optionally the frame with its overlay after each event.
#pragma once

#include <nlohmann/json.hpp>

#include "event_script.h"
#include "refhost/frame_output.h"
#include "scene_session.h"

namespace veltrane_cli {

class EventReplay {
 public:
  EventReplay(SceneSession& session, const EventScript& script);

  // Plays every event in order. After each one the host reports every parameter whose value
  // changed with message 7, as it does after any edit. With `overlays`, the frame at the
  // script's time is rendered (message 10) and the overlay drawn over it (message 1003), one
  // picture per event. Returns {"params", "undoSteps", "redoSteps", "cursors", "popupMenus",
  // "results"}, where results[i] lists {"message", "result"} for each message event i sent.
  nlohmann::ordered_json play(refhost::FrameSink* overlays);

 private:
  int32_t sendPointer(int32_t message, const ViewerEvent& event, double button);
  int32_t sendKey(int32_t message, uint32_t key);
  void openLayerMenu();
  void reportChanges(const std::vector<refhost::ParamState>& before);
  refhost::RgbaImage frameWithOverlay();
  int32_t send(int32_t message, void* context, void* event,
               std::initializer_list<int32_t> expected);

  SceneSession& session_;
  const EventScript& script_;
  WispViewerContext viewer_{};
  nlohmann::ordered_json sent_;  // the messages of the event being played
};

}  // namespace veltrane_cli
