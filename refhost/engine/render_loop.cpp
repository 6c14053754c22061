// The render loop: render, start the read-back, and hand over the oldest picture once the
// read-backs in flight reach their limit.
#include "refhost/engine/render_loop.h"

#include <deque>
#include <new>

#include "refhost/pipeline/frame_readback.h"

namespace refhost {
namespace {

void run(Engine& engine, const RenderRun& run, FrameSink& sink) {
  const FrameSettings& settings = engine.frameSettings();
  GlContext& gl = engine.gl();
  gl.makeCurrent();
  FrameReadback readback(settings.width, settings.height, kFramesInFlight, settings.format);
  std::deque<int32_t> reading;
  int32_t count = 0;
  auto handOver = [&] {
    gl.makeCurrent();
    sink.write(reading.front(), readback.collect());
    reading.pop_front();
    if (run.written) run.written(++count);
  };
  for (int32_t i = 0; i < run.count; ++i) {
    if (readback.full()) handOver();
    if (run.beforeFrame) run.beforeFrame();
    const int32_t frame = run.frameAt(i);
    {
      // The frame's textures go back to the host's pool when it ends; the read-back started
      // before keeps what it reads.
      std::unique_ptr<RenderFrame> rendered = engine.render(frame);
      gl.makeCurrent();
      readback.start(rendered->context().output.id);
    }
    reading.push_back(frame);
  }
  while (!reading.empty()) handOver();
}

}  // namespace

RenderRun framesFromTo(int32_t first, int32_t last) {
  RenderRun frames;
  frames.count = last >= first ? last - first + 1 : 0;
  frames.frameAt = [first](int32_t i) { return first + i; };
  return frames;
}

void renderFrames(Engine& engine, const RenderRun& frames, FrameSink& sink) {
  try {
    run(engine, frames, sink);
  } catch (const std::bad_alloc&) {
    engine.throwFrameMemoryError();
  }
}

}  // namespace refhost
