// The one way to drive a loaded plug-in module: an engine starts the module and its GL, creates
// one instance of the effect, renders composition frames into textures, reports parameter
// changes, delivers the viewer's pointer and key events and layer-menu answers, draws the
// overlay, and hands back what came of each as values. Every command of the reference host,
// its viewer and the bridges to other host frameworks drive the module through it.
//
// A front end does four things (see docs/architecture.md for a whole example):
//
//   refhost::EngineOptions options;
//   options.modulePath = "lib/veltrane.so";
//   options.context = myContext;                      // or makeContext, see below
//   refhost::Engine engine(std::move(options));     // loads the module
//   engine.setFrameSettings({1920, 1080, 25.0});     // the composition's frame
//   engine.setSourceFrames(mySource);                // where the effect's own input comes from
//   engine.start();                                  // messages 0 and 2: the panel is declared
//   engine.setParam("numberOfCuts", refhost::ParamValue::ofInt(2));
//   engine.createInstance();                         // messages 3 and 8, then 7 per change
//   std::unique_ptr<refhost::RenderFrame> frame = engine.render(12);  // messages 12 and 10
//   ... frame->context().output.id is the rendered texture ...
//   engine.finish();                                 // messages 4 and 1
//
// Every message is checked: an answer the message never gives, a texture or buffer the plug-in
// kept, or a GL error throws std::runtime_error naming the message. The engine and the module
// are driven from one thread, the one the GL context belongs to.
//
// The engine and the host core below it depend on no platform library: the GL context comes
// from the caller (a window's, an editor's, a canvas's, or a headless one from
// refhost/gl/headless_context.h) and pictures arrive as FrameSource functions that a front end's
// decoders implement. examples/render_one_frame.cpp is a whole front end on this header alone.
#pragma once

#include <cstdint>
#include <functional>
#include <initializer_list>
#include <memory>
#include <optional>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

#include "refhost/core/effect_vocabulary.h"
#include "refhost/core/host.h"
#include "refhost/core/instruments.h"
#include "refhost/core/module.h"
#include "refhost/core/params.h"
#include "refhost/engine/render_frame.h"
#include "refhost/gl/gl_context.h"

namespace refhost {

struct EngineOptions {
  // The module's file, loaded through the platform's loader; or, for a module linked into the
  // program, its entry points (then `modulePath` only names it in messages).
  std::string modulePath;
  std::optional<ModuleEntryPoints> entryPoints;
  GlProfile profile = GlProfile::Core;
  // The context the engine draws in, made current: adopted from a window, an editor or a
  // canvas (GlContext::adoptCurrent), or a headless one (makeHeadlessContext). Without one the
  // engine asks `makeContext` for one of `profile`; with neither it runs without GL, for
  // messages that draw nothing (loading, declaring, instances).
  std::unique_ptr<GlContext> context;
  std::function<std::unique_ptr<GlContext>(GlProfile)> makeContext;
  // The host product code GetHostId answers from the start.
  int32_t hostId = 0;
  // What failures name as the document they come from, e.g. a scene file: "scene.json".
  std::string documentName;
  // Told once about each distinct problem the host found in the plug-in's calls (an unknown
  // id, a stray release). Empty: they are only counted.
  std::function<void(const std::string&)> onHostProblem;
  // Told after every message with its answer and the host operations the plug-in called
  // during it, one line each (see Host::callLog). Setting it turns the host's call log on;
  // without it no line is ever formatted.
  std::function<void(int32_t message, int32_t result, const std::vector<std::string>& calls)>
      onMessage;
  // What a test watches and breaks in the host (see instruments.h); borrowed. A call log given
  // here holds every call from the start, never cleared by the engine.
  HostInstruments instruments;
};

// Not enough memory to render frames of the composition's size. Its text names the document,
// the frame size and what to change.
class FrameMemoryError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// Textures the caller made in the engine's context for one frame: the effect's own source and
// the output it renders into, both RGBA of the frame's size. The engine borrows them for the
// messages of the frame only.
struct CallerTextures {
  TextureRecord source{};
  TextureRecord output{};
};

// Where the module shows each input in a frame: for every pixel of the composition frame, top
// row first, the input its region shows, or -1 where no region covers it.
struct RegionMap {
  int32_t width = 0;
  int32_t height = 0;
  std::vector<int8_t> inputs;
};

// One message an event sent and what it answered; `param` names the parameter a change report
// (message 7) was about.
struct SentMessage {
  int32_t message = 0;
  int32_t result = 0;
  std::string param;
};

// What one viewer event came to.
struct ViewerOutcome {
  // The event's own message's answer (for the layer menu: the last message sent).
  int32_t result = 0;
  // The messages the event sent, in order, the change reports it caused included.
  std::vector<SentMessage> sent;
  // The ids of the parameters whose value the event changed, in declaration order.
  std::vector<std::string> changedParams;
};

// What the viewer shows, learnt as a host can learn it: from messages that change nothing.
struct ViewerState {
  // The input whose handles the overlay draws (the selected input), if any.
  std::optional<int32_t> selectedInput;
  // The pointer is over the selected input's region: the layer menu is on offer.
  bool pointerOverSelection = false;
};

// The viewer handed with the overlay, pointer and key messages.
struct ViewerSettings {
  double viewScaleX = 1.0;
  double viewScaleY = 1.0;
  double uiScale = 1.0;
  int32_t time = 0;
  // Frame pixels onto clip space; empty: the render's own pixel projection.
  std::optional<Matrix4> projection;
};

class Engine {
 public:
  // Loads the module and attaches GL. Throws std::runtime_error naming the module or the GL
  // step that failed. Sends nothing yet.
  explicit Engine(EngineOptions options);
  // Destroys a live instance and unloads the plug-in (unchecked) when finish() was not reached.
  ~Engine();
  Engine(const Engine&) = delete;
  Engine& operator=(const Engine&) = delete;

