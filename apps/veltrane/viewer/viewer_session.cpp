// The viewer's scene on the engine: its events, renders, panel edits and saving.
#include "viewer/viewer_session.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <stdexcept>

#include "layouts/layouts.h"
#include "viewer/panel_values.h"

namespace veltrane_viewer {
namespace {

using Clock = std::chrono::steady_clock;

double secondsSince(Clock::time_point start) {
  return std::chrono::duration<double>(Clock::now() - start).count();
}

std::string directoryOf(const std::string& path) {
  std::string parent = std::filesystem::path(path).parent_path().string();
  return parent.empty() ? "." : parent;
}

}  // namespace

namespace {

veltrane_cli::SceneEngineOptions moduleOptions(const std::string& modulePath,
                                               refhost::GlProfile profile,
                                               std::unique_ptr<refhost::GlContext> context) {
  veltrane_cli::SceneEngineOptions options;
  options.modulePath = modulePath;
  options.profile = profile;
  options.context = std::move(context);
  return options;
}

}  // namespace

ViewerSession::ViewerSession(const veltrane_cli::Scene& scene, const std::string& modulePath,
                             refhost::GlProfile profile,
                             std::unique_ptr<refhost::GlContext> context, int32_t frame)
    : ViewerSession(scene, moduleOptions(modulePath, profile, std::move(context)), frame) {}

ViewerSession::ViewerSession(const veltrane_cli::Scene& scene,
                             veltrane_cli::SceneEngineOptions options, int32_t frame)
    : scene_(scene) {
  engine_ = veltrane_cli::startScene(scene_, std::move(options));
  setFrame(frame);
  saved_ = snapshot();
}

std::vector<refhost::ParamState> ViewerSession::snapshot() {
  std::vector<refhost::ParamState> states;
  for (const refhost::Param& param : engine_->panel().params()) states.push_back(param.state);
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

template <typename Event>
refhost::ViewerOutcome ViewerSession::event(const std::string& what, Event&& run) {
  refhost::ViewerOutcome outcome;
  attempt(what, [&] { outcome = run(); });
  return outcome;
}

void ViewerSession::setFrame(int32_t frame) {
  int32_t last = std::max(scene_.composition.duration - 1, 0);
  frame_ = std::clamp(frame, 0, last);
  viewer_.time = frame_;
  engine_->setViewer(viewer_);
}

void ViewerSession::setView(double viewScale, double uiScale, const refhost::Matrix4& projection) {
  viewer_.viewScaleX = viewer_.viewScaleY = viewScale;
  viewer_.uiScale = uiScale;
  viewer_.projection = projection;
  engine_->setViewer(viewer_);
}

void ViewerSession::pointerMove(EventPosition position, bool held) {
  event(wispMessageText(kMessagePointerMove),
        [&] { return engine_->pointerMove(position.x, position.y, held); });
}

bool ViewerSession::pointerPress(EventPosition position) {
  finishEdit();
  return event(wispMessageText(kMessagePointerPress), [&] {
           return engine_->pointerPress(position.x, position.y);
         }).result != 0;
}

void ViewerSession::pointerRelease(EventPosition position) {
  event(wispMessageText(kMessagePointerRelease),
        [&] { return engine_->pointerRelease(position.x, position.y); });
}

bool ViewerSession::key(uint32_t keysym, bool down) {
  const std::string what = wispMessageText(down ? kMessageKeyDown : kMessageKeyUp);
  return event(what, [&] { return engine_->key(keysym, down); }).result == 1;
}

void ViewerSession::openLayerMenu() {
  finishEdit();
  event("the layer menu", [&] { return engine_->openLayerMenu(); });
}

void ViewerSession::editValue(const std::string& id, const refhost::ParamValue& value) {
  const refhost::Param& param = engine_->param(id);
  refhost::ParamState state = stateAfterEdit(param, frame_, value);
  if (state == param.state) return;
  if (editing_ != id) {
    finishEdit();
    engine_->beginEdit(editStepName(engine_->panel(), param));
    editing_ = id;
  }
  attempt("message 7 for " + id, [&] { engine_->edit(id, state); });
}

void ViewerSession::finishEdit() {
  if (editing_.empty()) return;
  engine_->endEdit();
  editing_.clear();
}

void ViewerSession::toggleKey(const std::string& id) {
  finishEdit();
  const refhost::Param& param = engine_->param(id);
  engine_->beginEdit(keyToggleStepName(engine_->panel(), param, frame_));
  attempt("message 7 for " + id, [&] { engine_->edit(id, stateAfterKeyToggle(param, frame_)); });
  engine_->endEdit();
}

void ViewerSession::applyEdits(const std::string& stepName,
                               const std::vector<veltrane_cli::ParamEdit>& edits) {
  finishEdit();
  engine_->beginEdit(stepName);
  attempt(stepName, [&] {
    std::vector<std::pair<std::string, refhost::ParamState>> states;
    for (const veltrane_cli::ParamEdit& edit : edits) {
      refhost::ParamState state;  // these values hold at every frame
      state.value = edit.value;
      states.emplace_back(edit.id, state);
    }
    engine_->edit(states);
  });
  engine_->endEdit();
}

veltrane_cli::Point ViewerSession::pictureSizeOf(const std::string& layerGuid) const {
  const refhost::Composition& composition = scene_.composition;
  const refhost::MediaSpec* media = &composition.source;
  for (const refhost::CompositionLayer& layer : composition.layers)
    if (layer.layer.guid == layerGuid) media = &layer.media;
  const refhost::MediaInfo info = media->info.value_or(refhost::MediaInfo{});
  return veltrane_cli::contentSize(info.width, info.height, media->keepProportions,
                                   composition.width, composition.height);
}

void ViewerSession::applyPreset(std::size_t index) {
  std::vector<std::string> sources{refhost::kNoLayer};
  for (const refhost::CompositionLayer& layer : scene_.composition.layers)
    sources.push_back(layer.layer.guid);
  std::vector<veltrane_cli::Point> pictureSizes;
  for (const std::string& source : sources) pictureSizes.push_back(pictureSizeOf(source));
  const refhost::Composition& composition = scene_.composition;
  const veltrane_cli::LayoutPlan plan =
      veltrane_cli::planLayout(index, composition.width, composition.height);
  applyEdits(std::string("Preset ") + veltrane_cli::layouts().at(index).menuName,
             veltrane_cli::layoutEdits(*engine_, plan, sources, pictureSizes));
}

void ViewerSession::fitPicturesToRegions() {
  const refhost::EffectVocabulary& roles = engine_->vocabulary();
  applyEdits("Fit pictures to regions",
             veltrane_cli::framingEdits(*engine_, frame_, [&](int32_t input) {
               const refhost::ParamValue layer =
                   engine_->valueAt(roles.id(refhost::InputParam::Layer, input), frame_);
               return pictureSizeOf(std::string(layer.layer));
             }));
}

bool ViewerSession::undo() {
  finishEdit();
  return event("undo", [&] { return engine_->undoSteps(1); }).result == 1;
}

bool ViewerSession::redo() {
  finishEdit();
  return event("redo", [&] { return engine_->redoSteps(1); }).result == 1;
}

int32_t ViewerSession::previewDivisor() const {
  // Each halving of the size takes about three quarters of the render's time away.
  constexpr double kPreviewBudget = 0.040;
  for (int32_t divisor : {1, 2})
    if (lastFullRenderSeconds_ / (divisor * divisor) <= kPreviewBudget) return divisor;
  return 4;
}

bool ViewerSession::renderIfChanged(bool preview) {
  const int32_t divisor = preview ? previewDivisor() : 1;
  std::vector<refhost::ParamState> now = snapshot();
  if (renderedFrame_ == frame_ && now == shown_ && renderedDivisor_ == divisor) return false;
  shown_ = std::move(now);
  renderedFrame_ = frame_;
  renderedDivisor_ = divisor;
  Clock::time_point start = Clock::now();
  attempt("render of frame " + std::to_string(frame_),
          [&] { picture_ = engine_->renderPreview(frame_, divisor); });
  const double seconds = secondsSince(start);
  if (divisor == 1) lastFullRenderSeconds_ = seconds;
  stats_.renderSeconds += seconds;
  ++stats_.renders;
  if (divisor > 1) ++stats_.previews;
  return true;
}

void ViewerSession::drawOverlay(uint32_t texture, int32_t width, int32_t height) {
  Clock::time_point start = Clock::now();
  attempt("overlay", [&] { engine_->drawOverlay(texture, width, height); });
  stats_.overlaySeconds += secondsSince(start);
  ++stats_.overlays;
}

bool ViewerSession::modified() { return snapshot() != saved_; }

void ViewerSession::save(const std::string& path) {
  writeCopy(path);
  saved_ = snapshot();
}

void ViewerSession::writeCopy(const std::string& path) {
  finishEdit();
  veltrane_cli::writeScene(path,
                           veltrane_cli::savedScene(scene_, engine_->panel(), directoryOf(path)));
}

}  // namespace veltrane_viewer
