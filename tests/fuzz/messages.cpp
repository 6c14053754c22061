// Fuzzes the message boundary as a hostile host: any number, order, record and failing host call;
// a crash, escaping exception, GL error, stray answer or resource left behind stops the run.
#include <fuzzer/FuzzedDataProvider.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <initializer_list>
#include <memory>
#include <string>
#include <vector>

#include "refhost/core/host.h"
#include "refhost/engine/render_frame.h"
#include "refhost/gl/headless_context.h"
#include "support/instrumented_host.h"

namespace {

const char* const kGuids[] = {"aaaaaaaa-0000-4000-8000-000000000001",
                              "5ec0a11e-0000-4000-8000-000000000001", refhost::kNoLayer, "zz", ""};

constexpr uint32_t answer(WispResult result) { return 1u << result; }

// The answers a message may give: the program exception only where a host call can fail; an
// unnamed number is not handled, and every message not listed here answers done.
uint32_t allowedAnswers(int32_t message) {
  const auto among = [message](std::initializer_list<int32_t> messages) {
    return std::find(messages.begin(), messages.end(), message) != messages.end();
  };
  if (!wispMessageName(message)) return answer(kResultNotHandled);
  if (message == kMessageUnload) return answer(kResultDone) | answer(kResultNotHandled);
  if (among({kMessageDeclareParameters, kMessagePrepareGl}))
    return answer(kResultDone) | answer(kResultException);
  if (among({kMessagePointerMove, kMessagePointerPress, kMessagePointerRelease, kMessageKeyDown,
             kMessageKeyUp, kMessagePointerOverSelection, kMessagePickLayer}))
    return answer(kResultNotDone) | answer(kResultDone);
  if (among(
          {kMessagePointerEntered, kMessagePointerLeft, kMessageDoubleClick, kMessageCopyInstance}))
    return answer(kResultNotDone);
  return answer(kResultDone);
}

bool answerAllowed(int32_t message, int32_t result) {
  return result >= 0 && result < 32 && (allowedAnswers(message) >> result & 1) != 0;
}

[[noreturn]] void fail(const testsupport::InstrumentedHost& host, int32_t message,
                       const std::string& what) {
  std::fprintf(stderr, "%s: %s; its host calls:\n", wispMessageText(message).c_str(), what.c_str());
  for (const std::string& call : host.callLog()) std::fprintf(stderr, "  %s\n", call.c_str());
  std::abort();
}

float hostileFloat(FuzzedDataProvider& data) {
  const float special[] = {NAN, INFINITY, -INFINITY, 1e30f, -1e30f, FLT_MAX, FLT_MIN, -0.0f, 0.0f};
  const int kind = data.ConsumeIntegralInRange(0, 3);
  if (kind == 0) return data.PickValueInArray(special);
  return kind == 1 ? data.ConsumeFloatingPoint<float>()
                   : data.ConsumeFloatingPointInRange(-2000.0f, 2000.0f);
}

int32_t hostileInt(FuzzedDataProvider& data, int32_t low, int32_t high) {
  return data.ConsumeBool() ? data.ConsumeIntegralInRange(low, high)
                            : data.ConsumeIntegral<int32_t>();
}

// The plug-in state that outlives one input: a context of each profile (the mesh draws take
// another path in each) and a program registry built in it, which every input starts from,
// since building the programs costs far more than an input.
struct Warm {
  std::shared_ptr<refhost::GlContext> gl;
  void* registry = nullptr;
};
refhost::Module* module = nullptr;
Warm warmStates[2];

// One input's host, tracking every registry and instance the plug-in made as a host that
// lost none of them would, so each can be given back with messages 1 and 4 at the end. A warm
// registry that was unloaded, or grown by another GL start-up, is built afresh.
class Session {
 public:
  explicit Session(Warm& warm) : warm_(warm), host_(*module) {
    host_.shareGl(warm.gl);
    registry_ = warm.registry;
    registries_.push_back(registry_);
  }

