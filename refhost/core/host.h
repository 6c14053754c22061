// The reference host: drives one loaded module through its messages and implements every host
// operation the plug-in calls, keeping what a test needs to check afterwards (the call log,
// the panel and its values, undo steps, layers, resource balance and viewer records).
#pragma once

#include <array>
#include <cstdint>
#include <deque>
#include <functional>
#include <initializer_list>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "host/wisp_api.h"
#include "refhost/core/instruments.h"
#include "refhost/core/module.h"
#include "refhost/core/params.h"
#include "refhost/core/undo.h"
#include "refhost/gl/gl_context.h"
#include "refhost/gl/pixel_format.h"
#include "refhost/gl/texture_pool.h"

namespace refhost {

// The pixels of one frame in the format, rows from the bottom as GL stores them
// (width * height * bytesPerPixel(format) bytes).
using FrameSource = std::function<std::vector<uint8_t>(int32_t frame, int32_t width, int32_t height,
                                                       PixelFormat format)>;

// The generated default: every pixel red = frame & 255, green = (frame >> 8) & 255,
// blue = `tag`, alpha 255, so a read-back pixel tells which frame (and which layer) arrived.
FrameSource frameCounterSource(uint8_t tag);

using Matrix4 = std::array<float, 16>;
Matrix4 identityMatrix();

// A layer of the composition, as GetLayerInfo and QueryLayerState describe it.
struct Layer {
  std::string guid;  // 36-character GUID text
  std::string name;
  int32_t kind = kLayerTypeFootage;  // WispLayerType
  int32_t firstFrame = 0;
  int32_t frameCount = 1;
  int32_t width = 1920;
  int32_t height = 1080;
  Matrix4 placement = identityMatrix();  // column-major
  Matrix4 secondMatrix = identityMatrix();
  bool is3D = false;
  FrameSource source;  // empty: frameCounterSource tagged with the layer's position + 1
  // Opens another reader of the layer's media. Frames asked at different offsets from the
  // frame being rendered (time-shifted copies) then each come from a reader of their own that
  // reads on in order, instead of one reader seeking back and forth between them. Empty: every
  // request goes to `source`.
  std::function<FrameSource()> openStream;
};

// Readers of one media at most kept per source, one for each offset first asked for; later
// offsets share the reader of offset 0.
constexpr std::size_t kStreamsPerSource = 4;

struct FrameRequest {
  std::string layerGuid;  // empty for the effect's own source
  std::vector<uint32_t> frames;
};

// A parameter edit the plug-in made outside any BeginUndo/EndUndo bracket.
struct ImmediateEdit {
  std::string id;
  int32_t time = 0;
  std::string value;  // as formatValue renders it
};

struct MessageRecord {
  int32_t message = 0;
  int32_t result = 0;
  int outstandingTextures = 0;  // after the message
  int outstandingBuffers = 0;
  int unreturnedFrames = 0;  // fetched frames the host reclaimed at the end of the message
};

class Host {
 public:
  // Without a module the host cannot send messages; its operations can still be called
  // through api() and handle(), as a plug-in would.
  Host();
  // The module must outlive the host.
  explicit Host(const Module& module);
  ~Host();
  Host(const Host&) = delete;
  Host& operator=(const Host&) = delete;

  // ---- Messages --------------------------------------------------------------------------
  // Calls Notify and returns its answer. With GL attached the context is made current for
  // load, unload, prepare GL and the drawing messages (render, draw overlay); before drawing
  // the host binds its framebuffer. After the message, fetched frames not given back are
  // reclaimed and the resource balance is recorded. Throws std::logic_error without a module.
  int32_t send(int32_t message);
  static bool isDrawingMessage(int32_t message) {
    return message == kMessageRender || message == kMessageDrawOverlay;
  }
  const std::vector<MessageRecord>& messageHistory() const { return messages_; }
  void clearMessageHistory() { messages_.clear(); }

