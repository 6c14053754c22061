// The renderers of one MLT service, one per calling thread, and its failure reporting.
#include "effect_service.h"

#include <dlfcn.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <optional>
#include <set>

#include "current_context.h"
#include "mlt_services.h"
#include "property_values.h"
#include "track_frames.h"

namespace veltrane_mlt {

const char* const kServiceName = "veltrane";
const char* const kModuleProperty = "plugin";
const char* const kModuleVariable = "VELTRANE_PLUGIN";

namespace {

// The folder this MLT module was loaded from.
std::string ownFolder() {
  Dl_info info{};
  if (!dladdr(reinterpret_cast<void*>(&ownFolder), &info) || !info.dli_fname) return ".";
  std::string path = info.dli_fname;
  std::size_t slash = path.rfind('/');
  return slash == std::string::npos ? "." : path.substr(0, slash);
}

// Pictures kept for time shifts, all tracks of one service together: a second of four 1080p
// tracks, or ten seconds at 640x360.
constexpr std::size_t kHistoryBytes = std::size_t(1) << 30;

// What a module declares, learnt once per module without GL (declaring draws nothing), so
// that the tracks a frame needs are known before any renderer exists.
struct Declared {
  refhost::ParamPanel panel;
  std::optional<refhost::EffectVocabulary> roles;
};

const Declared* declaredBy(const std::string& path) {
  static std::mutex mutex;
  static std::map<std::string, std::unique_ptr<Declared>> known;
  std::lock_guard<std::mutex> lock(mutex);
  auto found = known.find(path);
  if (found != known.end()) return found->second.get();
  std::unique_ptr<Declared> declared;
  try {
    refhost::EngineOptions options;
    options.modulePath = path;
    refhost::Engine engine(std::move(options));
    engine.start();
    declared = std::make_unique<Declared>();
    declared->panel = engine.panel();
    declared->roles.emplace(declared->panel);
    engine.finish();
  } catch (const std::exception&) {
    declared.reset();  // the renderer says why, once
  }
  return known.emplace(path, std::move(declared)).first->second.get();
}

}  // namespace

void fillComposition(mlt_service service, RenderRequest& request) {
  request.compositionWidth = request.width;
  request.compositionHeight = request.height;
  mlt_profile profile = mlt_service_profile(service);
  if (!profile || profile->width <= 0 || profile->height <= 0) return;
  request.compositionWidth = profile->width;
  request.compositionHeight = profile->height;
  if (mlt_profile_fps(profile) > 0) request.frameRate = mlt_profile_fps(profile);
  if (mlt_profile_sar(profile) > 0)
    request.pixelAspect = static_cast<float>(mlt_profile_sar(profile));
}

EffectService::EffectService(mlt_service service, std::string passedThrough)
    : service_(service), passedThrough_(std::move(passedThrough)), history_(kHistoryBytes) {}

EffectService::~EffectService() {
  std::lock_guard<std::mutex> lock(mutex_);
  // Each renderer's context is current nowhere between calls, so any thread may end it; the
  // engine makes it current for its last messages.
  BorrowedThread borrowed;
  slots_.clear();
}

std::string EffectService::modulePath() const {
  const char* property = mlt_properties_get(MLT_SERVICE_PROPERTIES(service_), kModuleProperty);
  if (property && *property) return property;
  const char* variable = std::getenv(kModuleVariable);
  if (variable && *variable) return variable;
  return ownFolder() + "/veltrane/veltrane.so";
}

EffectService::Slot& EffectService::slotOfThisThread() {
  std::lock_guard<std::mutex> lock(mutex_);
  return slots_[std::this_thread::get_id()];
}

void EffectService::warnOnce(const std::string& line) {
  // Kept for the whole process and keyed by the service's id: an application may build the
  // same document more than once (melt does, to learn its profile), and one line is enough.
  static std::mutex mutex;
  static std::set<std::string> warned;
  const char* id = mlt_properties_get(MLT_SERVICE_PROPERTIES(service_), "id");
  {
    std::lock_guard<std::mutex> lock(mutex);
    if (!warned.insert(std::string(id ? id : "") + '\n' + line).second) return;
  }
  mlt_log_warning(service_, "%s\n", line.c_str());
}

FrameRenderer* EffectService::rendererFor(Slot& slot, const std::string& path) {
  if (slot.modulePath != path) {
    slot.renderer.reset();
    slot.failed = false;
    slot.modulePath = path;
  }
  if (slot.renderer || slot.failed) return slot.renderer.get();
  try {
    slot.renderer = std::make_unique<FrameRenderer>(path);
  } catch (const FrameRenderer::GlUnavailable& error) {
    slot.failed = true;
    warnOnce("no OpenGL 4.1 context can be made on this machine (" + std::string(error.what()) +
             "); " + passedThrough_ + " is passed through");
  } catch (const std::exception& error) {
    slot.failed = true;
    warnOnce(std::string(error.what()) + "; " + passedThrough_ + " is passed through");
  }
  return slot.renderer.get();
}

std::set<int> EffectService::namedTracks(const LayerResolver& layers) {
  std::set<int> tracks;
  const Declared* declared = declaredBy(modulePath());
  if (!declared) return tracks;
  mlt_properties properties = MLT_SERVICE_PROPERTIES(service_);
  for (int32_t input = 0; input < declared->roles->inputs(); ++input) {
    const char* text = mlt_properties_get(
        properties, declared->roles->id(refhost::InputParam::Layer, input).c_str());
    if (!text) continue;
    for (std::string_view value : keyValues(text)) {
      std::optional<LayerName> name = parseLayerName(value);
      const int track = name ? layers(*name) : -1;
      if (track >= 0) tracks.insert(track);
    }
  }
  return tracks;
}

int32_t EffectService::picturesToKeep() {
  const Declared* declared = declaredBy(modulePath());
  if (!declared) return 0;
  mlt_properties properties = MLT_SERVICE_PROPERTIES(service_);
  double longest = 0;
  for (int32_t input = 0; input < declared->roles->inputs(); ++input) {
    const char* text = mlt_properties_get(
        properties, declared->roles->id(refhost::InputParam::Shift, input).c_str());
    if (!text) continue;
    for (std::string_view value : keyValues(text)) {
      char* end = nullptr;
      const std::string number(value);
      const double shift = std::strtod(number.c_str(), &end);
      if (end != number.c_str() && std::isfinite(shift)) longest = std::max(longest, -shift);
    }
  }
  // One more than the shift: an editor may ask for the same frame again.
  return longest > 0 ? static_cast<int32_t>(std::min(longest, 100000.0)) + 1 : 0;
}

TrackPictures EffectService::trackPictures(int track, int32_t at, const uint8_t* current,
                                           int32_t width, int32_t height, mlt_producer producer,
                                           mlt_frame like) {
  TrackPictures pictures;
  pictures.position = at;
  pictures.current = current;
  pictures.length =
      canSeek(producer) ? static_cast<int32_t>(mlt_producer_get_playtime(producer)) : at + 1;
  history_.keep(track, at, current, width, height, picturesToKeep());
  pictures.other = [this, track, producer, like](int32_t other, int32_t pictureWidth,
                                                 int32_t pictureHeight) {
    return history_.find(track, other, pictureWidth, pictureHeight, producer, like);
  };
  return pictures;
}

bool EffectService::render(int position, int length, const LayerResolver& layers,
                           RenderRequest& request, uint8_t* out) {
  BorrowedThread borrowed;
  if (!borrowed.ready()) {
    warnOnce("the application's GLX context could not be put aside; " + passedThrough_ +
             " is passed through");
    return false;
  }
  Slot& slot = slotOfThisThread();
  FrameRenderer* renderer = rendererFor(slot, modulePath());
  if (!renderer) return false;

  mlt_properties properties = MLT_SERVICE_PROPERTIES(service_);
  ParamReading reading;
  std::string layoutProblem;
  {
    // The editor's thread may be writing these properties while this one reads them.
    mlt_service_lock(service_);
    reading = readParams(properties, renderer->panel(), position, length,
                         FrameSize{request.compositionWidth, request.compositionHeight}, layers);
    request.layout = readLayoutChoice(properties, position, length, &layoutProblem);
    mlt_service_unlock(service_);
  }
  for (const Refusal& refusal : reading.refusals)
    warnOnce(refusal.id + ": \"" + refusal.text + "\" refused, " + refusal.reason +
             "; rendering with the default");
  if (!layoutProblem.empty())
    warnOnce(std::string(kLayoutProperty) + ": " + layoutProblem + "; rendering without one");
  request.values = std::move(reading.values);
  try {
    renderer->render(request, out);
    return true;
  } catch (const std::exception& error) {
    // The instance may be half way through a message: the next frame starts a fresh one.
    warnOnce(std::string("rendering failed: ") + error.what() + "; " + passedThrough_ +
             " is passed through");
    slot.renderer.reset();
    return false;
  }
}

}  // namespace veltrane_mlt
