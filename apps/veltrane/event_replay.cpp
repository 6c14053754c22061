// Delivering scripted viewer events to the plug-in.
#include "event_replay.h"

#include "scene_params.h"

namespace veltrane_cli {
namespace {

using Kind = ViewerEvent::Kind;

std::vector<refhost::ParamState> snapshot(const refhost::ParamPanel& panel) {
  std::vector<refhost::ParamState> states;
  for (const refhost::Param& param : panel.params()) states.push_back(param.state);
  return states;
}

}  // namespace

EventReplay::EventReplay(SceneSession& session, const EventScript& script)
    : session_(session), script_(script) {
  const refhost::FrameSettings& frame = session.frameSettings();
  viewer_ = refhost::makeViewerContext(frame.width, frame.height, script.viewScaleX,
                                       script.viewScaleY, script.uiScale, script.time);
}

int32_t EventReplay::send(int32_t message, void* context, void* event,
                          std::initializer_list<int32_t> expected) {
  int32_t result = session_.plugin().send(message, context, event, expected);
  sent_.push_back({{"message", message}, {"result", result}});
  return result;
}

int32_t EventReplay::sendPointer(int32_t message, const ViewerEvent& event, double button) {
  WispPointerEvent pointer{event.x, event.y, button};
  return send(message, &viewer_, &pointer, {});
}

int32_t EventReplay::sendKey(int32_t message, uint32_t key) {
  WispKeyEvent event{key};
  return send(message, &viewer_, &event, {0, 1});
}

// The host offers the layer action only when the plug-in says the pointer is over the selected
// input; the plug-in's menu then gets the scripted answer.
void EventReplay::openLayerMenu() {
  if (send(1012, &viewer_, nullptr, {0, 1}) != 1) return;
  WispLayerPickerContext picker{session_.frameSettings().ownLayerGuid.c_str()};
  send(1013, &picker, nullptr, {0, 1});
}

void EventReplay::reportChanges(const std::vector<refhost::ParamState>& before) {
  const std::vector<refhost::Param>& params = session_.host().panel().params();
  for (std::size_t i = 0; i < params.size() && i < before.size(); ++i) {
    if (params[i].state == before[i]) continue;
    WispParamEvent event{params[i].id.c_str()};
    send(7, nullptr, &event, {1});
  }
}

refhost::RgbaImage EventReplay::frameWithOverlay() {
  refhost::Host& host = session_.host();
  refhost::RenderFrame frame(host, session_.frameSettings(), script_.time);
  send(12, &frame.context(), nullptr, {1});
  send(10, &frame.context(), nullptr, {1});
  // The overlay is drawn over the rendered picture, as over a viewer's.
  host.setDrawTarget(frame.context().output.id, frame.context().width, frame.context().height);
  try {
    send(1003, &viewer_, nullptr, {1});
  } catch (...) {
    host.setDrawTarget(0, 0, 0);
    throw;
  }
  host.setDrawTarget(0, 0, 0);
  return frame.readOutput();
}

nlohmann::ordered_json EventReplay::play(refhost::FrameSink* overlays) {
  refhost::Host& host = session_.host();
  nlohmann::ordered_json results = nlohmann::ordered_json::array();
  nlohmann::ordered_json cursors = nlohmann::ordered_json::array();
  bool held = false;
  for (std::size_t i = 0; i < script_.events.size(); ++i) {
    const ViewerEvent& event = script_.events[i];
    sent_ = nlohmann::ordered_json::array();
    std::vector<refhost::ParamState> before = snapshot(host.panel());
    switch (event.kind) {
      case Kind::Press:
        held = true;
        sendPointer(1005, event, 1.0);
        break;
      case Kind::Move:
        sendPointer(1004, event, held ? 1.0 : 0.0);
        break;
      case Kind::Release:
        held = false;
        sendPointer(1006, event, 0.0);
        break;
      case Kind::KeyDown:
        sendKey(1007, event.key);
        break;
      case Kind::KeyUp:
        sendKey(1008, event.key);
        break;
      case Kind::Pick:
        host.queuePopupAnswer(event.count);
        break;
      case Kind::LayerMenu:
        openLayerMenu();
        break;
      case Kind::Undo:
        for (int32_t step = 0; step < event.count; ++step) {
          if (!host.undo()) break;
        }
        break;
      case Kind::Redo:
        for (int32_t step = 0; step < event.count; ++step) {
          if (!host.redo()) break;
        }
        break;
    }
    reportChanges(before);
    const std::vector<int32_t>& shapes = host.cursorShapes();
    cursors.push_back(shapes.empty() ? 0 : shapes.back());
    results.push_back(sent_);
    // The messages of the picture are not the event's.
    if (overlays) overlays->write(static_cast<int32_t>(i), frameWithOverlay());
  }
  return {{"params", paramValuesJson(host.panel())}, {"undoSteps", host.undoStepNames()},
          {"redoSteps", host.redoStepNames()},       {"cursors", cursors},
          {"popupMenus", host.popupMenus()},         {"results", results}};
}

}  // namespace veltrane_cli
