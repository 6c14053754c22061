// Rendering a run of frames with the stages overlapping: the sources decode ahead on their own
// threads, GL reads each frame back while the next one renders, and the sink writes behind its
// queue. Frames reach the sink in order, each exactly as a plain render and read-back give it.
#pragma once

#include <cstdint>
#include <functional>

#include "refhost/pipeline/async_frame_sink.h"
#include "refhost/engine/render_frame.h"

namespace refhost {

// Frames at most in flight between the render and the read-back.
constexpr int32_t kFramesInFlight = 2;

// For each frame from first to last: a render context, `draw` (which has the frame rendered
// into its output), and the read-back; each picture goes to the sink in order, and
// `written(count)` follows every hand-over. Any failure (a source's, the draw's, the sink's)
// leaves as the exception it raised. Needs the host's GL context.
void renderFrames(Host& host, const FrameSettings& settings, int32_t first, int32_t last,
                  const std::function<void(RenderFrame&)>& draw, AsyncFrameSink& sink,
                  const std::function<void(int32_t)>& written);

}  // namespace refhost
