// The engine: the module's lifecycle, checked messages, parameter changes and their reports,
// renders and the viewer's events.
#include "refhost/engine.h"

#include <new>
#include <utility>

namespace refhost {
namespace {

std::string expectedText(std::initializer_list<int32_t> expected) {
  std::string text;
  for (int32_t value : expected) text += (text.empty() ? "" : " or ") + std::to_string(value);
  return text;
}

// Runs `undo` when the scope ends, by return or by exception: what a step set up for one
// message (records, a draw target, a scale) never outlives it.
template <typename Undo>
class OnExit {
 public:
  explicit OnExit(Undo undo) : undo_(std::move(undo)) {}
  ~OnExit() { undo_(); }
  OnExit(const OnExit&) = delete;
  OnExit& operator=(const OnExit&) = delete;

 private:
  Undo undo_;
};

Module loadModule(const EngineOptions& options) {
  if (options.entryPoints) return Module(*options.entryPoints, options.modulePath);
  return Module(options.modulePath);
}

}  // namespace

Engine::Engine(EngineOptions options)
    : module_(loadModule(options)),
      host_(std::make_unique<Host>(module_)),
      documentName_(std::move(options.documentName)),
      onHostProblem_(std::move(options.onHostProblem)),
      onMessage_(std::move(options.onMessage)) {
  host_->setHostId(options.hostId);
  HostInstruments instruments = options.instruments;
  if (onMessage_ && !instruments.callLog) instruments.callLog = &messageCalls_;
  host_->setInstruments(instruments);
  if (options.context)
    host_->attachGl(std::move(options.context));
  else if (options.makeContext)
    host_->attachGl(options.makeContext(options.profile));
  setViewer(ViewerSettings{});
}

Engine::~Engine() {
  try {
    if (probeTarget_) host_->deleteTexture(probeTarget_);
    if (instance_) host_->send(kMessageDestroyInstance);
    if (loaded_) host_->send(kMessageUnload);
  } catch (...) {
    // Already on a failure path; the first error is the one worth reporting.
  }
  host_.reset();
}

void Engine::setFrameSettings(const FrameSettings& settings) {
  settings_ = settings;
  host_->setTimeInfo(settings.width, settings.height, settings.frameRate);
  host_->setFrameFormat(settings.format);
  ViewerSettings viewer;
  viewer.viewScaleX = viewer_.viewScaleX;
  viewer.viewScaleY = viewer_.viewScaleY;
  viewer.uiScale = viewer_.uiScale;
  viewer.time = viewer_.time;
  setViewer(viewer);
}

GlContext& Engine::gl() {
  if (!host_->gl())
    throw std::logic_error(
        "the engine was given no GL context (EngineOptions::context or "
        "makeContext) and cannot draw");
  return *host_->gl();
}

int32_t Engine::send(int32_t message, void* context, void* event,
                     std::initializer_list<int32_t> expected) {
  if (Host::isDrawingMessage(message) || message == kMessagePrepareGl) gl();
  GlContext* gl = host_->gl();
  if (gl) gl->clearErrors();
  // The engine's own log holds the calls of this message only: never more than one message's
  // worth over a long render.
  messageCalls_.clear();
  int32_t result = 0;
  {
    host_->setRenderContext(context);
    host_->setEvent(event);
    OnExit records([&] {
      host_->setRenderContext(nullptr);
      host_->setEvent(nullptr);
    });
    result = host_->send(message);
  }
  if (onMessage_) onMessage_(message, result, messageCalls_.lines());
  reportProblems();
  // Nothing reads the host's message history or frame requests; over a long render they
  // would grow by every message.
  host_->clearMessageHistory();
  host_->clearFrameRequests();
  collectViewerRecords();
  const std::string what = wispMessageText(message);
  bool accepted = expected.size() == 0;
  for (int32_t value : expected) accepted = accepted || value == result;
  if (!accepted)
    throw std::runtime_error(what + " answered " + std::to_string(result) + ", expected " +
                             expectedText(expected));
  if (host_->outstandingTextures() > 0 || host_->outstandingBuffers() > 0)
    throw std::runtime_error(what + " left " + std::to_string(host_->outstandingTextures()) +
                             " texture(s) and " + std::to_string(host_->outstandingBuffers()) +
                             " buffer(s) with the plug-in that it did not give back");
  if (gl && !gl->errors().empty())
    throw std::runtime_error(what + " caused " + std::to_string(gl->errors().size()) +
                             " GL error(s), the first: " + gl->errors().front().text);
  return result;
}

void Engine::reportProblems() {
  for (const std::string& problem : host_->problems()) {
    if (reportedProblems_.insert(problem).second && onHostProblem_) onHostProblem_(problem);
  }
  host_->clearProblems();
}

void Engine::collectViewerRecords() {
  if (!host_->cursorShapes().empty()) cursor_ = host_->cursorShapes().back();
  redrawRequested_ = redrawRequested_ || host_->redrawCount() > 0;
  host_->clearCursorsAndRedraws();
}

void Engine::start() {
  send(kMessageLoad);
  loaded_ = true;
  send(kMessageDeclareParameters);
  vocabulary_.emplace(host_->panel());
  reported_ = snapshot();
}

const EffectVocabulary& Engine::vocabulary() const {
  if (!vocabulary_) throw std::logic_error("the module's parameters are declared by start()");
  return *vocabulary_;
}

void Engine::setLayer(std::size_t index, const Layer& layer) { host_->layers().at(index) = layer; }

void Engine::createInstance() {
  send(kMessageCreateInstance);
  instance_ = true;
  send(kMessagePrepareGl);
  reportChanges();
}

void Engine::finish() {
  if (instance_) {
    instance_ = false;
    send(kMessageDestroyInstance);
  }
  if (loaded_) {
    loaded_ = false;
    send(kMessageUnload);
  }
}

std::vector<ParamState> Engine::snapshot() const {
  std::vector<ParamState> states;
  states.reserve(host_->panel().params().size());
  for (const Param& param : host_->panel().params()) states.push_back(param.state);
  return states;
}

std::vector<SentMessage> Engine::reportChanges() {
  std::vector<SentMessage> sent;
  if (!instance_) return sent;
  const std::vector<Param>& params = host_->panel().params();
  for (std::size_t i = 0; i < params.size() && i < reported_.size(); ++i) {
    if (params[i].state == reported_[i]) continue;
    reported_[i] = params[i].state;
    WispParamEvent event{params[i].id.c_str()};
    sent.push_back(SentMessage{kMessageParameterChanged,
                               send(kMessageParameterChanged, nullptr, &event, {1}), params[i].id});
  }
  return sent;
}

void Engine::setParam(const std::string& id, const ParamValue& value) {
  host_->setValue(id, value);
  reportChanges();
}

void Engine::setParams(const std::vector<std::pair<std::string, ParamState>>& states) {
  for (const auto& [id, state] : states) host_->editStateWithoutUndo(id, state);
  if (!instance_) return;
  const std::vector<Param>& params = host_->panel().params();
  for (const auto& entry : states) {
    const Param& param = host_->param(entry.first);
    reported_[static_cast<std::size_t>(&param - params.data())] = param.state;
    WispParamEvent event{param.id.c_str()};
    send(kMessageParameterChanged, nullptr, &event, {1});
  }
}

void Engine::beginEdit(const std::string& stepName) { host_->beginEdit(stepName); }

void Engine::edit(const std::string& id, const ParamState& state) {
  host_->editState(id, state);
  reportChanges();
}

void Engine::edit(const std::vector<std::pair<std::string, ParamState>>& states) {
  for (const auto& [id, state] : states) {
    if (!(host_->param(id).state == state)) host_->editState(id, state);
  }
  reportChanges();
}

void Engine::endEdit() { host_->endEdit(); }

bool Engine::undo() {
  bool done = host_->undo();
  reportChanges();
  return done;
}

bool Engine::redo() {
  bool done = host_->redo();
  reportChanges();
  return done;
}

std::optional<std::string> Engine::openUndoStep() const {
  const UndoStack& undo = host_->undoStack();
  if (!undo.isOpen()) return std::nullopt;
  return undo.openStepName();
}

void Engine::throwFrameMemoryError() const {
  const std::size_t layers = host_->layers().empty() ? 0 : host_->layers().size() - 1;
  std::string layerText = layers == 0   ? ""
                          : layers == 1 ? " and 1 layer"
                                        : " and " + std::to_string(layers) + " layers";
  std::string prefix = documentName_.empty() ? "" : documentName_ + ": width, height: ";
  throw FrameMemoryError(prefix + "not enough memory for frames of " +
                         std::to_string(settings_.width) + "x" + std::to_string(settings_.height) +
                         layerText + "; expected a smaller frame size");
}

void Engine::render(RenderFrame& frame) {
  try {
    send(kMessageRequestFrames, &frame.context(), nullptr, {1});
    send(kMessageRender, &frame.context(), nullptr, {1});
  } catch (const std::bad_alloc&) {
    throwFrameMemoryError();
  }
}

void Engine::renderScaled(RenderFrame& frame) {
  const WispRenderContext& context = frame.context();
  if (context.width == settings_.width && context.height == settings_.height) return render(frame);
  host_->setPixelScale(static_cast<double>(context.height) / settings_.height);
  OnExit scale([&] { host_->setPixelScale(1); });
  render(frame);
}

std::unique_ptr<RenderFrame> Engine::prepare(int32_t frame) {
  gl();
  try {
    return std::make_unique<RenderFrame>(*host_, settings_, frame);
  } catch (const std::bad_alloc&) {
    throwFrameMemoryError();
  }
}

std::unique_ptr<RenderFrame> Engine::render(int32_t frame) {
  std::unique_ptr<RenderFrame> rendered = prepare(frame);
  render(*rendered);
  return rendered;
}

std::unique_ptr<RenderFrame> Engine::renderPreview(int32_t frame, int32_t divisor) {
  if (divisor <= 1) return render(frame);
  gl();
  FrameSettings preview = settings_;
  preview.width = std::max(1, settings_.width / divisor);
  preview.height = std::max(1, settings_.height / divisor);
  auto rendered = std::make_unique<RenderFrame>(*host_, preview, frame);
  renderScaled(*rendered);
  return rendered;
}

void Engine::render(int32_t frame, const CallerTextures& textures) {
  gl();
  FrameSettings settings = settings_;
  settings.width = textures.output.imageWidth;
  settings.height = textures.output.imageHeight;
  RenderFrame rendered(*host_, settings, frame, textures.source, textures.output);
  renderScaled(rendered);
}

TextureRecord Engine::createTexture(int32_t width, int32_t height, const void* pixels) {
  gl();
  return host_->createTexture(width, height, pixels);
}

void Engine::deleteTexture(uint32_t id) { host_->deleteTexture(id); }

void Engine::setViewer(const ViewerSettings& settings) {
  viewer_ = makeViewerContext(settings_.width, settings_.height, settings.viewScaleX,
                              settings.viewScaleY, settings.uiScale, settings.time);
  if (settings.projection)
    std::copy(settings.projection->begin(), settings.projection->end(), viewer_.projection);
}

ViewerOutcome Engine::viewerEvent(const std::function<int32_t(std::vector<SentMessage>&)>& action) {
  ViewerOutcome outcome;
  const std::vector<ParamState> before = snapshot();
  outcome.result = action(outcome.sent);
  std::vector<SentMessage> reports = reportChanges();
  outcome.sent.insert(outcome.sent.end(), reports.begin(), reports.end());
  const std::vector<Param>& params = host_->panel().params();
  for (std::size_t i = 0; i < params.size() && i < before.size(); ++i) {
    if (!(params[i].state == before[i])) outcome.changedParams.push_back(params[i].id);
  }
  return outcome;
}

int32_t Engine::pointer(int32_t message, int32_t x, int32_t y, double button,
                        std::vector<SentMessage>& sent) {
  WispPointerEvent event{x, y, button};
  int32_t result = send(message, &viewer_, &event, {});
  sent.push_back(SentMessage{message, result, ""});
  return result;
}

ViewerOutcome Engine::pointerPress(int32_t x, int32_t y) {
  return viewerEvent([&](std::vector<SentMessage>& sent) {
    return pointer(kMessagePointerPress, x, y, 1.0, sent);
  });
}

ViewerOutcome Engine::pointerMove(int32_t x, int32_t y, bool held) {
  return viewerEvent([&](std::vector<SentMessage>& sent) {
    return pointer(kMessagePointerMove, x, y, held ? 1.0 : 0.0, sent);
  });
}

ViewerOutcome Engine::pointerRelease(int32_t x, int32_t y) {
  return viewerEvent([&](std::vector<SentMessage>& sent) {
    return pointer(kMessagePointerRelease, x, y, 0.0, sent);
  });
}

ViewerOutcome Engine::key(uint32_t keysym, bool down) {
  return viewerEvent([&](std::vector<SentMessage>& sent) {
    const int32_t message = down ? kMessageKeyDown : kMessageKeyUp;
    WispKeyEvent event{keysym};
    int32_t result = send(message, &viewer_, &event, {0, 1});
    sent.push_back(SentMessage{message, result, ""});
    return result;
  });
}

ViewerOutcome Engine::openLayerMenu() {
  return viewerEvent([&](std::vector<SentMessage>& sent) {
    int32_t over = send(kMessagePointerOverSelection, &viewer_, nullptr, {0, 1});
    sent.push_back(SentMessage{kMessagePointerOverSelection, over, ""});
    if (over != 1) return over;
    WispLayerPickerContext picker{settings_.ownLayerGuid.c_str()};
    int32_t picked = send(kMessagePickLayer, &picker, nullptr, {0, 1});
    sent.push_back(SentMessage{kMessagePickLayer, picked, ""});
    return picked;
  });
}

ViewerOutcome Engine::undoSteps(int32_t steps) {
  return viewerEvent([&](std::vector<SentMessage>&) {
    int32_t done = 0;
    while (done < steps && host_->undo()) ++done;
    return done;
  });
}

ViewerOutcome Engine::redoSteps(int32_t steps) {
  return viewerEvent([&](std::vector<SentMessage>&) {
    int32_t done = 0;
    while (done < steps && host_->redo()) ++done;
    return done;
  });
}

void Engine::drawOverlay(uint32_t texture, int32_t width, int32_t height) {
  host_->setDrawTarget(texture, width, height);
  OnExit target([&] { host_->setDrawTarget(0, 0, 0); });
  send(kMessageDrawOverlay, &viewer_, nullptr, {1});
}

ViewerState Engine::viewerState() {
  if (!probeTarget_ || probeWidth_ != settings_.width || probeHeight_ != settings_.height) {
    if (probeTarget_) host_->deleteTexture(probeTarget_);
    probeTarget_ = host_->createTexture(settings_.width, settings_.height).id;
    probeWidth_ = settings_.width;
    probeHeight_ = settings_.height;
  }
  // The overlay reads the handles' parameters of the selected input and of no other input.
  std::vector<const Param*> read;
  {
    host_->setReadRecord(&read);
    OnExit record([&] { host_->setReadRecord(nullptr); });
    drawOverlay(probeTarget_, probeWidth_, probeHeight_);
  }
  ViewerState state;
  for (const Param* param : read) {
    const auto input = vocabulary().inputOf(param->id);
    if (input && input->first != InputParam::Layer) {
      state.selectedInput = input->second;
      break;
    }
  }
  state.pointerOverSelection = send(kMessagePointerOverSelection, &viewer_, nullptr, {0, 1}) == 1;
  return state;
}

bool Engine::takeRedrawRequest() {
  bool requested = redrawRequested_;
  redrawRequested_ = false;
  return requested;
}

}  // namespace refhost