  ~Session() {
    for (void* instance : std::vector<void*>(instances_)) send(kMessageDestroyInstance, instance);
    for (void* registry : std::vector<void*>(registries_))
      if (registry != warm_.registry || grown_) send(kMessageUnload, nullptr, registry);
    if (registries_.empty()) {
      send(kMessageLoad, nullptr, nullptr);
      if (send(kMessagePrepareGl, nullptr) != 1) fail(host_, 8, "the plug-in did not start again");
      warm_.registry = registry_;
    }
  }

  testsupport::InstrumentedHost& host() { return host_; }
  const std::vector<void*>& instances() const { return instances_; }

  int32_t send(int32_t message, void* instance) { return send(message, instance, registry_); }

  int32_t send(int32_t message, void* instance, void* registry) {
    tagWispAPI& api = host_.api();
    api.instanceData = instance;
    api.pluginData = registry;
    warm_.gl->clearErrors();
    grown_ = grown_ || (message == kMessagePrepareGl && registry == warm_.registry);
    int32_t result = host_.send(message);
    if (!answerAllowed(message, result)) fail(host_, message, "answered " + std::to_string(result));
    if (host_.outstandingTextures() != 0 || host_.outstandingBuffers() != 0)
      fail(host_, message, "left textures or buffers with the plug-in");
    if (!warm_.gl->errors().empty())
      fail(host_, message, "GL error: " + warm_.gl->errors()[0].text);
    auto forget = [](std::vector<void*>& list, void* item) {
      list.erase(std::remove(list.begin(), list.end(), item), list.end());
    };
    if (message == kMessageLoad) registries_.push_back(api.pluginData);
    if (message == kMessageUnload) forget(registries_, registry);
    if (message == kMessageCreateInstance) instances_.push_back(api.instanceData);
    if (message == kMessageDestroyInstance) forget(instances_, instance);
    registry_ = api.pluginData;
    host_.clearCallLog();
    return result;
  }