  tagWispAPI& api() { return api_; }
  WispHost* handle() { return reinterpret_cast<WispHost*>(&handle_); }
  // The records handed with the next messages (owned by the caller).
  void setRenderContext(void* context) { api_.renderContext = context; }
  void setEvent(void* event) { api_.event = event; }

  // ---- Configuration ---------------------------------------------------------------------
  void setHostId(int32_t code) { hostId_ = code; }
  int32_t hostId() const { return hostId_; }
  void setVerbose(bool verbose) { api_.verbose = verbose ? 1 : 0; }
  void setTextureFormatMode(uint32_t mode) { api_.textureFormatMode = mode; }
  void setTimeInfo(int32_t width, int32_t height, double frameRate);
  const WispTimeInfo& timeInfo() const { return timeInfo_; }
  // How the frames the host uploads for the plug-in are stored: 8 bits (GL_RGBA) or half
  // floats (GL_RGBA16F) when more than 8 bits are to be kept.
  void setFrameFormat(PixelFormat format) { frameFormat_ = format; }
  // While a smaller picture of the frame is rendered (a viewer's preview), everything measured
  // in frame pixels that the plug-in reads is scaled by `scale`: points and floats declared in
  // "px", the composition size, and the layers' sizes and placements. 1 outside previews.
  void setPixelScale(double scale) { pixelScale_ = scale; }
  double pixelScale() const { return pixelScale_; }
  PixelFormat frameFormat() const { return frameFormat_; }

  // ---- GL --------------------------------------------------------------------------------
  // Draws in the given context: a headless one of the host's own (headless_context.h), or a
  // window's, an editor's, a canvas's, adopted.
  GlContext& attachGl(std::unique_ptr<GlContext> context);
  // Uses a context another host made, so that hosts in turn can drive one plug-in whose GL
  // programs live in it; each host's own GL objects still go with the host.
  GlContext& shareGl(std::shared_ptr<GlContext> context);
  GlContext* gl() { return gl_.get(); }
  uint32_t framebuffer() const { return framebuffer_; }
  // A texture the host's framebuffer shows before every drawing message (colour attachment 0,
  // viewport 0, 0, width, height), as a viewer's picture is when the overlay is drawn over it.
  // Id 0 (the default) leaves the attachment to the plug-in.
  void setDrawTarget(uint32_t textureId, int32_t width, int32_t height);
  // Host-owned textures for render contexts (not counted as the plug-in's): RGBA8 pixels, or
  // uninitialised storage when `pixels` is null. The record has s1 = t1 = 1 and scales of 1.
  // They come from the same pool as the plug-in's, and deleteTexture gives them back to it.
  TextureRecord createTexture(int32_t width, int32_t height, const void* pixels = nullptr,
                              uint32_t internalFormat = 0x1908 /* GL_RGBA */);
  // The same for a frame in the host's frame format: pixels (if any) in that format.
  TextureRecord createFrameTexture(int32_t width, int32_t height, const void* pixels = nullptr);
  void deleteTexture(uint32_t id);
  const TexturePool& texturePool() const { return texturePool_; }

  // ---- Parameters ------------------------------------------------------------------------
  const ParamPanel& panel() const { return panel_; }
  // The host-side accessors throw std::out_of_range for an id that was never declared. They
  // store exactly what they are given (no clamping to the declared range) and make no undo step.
  const Param& param(const std::string& id) const;
  void setValue(const std::string& id, const ParamValue& value);  // static; drops keyframes
  void setKeyframe(const std::string& id, int32_t time, const ParamValue& value);
  void clearKeyframes(const std::string& id);
  // Replaces the parameter's whole state (static value and keyframes), outside any undo step.
  void editStateWithoutUndo(const std::string& id, const ParamState& state) {
    mutableParam(id).state = state;
  }
  ParamValue valueAt(const std::string& id, int32_t time) const;
  bool isEnabled(const std::string& id) const { return param(id).enabled; }