  // ---- The module and its instance --------------------------------------------------------
  // Messages 0 and 2: the plug-in is loaded and its parameter panel declared.
  void start();
  // Messages 3 and 8, then a change report (7) for every parameter set since start().
  void createInstance();
  // Messages 4 and 1.
  void finish();

  // ---- The composition ---------------------------------------------------------------------
  void setFrameSettings(const FrameSettings& settings);
  const FrameSettings& frameSettings() const { return settings_; }
  // `openStream` (optional) opens further readers for frames asked at other offsets from the
  // frame being rendered (see Layer::openStream).
  void setSourceFrames(FrameSource source, std::function<FrameSource()> openStream = {}) {
    host_->setSourceFrames(std::move(source), std::move(openStream));
  }
  void addLayer(const Layer& layer) { host_->addLayer(layer); }
  // Replaces layer `index` (a clip that grew, a track's new size); out of range throws.
  void setLayer(std::size_t index, const Layer& layer);
  const std::vector<Layer>& layers() const { return host_->layers(); }

  // ---- Parameters --------------------------------------------------------------------------
  const ParamPanel& panel() const { return host_->panel(); }
  // Which declared parameter is which (see effect_vocabulary.h); from start() on, else throws
  // std::logic_error.
  const EffectVocabulary& vocabulary() const;
  // Throws std::out_of_range for an id the module never declared.
  const Param& param(const std::string& id) const { return host_->param(id); }
  ParamValue valueAt(const std::string& id, int32_t time) const { return host_->valueAt(id, time); }
  // A value set by the caller, not a person: no undo step. With an instance the change is
  // reported (message 7) at once; before one, createInstance() reports it.
  void setParam(const std::string& id, const ParamValue& value);
  // A document's values: all stored first, then each reported once in the order given, changed
  // or not, as a host does when it opens a document.
  void setParams(const std::vector<std::pair<std::string, ParamState>>& states);
  // A person's edits in a panel: between beginEdit and endEdit they form one named undo step.
  // Each edit is reported at once.
  void beginEdit(const std::string& stepName);
  void edit(const std::string& id, const ParamState& state);
  // Several edits at once (a preset): all stored, then each changed one reported.
  void edit(const std::vector<std::pair<std::string, ParamState>>& states);
  void endEdit();
  bool undo();
  bool redo();
  std::vector<std::string> undoStepNames() const { return host_->undoStepNames(); }
  std::vector<std::string> redoStepNames() const { return host_->redoStepNames(); }
  // The name of a step the plug-in began and has not ended (a press without its release).
  std::optional<std::string> openUndoStep() const;
  // Sends message 7 for every parameter whose state differs from when it was last reported,
  // in declaration order; returns what was sent.
  std::vector<SentMessage> reportChanges();

  // ---- Rendering ---------------------------------------------------------------------------
  // Messages 12 and 10 for composition frame `frame`, into textures the host makes: the source
  // from the source frames, an output of the frame's size. The picture stays in the returned
  // frame's output texture until it is destroyed.
  std::unique_ptr<RenderFrame> render(int32_t frame);
  // The same in two steps, so that a caller can time them apart: the frame's textures made and
  // its source uploaded, then the messages.
  std::unique_ptr<RenderFrame> prepare(int32_t frame);
  void render(RenderFrame& frame);
  // The same into textures the caller made (in the engine's context). Textures of another size
  // than the composition's are a preview (see renderPreview) at their size.
  void render(int32_t frame, const CallerTextures& textures);
  // A preview: the frame rendered at 1 / `divisor` of its size, with every value measured in
  // frame pixels scaled to match (points and widths in pixels, the composition's and layers'
  // sizes), so that it shows the full render at a quarter (divisor 2) or a sixteenth (4) of the
  // cost. Divisor 1 is the full render.
  std::unique_ptr<RenderFrame> renderPreview(int32_t frame, int32_t divisor);

