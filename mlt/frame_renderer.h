// One thread's engine: the plug-in module with its instance, in a GL context of the bridge's
// own, rendering MLT pictures and reading the result back for MLT.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "layout_choice.h"
#include "refhost/engine.h"
#include "refhost/pipeline/frame_readback.h"

namespace veltrane_mlt {

// A track the effect takes pictures from: where the frame being rendered lies in it and how to
// have its pictures at other positions.
struct TrackPictures {
  int32_t position = 0;  // of the frame being rendered
  int32_t length = 1;    // frames the track plays
  // The picture at `position`: RGBA rows, top row first, of the render's size.
  const uint8_t* current = nullptr;
  // The picture at another position, as `current`; empty when the track has none there (it
  // cannot be sought, or nothing plays).
  std::function<std::vector<uint8_t>(int32_t position, int32_t width, int32_t height)> other;
};

struct RenderRequest {
  int32_t width = 0;  // of the pictures MLT handed over, and of the result
  int32_t height = 0;
  // The composition (MLT's profile): the size every parameter in pixels refers to, so that a
  // preview rendered smaller shows the same layout.
  int32_t compositionWidth = 0;
  int32_t compositionHeight = 0;
  double frameRate = 25.0;
  float pixelAspect = 1.0f;
  TrackPictures own;  // the effect's own source; its position is the frame number
  // The tractor's tracks the inputs name (the layers of trackGuid), by index; their positions
  // count as the own source's.
  std::map<int, TrackPictures> tracks;
  std::vector<refhost::ParamValue> values;  // every parameter, in declaration order
  LayoutChoice layout;                      // applied over `values`
};

class FrameRenderer {
 public:
  // Makes a GL context and makes it current on this thread, loads the module and creates the
  // effect's instance. Throws std::runtime_error: GlUnavailable when no OpenGL 4.1 context can
  // be made.
  explicit FrameRenderer(const std::string& modulePath);
  ~FrameRenderer();
  FrameRenderer(const FrameRenderer&) = delete;
  FrameRenderer& operator=(const FrameRenderer&) = delete;

  const refhost::ParamPanel& panel() const { return engine_->panel(); }
  const refhost::EffectVocabulary& vocabulary() const { return engine_->vocabulary(); }

  // Renders the frame into `out` (width x height RGBA, top row first). Needs this renderer's
  // context current (any BorrowedThread scope on this thread will do: the host makes it
  // current). Throws std::runtime_error when a message fails.
  void render(const RenderRequest& request, uint8_t* out);

  class GlUnavailable : public std::runtime_error {
   public:
    using std::runtime_error::runtime_error;
  };

 private:
  std::vector<uint8_t> rowsOf(const TrackPictures* track, int32_t position, int32_t width,
                              int32_t height) const;
  void applyComposition(const RenderRequest& request);
  void applyValues(const std::vector<refhost::ParamValue>& values);

  std::unique_ptr<refhost::Engine> engine_;
  const RenderRequest* request_ = nullptr;  // the frame being rendered, for the frame sources
  std::map<int, std::size_t> trackLayers_;  // the engine's layer of each track shown so far
  LayoutApplier layouts_;
  std::vector<uint8_t> upload_;  // the own picture turned bottom row first
  // Kept from frame to frame while the size stays: a new one would allocate its buffer anew.
  std::unique_ptr<refhost::FrameReadback> readback_;
  std::vector<refhost::ParamValue> applied_;
};

}  // namespace veltrane_mlt
