// The viewer's messages to the plug-in, its change reports, renders and panel edits.
#include "viewer_session.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <stdexcept>

#include "layout_presets.h"
#include "panel_values.h"
#include "scene_saving.h"

namespace veltrane_viewer {
namespace {

using Clock = std::chrono::steady_clock;

double secondsSince(Clock::time_point start) {
  return std::chrono::duration<double>(Clock::now() - start).count();
}

nlohmann::ordered_json readDocument(const std::string& path) {
  std::ifstream in(path);
  return nlohmann::ordered_json::parse(in);
}

std::string directoryOf(const std::string& path) {
  std::string parent = std::filesystem::path(path).parent_path().string();
  return parent.empty() ? "." : parent;
}

}  // namespace

ViewerSession::ViewerSession(const veltrane_cli::Scene& scene, const std::string& modulePath,
                             refhost::GlProfile profile,
                             std::unique_ptr<refhost::GlContext> context, int32_t frame)
    : scene_(scene),
      document_(readDocument(scene.file)),
      session_(scene, modulePath, profile, 0, std::move(context)) {
  const refhost::FrameSettings& settings = session_.frameSettings();
  viewer_ = refhost::makeViewerContext(settings.width, settings.height, 1, 1, 1, frame);
  setFrame(frame);
  reported_ = snapshot();
  saved_ = reported_;
}

std::vector<refhost::ParamState> ViewerSession::snapshot() {
  std::vector<refhost::ParamState> states;
  for (const refhost::Param& param : host().panel().params()) states.push_back(param.state);
  return states;
}

template <typename Action>
void ViewerSession::attempt(const std::string& what, Action&& action) {
  try {
    action();
  } catch (const std::exception& error) {
    setStatus(what + ": " + error.what(), true);
    std::fprintf(stderr, "veltrane view: %s\n", status_.c_str());
  }
}

int32_t ViewerSession::send(int32_t message, void* context, void* event,
                            std::initializer_list<int32_t> expected) {
  try {
    int32_t result = session_.plugin().send(message, context, event, expected);
    collectViewerRecords();
    return result;
  } catch (...) {
    collectViewerRecords();
    throw;
  }
}

void ViewerSession::collectViewerRecords() {
  refhost::Host& host = this->host();
  if (!host.cursorShapes().empty()) cursor_ = host.cursorShapes().back();
  redrawRequested_ = redrawRequested_ || host.redrawCount() > 0;
  host.clearViewerRecords();
}

bool ViewerSession::takeRedrawRequest() {
  bool requested = redrawRequested_;
  redrawRequested_ = false;
  return requested;
}

// Every parameter whose state changed since the last report is reported once with message 7,
// in declaration order, as the host does after any edit.
void ViewerSession::reportChanges() {
  const std::vector<refhost::Param>& params = host().panel().params();
  for (std::size_t i = 0; i < params.size() && i < reported_.size(); ++i) {
    if (params[i].state == reported_[i]) continue;
    reported_[i] = params[i].state;
    changedSinceRender_ = true;
    WispParamEvent event{params[i].id.c_str()};
    attempt("message 7 for " + params[i].id, [&] { send(7, nullptr, &event, {1}); });
  }
}

void ViewerSession::setFrame(int32_t frame) {
  int32_t last = std::max(scene_.composition.duration - 1, 0);
  frame_ = std::clamp(frame, 0, last);
  viewer_.time = frame_;
}

void ViewerSession::setView(double viewScale, double uiScale, const refhost::Matrix4& projection) {
  viewer_.viewScaleX = viewer_.viewScaleY = viewScale;
  viewer_.uiScale = uiScale;
  std::copy(projection.begin(), projection.end(), viewer_.projection);
}

int32_t ViewerSession::sendPointer(int32_t message, EventPosition position, double button) {
  WispPointerEvent event{position.x, position.y, button};
  int32_t result = 0;
  attempt("message " + std::to_string(message),
          [&] { result = send(message, &viewer_, &event, {}); });
  reportChanges();
  return result;
}

void ViewerSession::pointerMove(EventPosition position, bool held) {
  sendPointer(1004, position, held ? 1.0 : 0.0);
}

bool ViewerSession::pointerPress(EventPosition position) {
  finishEdit();
  return sendPointer(1005, position, 1.0) != 0;
}

void ViewerSession::pointerRelease(EventPosition position) { sendPointer(1006, position, 0.0); }

bool ViewerSession::key(uint32_t keysym, bool down) {
  WispKeyEvent event{keysym};
  int32_t message = down ? 1007 : 1008;
  int32_t result = 0;
  attempt("message " + std::to_string(message), [&] {
    result = send(message, &viewer_, &event, {0, 1});
  });
  return result == 1;
}

void ViewerSession::openLayerMenu() {
  finishEdit();
  attempt("the layer menu", [&] {
    if (send(1012, &viewer_, nullptr, {0, 1}) != 1) return;
    WispLayerPickerContext picker{session_.frameSettings().ownLayerGuid.c_str()};
    send(1013, &picker, nullptr, {0, 1});
  });
  reportChanges();
}

void ViewerSession::editValue(const std::string& id, const refhost::ParamValue& value) {
  const refhost::Param& param = host().param(id);
  refhost::ParamState state = stateAfterEdit(param, frame_, value);
  if (state == param.state) return;
  if (editing_ != id) {
    finishEdit();
    host().beginEdit(editStepName(host().panel(), param));
    editing_ = id;
  }
  host().editState(id, state);
  reportChanges();
}

void ViewerSession::finishEdit() {
  if (editing_.empty()) return;
  host().endEdit();
  editing_.clear();
}

void ViewerSession::toggleKey(const std::string& id) {
  finishEdit();
  const refhost::Param& param = host().param(id);
  host().beginEdit(keyToggleStepName(host().panel(), param, frame_));
  host().editState(id, stateAfterKeyToggle(param, frame_));
  host().endEdit();
  reportChanges();
}

void ViewerSession::applyPreset(std::size_t index) {
  finishEdit();
  std::vector<std::string> sources{refhost::kNoLayer};
  for (const refhost::CompositionLayer& layer : scene_.composition.layers)
    sources.push_back(layer.layer.guid);
  const refhost::Composition& composition = scene_.composition;
  std::vector<ParamEdit> edits = presetEdits(index, composition.width, composition.height, sources);
  host().beginEdit(std::string("Preset ") + layoutPresets().at(index).name);
  for (const ParamEdit& edit : edits) {
    refhost::ParamState state;  // a preset's values hold at every frame
    state.value = edit.value;
    host().editState(edit.id, state);
  }
  host().endEdit();
  reportChanges();
}

bool ViewerSession::undo() {
  finishEdit();
  bool done = host().undo();
  reportChanges();
  return done;
}

bool ViewerSession::redo() {
  finishEdit();
  bool done = host().redo();
  reportChanges();
  return done;
}

bool ViewerSession::renderIfChanged() {
  if (!changedSinceRender_ && renderedFrame_ == frame_) return false;
  changedSinceRender_ = false;
  renderedFrame_ = frame_;
  Clock::time_point start = Clock::now();
  attempt("render of frame " + std::to_string(frame_),
          [&] { picture_ = session_.renderFrame(frame_); });
  stats_.renderSeconds += secondsSince(start);
  ++stats_.renders;
  return true;
}

void ViewerSession::drawOverlay(uint32_t texture, int32_t width, int32_t height) {
  Clock::time_point start = Clock::now();
  refhost::Host& host = this->host();
  host.setDrawTarget(texture, width, height);
  attempt("overlay", [&] { send(1003, &viewer_, nullptr, {1}); });
  host.setDrawTarget(0, 0, 0);
  stats_.overlaySeconds += secondsSince(start);
  ++stats_.overlays;
}

bool ViewerSession::modified() {
  const std::vector<refhost::Param>& params = host().panel().params();
  for (std::size_t i = 0; i < params.size() && i < saved_.size(); ++i) {
    if (!(params[i].state == saved_[i])) return true;
  }
  return false;
}

void ViewerSession::save(const std::string& path) {
  finishEdit();
  std::string to = directoryOf(path);
  writeScene(path, savedScene(document_, host().panel(), directoryOf(scene_.file), to));
  saved_ = snapshot();
}

}  // namespace veltrane_viewer