  // The regions the module divides frame `frame` into, with the settings given (cut positions,
  // directions, count, type) standing in for the stored ones: one render of a probe in which
  // every input shows a picture of its own, nothing stored, reported or made an undo step.
  // Layouts frame their pictures on it, so the host never works out the partition itself.
  RegionMap mapRegions(int32_t frame,
                       const std::vector<std::pair<std::string, ParamValue>>& settings = {});

  // Host textures in the engine's context for a caller's frames: RGBA8 pixels (rows from the
  // bottom), or uninitialised storage for null. Given back with deleteTexture.
  TextureRecord createTexture(int32_t width, int32_t height, const void* pixels = nullptr);
  void deleteTexture(uint32_t id);
  // Seconds spent so far producing and uploading frames the plug-in fetched (wall clock, and
  // CPU time of the thread that delivered them): the host's share of the renders' time.
  double frameDeliverySeconds() const { return host_->frameDeliverySeconds(); }
  double frameDeliveryCpuSeconds() const { return host_->frameDeliveryCpuSeconds(); }
  // GL textures the host has made so far: its pool stops growing once a job's first frames
  // are in flight.
  std::size_t texturesMade() const { return host_->texturePool().created(); }

  // ---- The viewer --------------------------------------------------------------------------
  void setViewer(const ViewerSettings& settings);
  const WispViewerContext& viewerContext() const { return viewer_; }
  ViewerOutcome pointerPress(int32_t x, int32_t y);
  ViewerOutcome pointerMove(int32_t x, int32_t y, bool held);
  ViewerOutcome pointerRelease(int32_t x, int32_t y);
  ViewerOutcome key(uint32_t keysym, bool down);
  // The host's layer action: asks whether the pointer is over the selected input and if so
  // lets the plug-in show its layer menu (pick layer), answered by the popup answers.
  ViewerOutcome openLayerMenu();
  // The host's undo and redo as viewer events: `steps` steps (fewer when there are fewer).
  ViewerOutcome undoSteps(int32_t steps);
  ViewerOutcome redoSteps(int32_t steps);
  // Draw overlay into the texture of the given size (colour attachment 0 of the host's
  // framebuffer, the whole texture as viewport).
  void drawOverlay(uint32_t texture, int32_t width, int32_t height);
  ViewerState viewerState();
  // The cursor the plug-in asked for last (0 before any).
  int32_t cursor() const { return cursor_; }
  // True once after the plug-in asked for a redraw.
  bool takeRedrawRequest();
  // Answers for the next popup menus, in order; with none queued a menu is dismissed (-1).
  void queuePopupAnswer(int32_t index) { host_->queuePopupAnswer(index); }
  // Every popup menu is answered by `chooser` instead (a window shows the menu).
  void setPopupMenuChooser(std::function<int32_t(const std::string& items)> chooser) {
    host_->setPopupMenuChooser(std::move(chooser));
  }
  const std::vector<std::string>& popupMenus() const { return host_->popupMenus(); }

  // ---- Below the engine --------------------------------------------------------------------
  // The context the engine draws in; throws std::logic_error when it was given none.
  GlContext& gl();
  const Module& module() const { return module_; }
  const std::string& documentName() const { return documentName_; }

  // Sends one message with the records given for it and checks it (see the top of this
  // file); `expected` empty accepts any answer.
  int32_t send(int32_t message, void* context = nullptr, void* event = nullptr,
               std::initializer_list<int32_t> expected = {1});
  // Throws the FrameMemoryError for the composition's frame size: where any stage of a render
  // runs out of memory, this is what the user is told.
  [[noreturn]] void throwFrameMemoryError() const;

 private:
  ViewerOutcome viewerEvent(const std::function<int32_t(std::vector<SentMessage>&)>& action);
  // Renders into `frame` with everything in pixels scaled to its size against the
  // composition's.
  void renderScaled(RenderFrame& frame);
  int32_t pointer(int32_t message, int32_t x, int32_t y, double button,
                  std::vector<SentMessage>& sent);
  void reportProblems();
  void collectViewerRecords();
  std::vector<ParamState> snapshot() const;

  Module module_;
  std::unique_ptr<Host> host_;
  CallLog messageCalls_;  // the calls of the last message, for onMessage
  std::optional<EffectVocabulary> vocabulary_;
  std::string documentName_;
  std::function<void(const std::string&)> onHostProblem_;
  std::function<void(int32_t, int32_t, const std::vector<std::string>&)> onMessage_;
  std::set<std::string> reportedProblems_;
  FrameSettings settings_;
  WispViewerContext viewer_{};
  std::vector<ParamState> reported_;  // parameter states as last reported, declaration order
  uint32_t probeTarget_ = 0;  // an off-screen texture the overlay is drawn into to learn state
  int32_t probeWidth_ = 0, probeHeight_ = 0;
  int32_t cursor_ = 0;
  bool redrawRequested_ = false;
  bool loaded_ = false;
  bool instance_ = false;
};

}  // namespace refhost
