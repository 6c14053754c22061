// What the transition and the filter share: one renderer per thread that calls the service,
// the module's path, reading the parameters, and the log lines that say why a frame was passed
// through instead of rendered.
#pragma once

#include <framework/mlt.h>

#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <thread>

#include "frame_renderer.h"

namespace veltrane_mlt {

// The property naming the plug-in module's file, and the environment variable used without it.
extern const char* const kModuleProperty;
extern const char* const kModuleVariable;

// The composition's size, frame rate and pixel aspect from the service's MLT profile; without
// a profile, the request's own size at 25 frames a second.
void fillComposition(mlt_service service, RenderRequest& request);

class EffectService {
 public:
  // `passedThrough` names what the viewer sees when a frame cannot be rendered (for the log).
  EffectService(mlt_service service, bool withLowerTrack, std::string passedThrough);
  // Gives back every thread's context and module instance.
  ~EffectService();
  EffectService(const EffectService&) = delete;
  EffectService& operator=(const EffectService&) = delete;

  // Reads the parameters from the service's properties at `position` of `length` and renders
  // `request` (everything but the values) into `out`. False when the frame could not be
  // rendered; the reason has been logged, once for each distinct reason.
  bool render(int position, int length, RenderRequest& request, uint8_t* out);

  // The module the service loads: its `plugin` property, else $VELTRANE_PLUGIN, else the
  // module installed beside this MLT module (veltrane/veltrane.so).
  std::string modulePath() const;

 private:
  struct Slot {
    std::string modulePath;
    std::unique_ptr<FrameRenderer> renderer;
    bool failed = false;  // the renderer could not be made for this path
  };

  Slot& slotOfThisThread();
  FrameRenderer* rendererFor(Slot& slot, const std::string& path);
  void warnOnce(const std::string& line);

  mlt_service service_;
  bool withLowerTrack_;
  std::string passedThrough_;
  std::mutex mutex_;
  std::map<std::thread::id, Slot> slots_;
};

}  // namespace veltrane_mlt
