// Replays an event script on a scene running in the plug-in, as a viewer would deliver the
// events, and gathers the outcome: parameter values, undo steps, cursors and every message's
// answer; optionally the frame with its overlay after each event.
#pragma once

#include <nlohmann/json.hpp>

#include "event_script.h"
#include "refhost/pipeline/frame_output.h"
#include "scene_session.h"

namespace veltrane_cli {

class EventReplay {
 public:
  EventReplay(SceneSession& session, const EventScript& script);
  ~EventReplay();
  EventReplay(const EventReplay&) = delete;
  EventReplay& operator=(const EventReplay&) = delete;

  // Plays every event in order. After each one the host reports every parameter whose value
  // changed with message 7, as it does after any edit, and asks the plug-in what its viewer
  // shows (see viewerState). With `overlays`, the frame at the script's time is rendered
  // (message 10) and the overlay drawn over it (message 1003), one picture per event. Returns
  // {"params", "undoSteps", "redoSteps", "openUndoStep", "cursors", "selectedInputs", "hover",
  // "popupMenus", "results"}, where results[i] lists {"message", "result"} for each message
  // event i sent ({"message", "param", "result"} for message 7).
  nlohmann::ordered_json play(refhost::FrameSink* overlays);

 private:
  struct ViewerState {
    nlohmann::ordered_json selectedInput;  // an input index, or null
    bool hover = false;
  };

  int32_t sendPointer(int32_t message, const ViewerEvent& event, double button);
  int32_t sendKey(int32_t message, uint32_t key);
  void openLayerMenu();
  void reportChanges(const std::vector<refhost::ParamState>& before);
  // Learnt as a host can learn it, from messages that change nothing in the plug-in: the
  // overlay (1003) reads the parameters of the selected input's handles and of no other input,
  // and the query 1012 answers whether the pointer is over the selected input's region, the
  // condition for the layer menu. Neither message counts among the event's results.
  ViewerState viewerState();
  // Message 1003 with the host's framebuffer showing the texture.
  void drawOverlay(uint32_t texture, int32_t width, int32_t height);
  refhost::RgbaImage frameWithOverlay();
  int32_t send(int32_t message, void* context, void* event, std::initializer_list<int32_t> expected,
               const char* param = nullptr);
  int32_t sendUnrecorded(int32_t message, void* context, void* event,
                         std::initializer_list<int32_t> expected);

  SceneSession& session_;
  const EventScript& script_;
  WispViewerContext viewer_{};
  uint32_t probeTarget_ = 0;     // a host texture the overlay of viewerState() is drawn into
  nlohmann::ordered_json sent_;  // the messages of the event being played
};

}  // namespace veltrane_cli
