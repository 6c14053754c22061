// Delivering scripted viewer events to the plug-in.
#include "event_replay.h"

#include <cctype>

#include "scene_params.h"
#include "stop_signals.h"

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
  probeTarget_ = session.host().createTexture(frame.width, frame.height).id;
}

EventReplay::~EventReplay() { session_.host().deleteTexture(probeTarget_); }

int32_t EventReplay::sendUnrecorded(int32_t message, void* context, void* event,
                                    std::initializer_list<int32_t> expected) {
  return session_.plugin().send(message, context, event, expected);
}

int32_t EventReplay::send(int32_t message, void* context, void* event,
                          std::initializer_list<int32_t> expected, const char* param) {
  int32_t result = sendUnrecorded(message, context, event, expected);
  nlohmann::ordered_json entry = {{"message", message}};
  if (param) entry["param"] = param;
  entry["result"] = result;
  sent_.push_back(std::move(entry));
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
    send(7, nullptr, &event, {1}, event.id);
  }
}

void EventReplay::drawOverlay(uint32_t texture, int32_t width, int32_t height) {
  refhost::Host& host = session_.host();
  host.setDrawTarget(texture, width, height);
  try {
    sendUnrecorded(1003, &viewer_, nullptr, {1});
  } catch (...) {
    host.setDrawTarget(0, 0, 0);
    throw;
  }
  host.setDrawTarget(0, 0, 0);
}

EventReplay::ViewerState EventReplay::viewerState() {
  refhost::Host& host = session_.host();
  const refhost::FrameSettings& frame = session_.frameSettings();
  drawOverlay(probeTarget_, frame.width, frame.height);
  ViewerState state;
  for (const std::string& line : host.callLog()) {
    // "GetPointParam inputFrameTranslation3 0": the id is the second word; inputs are numbered
    // by the id's last digit.
    std::string::size_type id = line.find(" inputFrame");
    if (id == std::string::npos) continue;
    std::string::size_type end = line.find(' ', id + 1);
    if (end != std::string::npos && std::isdigit(static_cast<unsigned char>(line[end - 1]))) {
      state.selectedInput = line[end - 1] - '0';
      break;
    }
  }
  state.hover = sendUnrecorded(1012, &viewer_, nullptr, {0, 1}) == 1;
  return state;
}

refhost::RgbaImage EventReplay::frameWithOverlay() try {
  refhost::RenderFrame frame(session_.host(), session_.frameSettings(), script_.time);
  sendUnrecorded(12, &frame.context(), nullptr, {1});
  sendUnrecorded(10, &frame.context(), nullptr, {1});
  // The overlay is drawn over the rendered picture, as over a viewer's.
  drawOverlay(frame.context().output.id, frame.context().width, frame.context().height);
  return frame.readOutput();
} catch (const std::bad_alloc&) {
  throw session_.memoryError();
}

nlohmann::ordered_json EventReplay::play(refhost::FrameSink* overlays) {
  refhost::Host& host = session_.host();
  nlohmann::ordered_json results = nlohmann::ordered_json::array();
  nlohmann::ordered_json cursors = nlohmann::ordered_json::array();
  nlohmann::ordered_json selectedInputs = nlohmann::ordered_json::array();
  nlohmann::ordered_json hover = nlohmann::ordered_json::array();
  bool held = false;
  for (std::size_t i = 0; i < script_.events.size(); ++i) {
    throwIfStopped();
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
    ViewerState state = viewerState();
    selectedInputs.push_back(state.selectedInput);
    hover.push_back(state.hover);
    // The messages of the picture are not the event's.
    if (overlays) overlays->write(static_cast<int32_t>(i), frameWithOverlay());
  }
  const refhost::UndoStack& undo = host.undoStack();
  return {{"params", paramValuesJson(host.panel())},
          {"undoSteps", host.undoStepNames()},
          {"redoSteps", host.redoStepNames()},
          {"openUndoStep", undo.isOpen() ? nlohmann::ordered_json(undo.openStepName()) : nullptr},
          {"cursors", cursors},
          {"selectedInputs", selectedInputs},
          {"hover", hover},
          {"popupMenus", host.popupMenus()},
          {"results", results}};
}

}  // namespace veltrane_cli