  // ---- Edits from the host's own panel ----------------------------------------------------
  // A person's edits, grouped into one named undo step by beginEdit/endEdit as the plug-in's
  // BeginUndo/EndUndo group its edits; they are not plug-in calls, so the call log omits them.
  void beginEdit(const std::string& stepName) { undo_.begin(stepName); }
  void endEdit() { undo_.end(panel_); }
  // Replaces the parameter's whole state (static value or keyframes), noted in the open step.
  void editState(const std::string& id, const ParamState& state);

  // ---- Undo ------------------------------------------------------------------------------
  bool undo() { return undo_.undo(panel_); }
  bool redo() { return undo_.redo(panel_); }
  std::vector<std::string> undoStepNames() const { return undo_.stepNames(); }
  std::vector<std::string> redoStepNames() const { return undo_.redoNames(); }
  const UndoStack& undoStack() const { return undo_; }
  const std::vector<ImmediateEdit>& immediateEdits() const { return immediateEdits_; }

  // ---- Layers and media ------------------------------------------------------------------
  void addLayer(const Layer& layer) { layers_.push_back(layer); }
  std::vector<Layer>& layers() { return layers_; }
  // The effect's own source: `source` serves the frame being rendered; `openStream`, when
  // given, opens readers for the frames asked at other offsets (see Layer::openStream).
  void setSourceFrames(FrameSource source, std::function<FrameSource()> openStream = {}) {
    sourceFrames_ = std::move(source);
    sourceStreamOpener_ = std::move(openStream);
    streams_.clear();
  }
  const FrameSource& sourceFrames() const { return sourceFrames_; }
  const std::function<FrameSource()>& sourceStreamOpener() const { return sourceStreamOpener_; }

  // ---- Test instruments and problems -----------------------------------------------------
  // The call log and the failures a test hands the host (see instruments.h); both borrowed.
  void setInstruments(const HostInstruments& instruments) { instruments_ = instruments; }
  // What the host refused or found wrong in a call: unknown ids, kind mismatches, null
  // pointers, releases of names it never handed out, an EndUndo without BeginUndo.
  const std::vector<std::string>& problems() const { return problems_; }
  void clearProblems() { problems_.clear(); }

  // ---- Resource accounting ---------------------------------------------------------------
  // Textures from AllocateTexture and buffers from AcquireBuffer not yet given back. Frames
  // from GetSourceFrame and RenderLayerFrame are the host's and reclaimed at message end.
  int outstandingTextures() const { return static_cast<int>(textures_.size()); }
  int outstandingBuffers() const { return static_cast<int>(buffers_.size()); }
  int outstandingFrames() const { return static_cast<int>(frames_.size()); }
  // Wall-clock seconds spent so far producing and uploading frames for GetSourceFrame and
  // RenderLayerFrame: the host's share of a render message's time.
  double frameDeliverySeconds() const { return frameDeliverySeconds_; }
  // The same in CPU seconds of the thread that delivered them.
  double frameDeliveryCpuSeconds() const { return frameDeliveryCpuSeconds_; }
  // The one vertex array the host hands out on every CreateVertexArray (0 before the first).
  uint32_t vertexArray() const { return vertexArray_; }

  // ---- Viewer records --------------------------------------------------------------------
  const std::vector<int32_t>& cursorShapes() const { return cursorShapes_; }
  int redrawCount() const { return redraws_; }
  // Answers for the next ShowPopupMenu calls, in order; an empty queue answers -1.
  void queuePopupAnswer(int32_t index) { popupAnswers_.push_back(index); }
  const std::vector<std::string>& popupMenus() const { return popupMenus_; }
  // When set, every ShowPopupMenu is answered by `chooser` (a viewer shows the menu and waits
  // for the choice) instead of the queued answers; an empty function turns it off.
  void setPopupMenuChooser(std::function<int32_t(const std::string& items)> chooser) {
    popupChooser_ = std::move(chooser);
  }
  const std::vector<FrameRequest>& frameRequests() const { return frameRequests_; }
  void clearFrameRequests() { frameRequests_.clear(); }
  void clearViewerRecords();
  // Forgets the cursors and redraw requests only, keeping menus and queued answers.
  void clearCursorsAndRedraws() {
    cursorShapes_.clear();
    redraws_ = 0;
  }

