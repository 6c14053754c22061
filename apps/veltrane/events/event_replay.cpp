// Delivering scripted viewer events to the plug-in and writing down what came of them.
#include "events/event_replay.h"

#include "cli/stop_signals.h"
#include "refhost/pipeline/frame_readback.h"
#include "scene/scene_params.h"

namespace veltrane_cli {
namespace {

using Kind = ViewerEvent::Kind;

refhost::ViewerOutcome play(refhost::Engine& engine, const ViewerEvent& event, bool& held) {
  switch (event.kind) {
    case Kind::Press:
      held = true;
      return engine.pointerPress(event.x, event.y);
    case Kind::Move:
      return engine.pointerMove(event.x, event.y, held);
    case Kind::Release:
      held = false;
      return engine.pointerRelease(event.x, event.y);
    case Kind::KeyDown:
      return engine.key(event.key, true);
    case Kind::KeyUp:
      return engine.key(event.key, false);
    case Kind::Pick:
      engine.queuePopupAnswer(event.count);
      return {};
    case Kind::LayerMenu:
      return engine.openLayerMenu();
    case Kind::Undo:
      return engine.undoSteps(event.count);
    case Kind::Redo:
      return engine.redoSteps(event.count);
  }
  return {};
}

nlohmann::ordered_json messagesJson(const std::vector<refhost::SentMessage>& sent) {
  nlohmann::ordered_json list = nlohmann::ordered_json::array();
  for (const refhost::SentMessage& message : sent) {
    nlohmann::ordered_json entry = {{"message", message.message}};
    if (!message.param.empty()) entry["param"] = message.param;
    entry["result"] = message.result;
    list.push_back(std::move(entry));
  }
  return list;
}

// The frame at the script's time with the overlay drawn over it, as over a viewer's picture.
refhost::RgbaImage frameWithOverlay(refhost::Engine& engine, int32_t time) {
  std::unique_ptr<refhost::RenderFrame> frame = engine.render(time);
  const WispRenderContext& context = frame->context();
  engine.drawOverlay(context.output.id, context.width, context.height);
  engine.gl().makeCurrent();
  return refhost::readBack(context.output.id, context.width, context.height);
}

}  // namespace

nlohmann::ordered_json replayEvents(refhost::Engine& engine, const EventScript& script,
                                    refhost::FrameSink* overlays) {
  refhost::ViewerSettings viewer;
  viewer.viewScaleX = script.viewScaleX;
  viewer.viewScaleY = script.viewScaleY;
  viewer.uiScale = script.uiScale;
  viewer.time = script.time;
  engine.setViewer(viewer);
  nlohmann::ordered_json results = nlohmann::ordered_json::array();
  nlohmann::ordered_json cursors = nlohmann::ordered_json::array();
  nlohmann::ordered_json selectedInputs = nlohmann::ordered_json::array();
  nlohmann::ordered_json hover = nlohmann::ordered_json::array();
  bool held = false;
  for (std::size_t i = 0; i < script.events.size(); ++i) {
    throwIfStopped();
    refhost::ViewerOutcome outcome = play(engine, script.events[i], held);
    results.push_back(messagesJson(outcome.sent));
    cursors.push_back(engine.cursor());
    refhost::ViewerState state = engine.viewerState();
    selectedInputs.push_back(state.selectedInput ? nlohmann::ordered_json(*state.selectedInput)
                                                 : nlohmann::ordered_json());
    hover.push_back(state.pointerOverSelection);
    // The messages of the picture are not the event's.
    if (overlays) overlays->write(static_cast<int32_t>(i), frameWithOverlay(engine, script.time));
  }
  std::optional<std::string> open = engine.openUndoStep();
  return {{"params", paramValuesJson(engine.panel())},
          {"undoSteps", engine.undoStepNames()},
          {"redoSteps", engine.redoStepNames()},
          {"openUndoStep", open ? nlohmann::ordered_json(*open) : nullptr},
          {"cursors", cursors},
          {"selectedInputs", selectedInputs},
          {"hover", hover},
          {"popupMenus", engine.popupMenus()},
          {"results", results}};
}

}  // namespace veltrane_cli
