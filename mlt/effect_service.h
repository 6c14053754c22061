// What the transition and the filter share: one renderer per thread that calls the service,
// the module's path, reading the parameters and the layout pick, the tracks the inputs show,
// the pictures kept for time shifts, and the log lines that say why a frame was passed through
// instead of rendered.
#pragma once

#include <framework/mlt.h>

#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <thread>

#include "frame_renderer.h"
#include "track_history.h"
#include "track_layers.h"

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
  EffectService(mlt_service service, std::string passedThrough);
  // Gives back every thread's context and module instance.
  ~EffectService();
  EffectService(const EffectService&) = delete;
  EffectService& operator=(const EffectService&) = delete;

  // The tracks that inputs name at any key of their layer properties, as `layers` resolves
  // them (the own track left out); empty when the module cannot be loaded.
  std::set<int> namedTracks(const LayerResolver& layers);

  // How many of a track's latest pictures the time shifts need kept: the longest shift back
  // (at any key of any input), and none without one.
  int32_t picturesToKeep();

  // Reads the parameters and the layout pick from the service's properties at `position` of
  // `length`, layers resolved by `layers`, and renders `request` (everything but the values)
  // into `out`. False when the frame could not be rendered; the reason has been logged, once
  // for each distinct reason.
  bool render(int position, int length, const LayerResolver& layers, RenderRequest& request,
              uint8_t* out);

  // Pictures of the tracks kept for time shifts, and the readers ahead of them.
  TrackHistory& history() { return history_; }

  // Track `track`'s pictures for a render: `current` at composition position `at` (kept for
  // later shifts back), others from the kept ones or read from `producer` (the track's,
  // playing `length` frames; null: kept ones only). `like` is the frame in hand.
  TrackPictures trackPictures(int track, int32_t at, const uint8_t* current, int32_t width,
                              int32_t height, mlt_producer producer, mlt_frame like);

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
  std::string passedThrough_;
  TrackHistory history_;
  std::mutex mutex_;
  std::map<std::thread::id, Slot> slots_;
};

}  // namespace veltrane_mlt