  // While set, every parameter the plug-in reads is appended to the list (the panel's own
  // records): how a host learns what a message looked at without keeping the call log.
  void setReadRecord(std::vector<const Param*>* record) { readRecord_ = record; }

 private:
  friend struct Operations;  // the C callbacks, in callbacks.cpp

  struct Handle {
    Host* host;
  };

  // `line` makes the text; it is called only while a log is kept, so a render without one
  // formats nothing.
  template <typename Line>
  void log(Line&& line) {
    if (instruments_.callLog) instruments_.callLog->record(line());
  }
  // The failures a test asked for; a host given none fails nothing.
  bool faulty(bool FaultPlan::*fault) const {
    return instruments_.faults && instruments_.faults->*fault;
  }
  void problem(std::string text) { problems_.push_back(std::move(text)); }
  // The interface's reserved arguments are 0; anything else is the plug-in misusing it.
  void checkReserved(const char* operation, int32_t reserved);
  Param& mutableParam(const std::string& id);
  bool requireGl(const char* operation);
  void finishMessage(int32_t message, int32_t result);

  // GL housekeeping (host_resources.cpp).
  void bindFramebuffer();
  void reclaimFrames();
  void releaseGl();

  const wchar_t* getHostIdentifier();
  int32_t getHostId();

  // Declaration (host_params.cpp).
  bool declarationRefused();
  int32_t declare(Param param);
  int32_t beginParamGroup(const wchar_t* displayName);
  int32_t endParamGroup();
  int32_t addFloatParam(const wchar_t* displayName, const wchar_t* unit, const char* id,
                        int32_t flags, float minimum, float maximum, float defaultValue,
                        int32_t precision);
  int32_t addIntParam(const wchar_t* displayName, const wchar_t* unit, const char* id,
                      int32_t flags, int32_t minimum, int32_t maximum, int32_t defaultValue);
  int32_t addBoolParam(const wchar_t* displayName, const char* id, int32_t flags,
                       uint8_t defaultValue);
  int32_t addChoiceParam(const wchar_t* displayName, const char* id, int32_t flags,
                         const wchar_t* choices, const int32_t* defaultIndex, int32_t reserved);
  int32_t addPointParam(const wchar_t* displayName, const char* id, int32_t flags, float x,
                        float y);
  int32_t addAngleParam(const wchar_t* displayName, const char* id, int32_t flags, uint8_t extra,
                        float degrees);
  int32_t addColorParam(const wchar_t* displayName, const char* id, int32_t flags, float red,
                        float green, float blue);
  int32_t addLayerParam(const wchar_t* displayName, const char* id, int32_t flags);
  void setParamEnabled(const char* id, const uint8_t* enabled);

  // Reads and writes (host_values.cpp).
  ParamValue read(const char* operation, const char* id, int32_t time, ParamKind kind);
  int32_t getIntParam(const char* id, int32_t time);
  float getFloatParam(const char* id, int32_t time);
  uint8_t getBoolParam(const char* id, int32_t time);
  int32_t getChoiceParam(const char* id, int32_t time);
  float getAngleParam(const char* id, int32_t time);
  void getPointParam(const char* id, int32_t time, float* x, float* y);
  void getColorParam(const char* id, int32_t time, float* red, float* green, float* blue);
  void getLayerParam(const char* id, int32_t time, char* guidBuffer);
  // Stores an edit when the id names a parameter of one of the kinds; notes the state before it
  // in the open undo step, or records an immediate edit when none is open.
  void write(const char* operation, const char* id, int32_t time, const ParamValue& value,
             std::initializer_list<ParamKind> kinds);
  void setIntParam(const char* id, int32_t time, int32_t value, int32_t reserved);
  void setFloatParam(const char* id, int32_t time, float value, int32_t reserved);
  void setPointParam(const char* id, int32_t time, const float* x, const float* y,
                     int32_t reserved);
  void setAngleParam(const char* id, int32_t time, float degrees, int32_t reserved);
  void setLayerParam(const char* id, int32_t time, const char* guid, int32_t reserved);