 private:
  Warm& warm_;
  testsupport::InstrumentedHost host_;
  bool grown_ = false;
  void* registry_ = nullptr;
  std::vector<void*> registries_;
  std::vector<void*> instances_;
};

void configureHost(FuzzedDataProvider& data, testsupport::InstrumentedHost& host) {
  const int32_t hostIds[] = {0,
                             kHostProductTouch,
                             kHostProductCompositor,
                             kHostProductCompositorPro,
                             kHostProductRenderNode,
                             kHostProductCompositorPreview,
                             -1};
  host.setHostId(data.PickValueInArray(hostIds));
  // Other modes ask for a target of the built-in template's size, 0 x 0, which a host that
  // allocates exactly the sizes asked (as this one does) cannot draw into.
  host.setTextureFormatMode(data.ConsumeBool() ? kTextureFormatLikeOutput
                                               : kTextureFormatLikeSecond);
  host.setTimeInfo(hostileInt(data, 0, 96), hostileInt(data, 0, 96), hostileFloat(data));
  for (int i = data.ConsumeIntegralInRange(0, 3); i > 0; --i) {
    refhost::Layer layer;
    layer.guid = data.PickValueInArray(kGuids);
    layer.kind = hostileInt(data, 0, 8);
    layer.firstFrame = hostileInt(data, -5, 5);
    layer.frameCount = hostileInt(data, 0, 10);
    layer.width = data.ConsumeIntegralInRange(0, 48);
    layer.height = data.ConsumeIntegralInRange(0, 48);
    for (float& entry : layer.placement) entry = data.ConsumeBool() ? hostileFloat(data) : entry;
    layer.is3D = data.ConsumeBool();
    host.addLayer(layer);
  }
  host.faults().refuseSourceFrames = data.ConsumeProbability<float>() < 0.1f;
  host.faults().refuseLayerFrames = data.ConsumeProbability<float>() < 0.1f;
  host.faults().failLayerQueries = data.ConsumeProbability<float>() < 0.1f;
  host.faults().failTimeInfo = data.ConsumeProbability<float>() < 0.1f;
  if (data.ConsumeProbability<float>() < 0.05f)
    host.failDeclarationCall(data.ConsumeIntegralInRange(1, 90));
}

void editParameter(FuzzedDataProvider& data, testsupport::InstrumentedHost& host) {
  const std::vector<refhost::Param>& params = host.panel().params();
  if (params.empty()) return;
  const refhost::Param& param = params[data.ConsumeIntegralInRange<size_t>(0, params.size() - 1)];
  refhost::ParamValue value;
  value.integer = hostileInt(data, -3, 10);
  for (float& number : value.number) number = hostileFloat(data);
  if (param.kind == refhost::ParamKind::Layer) value.layer = data.PickValueInArray(kGuids);
  if (data.ConsumeBool())
    host.setValue(param.id, value);
  else
    host.setKeyframe(param.id, hostileInt(data, -3, 3), value);
}

// Sends one message with records of the kind it takes, filled with hostile values.
void sendMessage(FuzzedDataProvider& data, Session& session) {
  testsupport::InstrumentedHost& host = session.host();
  // The two ranges the protocol numbers its messages in, gaps included.
  const int32_t message =
      data.ConsumeBool()
          ? data.ConsumeIntegralInRange<int32_t>(kMessageLoad, kMessageParameterEditEnded)
          : data.ConsumeIntegralInRange<int32_t>(kMessageViewerOpened, kMessageCopyInstance);
  const std::vector<void*>& instances = session.instances();
  void* instance = instances.empty() || data.ConsumeProbability<float>() < 0.05f
                       ? nullptr
                       : instances[data.ConsumeIntegralInRange<size_t>(0, instances.size() - 1)];
  const std::vector<refhost::Param>& params = host.panel().params();
  WispParamEvent param{
      params.empty() || data.ConsumeProbability<float>() < 0.1f
          ? data.PickValueInArray({"cutType2", "", "numberOfCut"})
          : params[data.ConsumeIntegralInRange<size_t>(0, params.size() - 1)].id.c_str()};
  WispPointerEvent pointer{hostileInt(data, -20, 100), hostileInt(data, -20, 100),
                           data.ConsumeBool() ? 1.0 : static_cast<double>(hostileFloat(data))};
  WispKeyEvent key{data.ConsumeBool()   ? kKeyLeftShift
                   : data.ConsumeBool() ? kKeyEscape
                                        : data.ConsumeIntegral<uint32_t>()};
  const int32_t width = data.ConsumeIntegralInRange(0, 64);
  const int32_t height = data.ConsumeIntegralInRange(0, 64);
  WispViewerContext viewer =
      refhost::makeViewerContext(width, height, hostileFloat(data), hostileFloat(data),
                                 hostileFloat(data), hostileInt(data, -3, 3));
  viewer.name = data.ConsumeProbability<float>() < 0.05f ? "other viewer" : nullptr;
  refhost::FrameSettings settings{
      width, height, hostileFloat(data), hostileFloat(data), hostileInt(data, 0, 5), kGuids[1]};
  std::unique_ptr<refhost::RenderFrame> frame;
  WispLayerPickerContext picker{data.PickValueInArray(kGuids)};
  void* context = nullptr;
  void* event = nullptr;
  if (message == kMessageParameterChanged || message == kMessageParameterEditBegan ||
      message == kMessageParameterEditEnded)
    event = &param;
  const bool pointerMessage = message == kMessagePointerMove || message == kMessagePointerPress ||
                              message == kMessagePointerRelease;
  if (message == kMessageDrawOverlay || pointerMessage) context = &viewer;
  if (pointerMessage) event = &pointer;
  if (message == kMessageKeyDown || message == kMessageKeyUp) event = &key;
  if (message == kMessagePickLayer) {
    context = &picker;
    host.queuePopupAnswer(hostileInt(data, -1, 4));
  }
  if (message == kMessageCopyInstance && !instances.empty())
    context = instances[data.ConsumeIntegralInRange<size_t>(0, instances.size() - 1)];
  if (message == kMessageRender || message == kMessageRequestFrames) {
    frame = std::make_unique<refhost::RenderFrame>(host, settings, hostileInt(data, -2, 10));
    WispRenderContext& render = frame->context();
    render.hasPixelAspect = data.ConsumeBool();
    render.ownLayerGuid = data.ConsumeBool() ? nullptr : render.ownLayerGuid;
    for (float& entry : render.layerSpaceMatrix)
      entry = data.ConsumeBool() ? hostileFloat(data) : entry;
    context = &render;
  }
  if (data.ConsumeProbability<float>() < 0.05f) event = nullptr;
  // The overlay is drawn over the viewer's picture, which has pixels whatever the frame size.
  const int32_t pictureWidth = data.ConsumeIntegralInRange(1, 64);
  const int32_t pictureHeight = data.ConsumeIntegralInRange(1, 64);
  const uint32_t picture =
      message == kMessageDrawOverlay ? host.createTexture(pictureWidth, pictureHeight).id : 0;
  host.setDrawTarget(picture, pictureWidth, pictureHeight);
  host.setRenderContext(context);
  host.setEvent(event);
  session.send(message, instance);
  host.setRenderContext(nullptr);
  host.setEvent(nullptr);
  if (picture) host.deleteTexture(picture);
}

}  // namespace

