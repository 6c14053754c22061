// The render loop: draw, start the read-back, and hand over the oldest frame once the
// read-backs in flight reach their limit.
#include "refhost/engine/frame_pipeline.h"

#include <deque>
#include <stdexcept>

#include "refhost/pipeline/frame_readback.h"

namespace refhost {

void renderFrames(Host& host, const FrameSettings& settings, int32_t first, int32_t last,
                  const std::function<void(RenderFrame&)>& draw, AsyncFrameSink& sink,
                  const std::function<void(int32_t)>& written) {
  if (!host.gl()) throw std::logic_error("refhost::renderFrames: no GL context attached");
  GlContext& gl = *host.gl();
  gl.makeCurrent();
  FrameReadback readback(settings.width, settings.height, kFramesInFlight);
  std::deque<int32_t> reading;
  int32_t count = 0;
  auto handOver = [&] {
    gl.makeCurrent();
    sink.write(reading.front(), readback.collect());
    reading.pop_front();
    if (written) written(++count);
  };
  for (int32_t frame = first; frame <= last; ++frame) {
    if (readback.full()) handOver();
    {
      // The frame's textures go back to the host's pool when it ends; the read-back started
      // before keeps what it reads.
      RenderFrame context(host, settings, frame);
      draw(context);
      gl.makeCurrent();
      readback.start(context.context().output.id);
    }
    reading.push_back(frame);
  }
  while (!reading.empty()) handOver();
}

}  // namespace refhost
