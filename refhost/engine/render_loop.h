// Rendering a run of frames with the stages overlapping: the sources decode ahead on their own
// threads, GL reads each frame back while the next one renders, and the sink writes behind its
// queue. Frames reach the sink in order, each exactly as a render and read-back of that frame
// alone give it. Every command that renders runs of frames (render, soak) goes through here.
#pragma once

#include <cstdint>
#include <functional>

#include "refhost/engine.h"
#include "refhost/pipeline/frame_output.h"

namespace refhost {

// Frames at most in flight between the render and the read-back.
constexpr int32_t kFramesInFlight = 2;

struct RenderRun {
  int32_t count = 0;  // pictures to render
  // The composition frame of the i-th picture (0 <= i < count).
  std::function<int32_t(int32_t)> frameAt;
  // Called before each render (a place to stop).
  std::function<void()> beforeFrame;
  // Called after each hand-over to the sink with how many pictures it holds.
  std::function<void(int32_t)> written;
};

// Frames first to last in order.
RenderRun framesFromTo(int32_t first, int32_t last);

// Renders the run through the engine and hands each picture to the sink (the picture's number
// is its composition frame). A failure of any stage (a source's, a message's, the sink's)
// leaves as the exception it raised; running out of memory anywhere leaves as the engine's
// FrameMemoryError.
void renderFrames(Engine& engine, const RenderRun& run, FrameSink& sink);

}  // namespace refhost