  // Undo and viewer (host_viewer.cpp).
  void beginUndo(const char* stepName);
  void endUndo();
  void redraw(int32_t reserved);
  void setCursor(int32_t shape);
  int32_t showPopupMenu(const char* items);
  void requestFrames(const char* guid, int32_t count, const uint32_t* frames, bool ownSource);

  // Layers, timing and frames (host_layers.cpp).
  int32_t getLayerCount();
  void getLayerInfo(int32_t index, char* guidBuffer, char* nameBuffer, int32_t nameSize,
                    int32_t* kind);
  int32_t queryLayerState(const char* guid, int32_t timeMs, LayerState* out);
  int32_t getTimeInfo(WispTimeInfo* out);
  int32_t getSourceFrame(void* renderContext, int32_t frameIndex, TextureRecord* out);
  int32_t renderLayerFrame(void* renderContext, const char* guid, int32_t frame,
                           TextureRecord* out);
  const Layer* findLayer(const char* guid) const;
  // The reader for frames `offset` away from the frame being rendered, of the own source
  // (`layer` null) or of a layer.
  const FrameSource& stream(const Layer* layer, int32_t offset);
  int32_t deliverFrame(const FrameSource& source, int32_t frame, int32_t width, int32_t height,
                       TextureRecord* out);

  // Resources (host_resources.cpp).
  // A texture from the pool holding the pixels (given in the key's format and type) if any.
  uint32_t texture(const TextureKey& key, const void* pixels);
  uint32_t allocateTexture(int32_t width, int32_t height, uint32_t internalFormat,
                           uint32_t pixelFormat, uint32_t pixelType, const void* data,
                           int32_t* allocatedWidth, int32_t* allocatedHeight);
  void releaseTexture(uint32_t id);
  uint32_t createVertexArray();
  uint32_t acquireBuffer(uint32_t target, int64_t size, const void* data, uint32_t usage,
                         uint32_t* hostOutput);
  void releaseBuffer(uint32_t id);

  const Module* module_ = nullptr;
  Handle handle_{this};
  tagWispAPI api_{};
  int32_t hostId_ = 0;
  std::wstring hostIdentifier_ = L"org.veltrane.refhost";
  WispTimeInfo timeInfo_{1920, 1080, 25.0};
  PixelFormat frameFormat_ = PixelFormat::Rgba8;
  double pixelScale_ = 1;
  int32_t scaled(int32_t pixels) const;

  ParamPanel panel_;
  UndoStack undo_;
  std::vector<ImmediateEdit> immediateEdits_;
  std::vector<Layer> layers_;
  FrameSource sourceFrames_;
  std::function<FrameSource()> sourceStreamOpener_;
  // Readers opened for offsets other than 0, by source (the layer's GUID, empty for the own
  // source) and offset.
  std::map<std::pair<std::string, int32_t>, FrameSource> streams_;

  HostInstruments instruments_;
  std::vector<std::string> problems_;
  std::vector<MessageRecord> messages_;

  std::shared_ptr<GlContext> gl_;
  uint32_t framebuffer_ = 0;
  uint32_t drawTarget_ = 0;
  int32_t drawTargetWidth_ = 0;
  int32_t drawTargetHeight_ = 0;
  uint32_t vertexArray_ = 0;
  std::set<uint32_t> textures_;
  std::set<uint32_t> buffers_;
  std::set<uint32_t> frames_;
  TexturePool texturePool_;
  double frameDeliverySeconds_ = 0;
  double frameDeliveryCpuSeconds_ = 0;

  std::vector<int32_t> cursorShapes_;
  int redraws_ = 0;
  std::deque<int32_t> popupAnswers_;
  std::vector<std::string> popupMenus_;
  std::function<int32_t(const std::string&)> popupChooser_;
  std::vector<FrameRequest> frameRequests_;
  std::vector<const Param*>* readRecord_ = nullptr;
};

}  // namespace refhost
