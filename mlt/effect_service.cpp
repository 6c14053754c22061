// The renderers of one MLT service, one per calling thread, and its failure reporting.
#include "effect_service.h"

#include <dlfcn.h>

#include <cstdlib>
#include <set>

#include "current_context.h"
#include "property_values.h"

namespace veltrane_mlt {

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

EffectService::EffectService(mlt_service service, bool withLowerTrack, std::string passedThrough)
    : service_(service),
      withLowerTrack_(withLowerTrack),
      passedThrough_(std::move(passedThrough)) {}

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
    slot.renderer = std::make_unique<FrameRenderer>(path, withLowerTrack_);
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

bool EffectService::render(int position, int length, RenderRequest& request, uint8_t* out) {
  BorrowedThread borrowed;
  if (!borrowed.ready()) {
    warnOnce("the application's GLX context could not be put aside; " + passedThrough_ +
             " is passed through");
    return false;
  }
  Slot& slot = slotOfThisThread();
  FrameRenderer* renderer = rendererFor(slot, modulePath());
  if (!renderer) return false;

  ParamReading reading =
      readParams(MLT_SERVICE_PROPERTIES(service_), renderer->panel(), position, length);
  for (const Refusal& refusal : reading.refusals)
    warnOnce(refusal.id + ": \"" + refusal.text + "\" refused, " + refusal.reason +
             "; rendering with the default");
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