// Mesa keeps caches of its own (compiled shaders, JIT code) that LeakSanitizer cannot tell from
// leaks; the plug-in's and the host's allocations stay checked.
extern "C" const char* __lsan_default_suppressions() {
  return "leak:swrast_dri.so\nleak:libLLVM\nleak:libEGL_mesa.so\nleak:libglapi.so\n";
}

// The runtime's dynamic-TLS interception misreads Mesa's thread-local blocks now and then and
// crashes the leak scan at exit; without it the scan only loses precision inside those blocks.
extern "C" const char* __asan_default_options() { return "intercept_tls_get_addr=0"; }

extern "C" int LLVMFuzzerInitialize(int* argc, char*** argv) {
  // llvmpipe rasterising on the calling thread: tiny frames gain nothing from workers.
  setenv("LP_NUM_THREADS", "0", 0);
  // A message sequence is short; one that runs this long hangs.
  static std::vector<char*> args(*argv, *argv + *argc);
  static char timeout[] = "-timeout=20";
  args.insert(args.begin() + 1, timeout);
  *argc = static_cast<int>(args.size());
  *argv = args.data();

  module = new refhost::Module(VELTRANE_FUZZ_MODULE_PATH);
  for (refhost::GlProfile profile : {refhost::GlProfile::Core, refhost::GlProfile::Compatibility}) {
    Warm& warm = warmStates[profile == refhost::GlProfile::Core ? 0 : 1];
    warm.gl = refhost::makeHeadlessContext(profile);
    testsupport::InstrumentedHost host(*module);
    host.shareGl(warm.gl);
    if (host.send(kMessageLoad) != 1 || host.send(kMessagePrepareGl) != 1)
      fail(host, 8, "the plug-in did not start");
    warm.registry = host.api().pluginData;
  }
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  FuzzedDataProvider data(bytes, size);
  Session session(warmStates[data.ConsumeBool() ? 1 : 0]);
  configureHost(data, session.host());
  session.send(kMessageDeclareParameters, nullptr);
  session.send(kMessageCreateInstance, nullptr);
  for (int step = 0; step < 48 && data.remaining_bytes() > 0; ++step) {
    for (int edits = data.ConsumeIntegralInRange(0, 2); edits > 0; --edits)
      editParameter(data, session.host());
    sendMessage(data, session);
  }
  return 0;
}
