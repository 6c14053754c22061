// The render loop through the engine: pictures reach the sink in order, decoding ahead gives the
// source's frames in any order, and a failure anywhere stops the run leaving nothing.
#include "refhost/engine/render_loop.h"

#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <thread>

#include "refhost/engine/composition.h"
#include "refhost/media/image_files.h"
#include "refhost/pipeline/async_frame_sink.h"
#include "refhost/pipeline/frame_prefetch.h"
#include "support/engine_fixture.h"
#include "support/temp_paths.h"

namespace refhost {
namespace {

// Frame i at width w is (i, w, 0, 255) everywhere; fails at `failAt`.
class NumberedSource : public MediaSource {
 public:
  explicit NumberedSource(int32_t failAt = -1) : failAt_(failAt) {}
  RgbaImage frame(int32_t index, int32_t width, int32_t height, PixelFormat) override {
    if (index == failAt_)
      throw std::runtime_error("clip.mp4: cannot decode video: frame " + std::to_string(index));
    return RgbaImage(width, height,
                     {static_cast<uint8_t>(index), static_cast<uint8_t>(width), 0, 255});
  }

 private:
  int32_t failAt_;
};

TEST(PrefetchingSource, GivesTheWrappedSourcesFramesWhateverTheOrder) {
  NumberedSource direct(7);
  PrefetchingSource ahead(std::make_shared<NumberedSource>(7), 3);
  const int32_t requests[][2] = {{0, 4}, {1, 4},  {2, 4},  {2, 4}, {1, 4}, {5, 4},
                                 {6, 4}, {12, 4}, {13, 2}, {3, 2}, {6, 2}, {8, 2}};
  for (const auto& r : requests)
    EXPECT_EQ(ahead.glRows(r[0], r[1], 2, PixelFormat::Rgba8),
              direct.glRows(r[0], r[1], 2, PixelFormat::Rgba8))
        << r[0] << " " << r[1];
  // The worker has met the failing frame by now; it surfaces when asked for, and again.
  for (int attempt = 0; attempt < 2; ++attempt)
    EXPECT_THROW(ahead.glRows(7, 2, 2, PixelFormat::Rgba8), std::runtime_error);
  EXPECT_EQ(ahead.glRows(8, 2, 2, PixelFormat::Rgba8), direct.glRows(8, 2, 2, PixelFormat::Rgba8));
}

// Frames decoded ahead take room in a shared budget until handed over or dropped; frames asked
// for go ahead without room; nothing stays taken once the sources are gone.
TEST(PrefetchingSource, FramesAheadShareOneBudget) {
  constexpr std::size_t kFrame = 4 * 2 * 4;  // 4x2 pixels in 8 bits
  auto budget = std::make_shared<DecodeAheadBudget>(2 * kFrame);
  NumberedSource direct;
  const auto waitFor = [&](std::size_t bytes) {
    for (int i = 0; i < 2000 && budget->inUse() != bytes; ++i)
      std::this_thread::sleep_for(std::chrono::milliseconds(1));
    return budget->inUse();
  };
  {
    PrefetchingSource first(std::make_shared<NumberedSource>(), 3, budget);
    PrefetchingSource second(std::make_shared<NumberedSource>(), 3, budget);
    EXPECT_EQ(first.glRows(0, 4, 2, PixelFormat::Rgba8),
              direct.glRows(0, 4, 2, PixelFormat::Rgba8));
    // The first source fills the budget with frames 1 and 2 and can hold no third.
    EXPECT_EQ(waitFor(2 * kFrame), 2 * kFrame);
    // With no room left, the second source's frames still come when asked for.
    for (int32_t frame = 0; frame < 4; ++frame)
      EXPECT_EQ(second.glRows(frame, 4, 2, PixelFormat::Rgba8),
                direct.glRows(frame, 4, 2, PixelFormat::Rgba8));
    EXPECT_LE(budget->inUse(), 2 * kFrame);
    // Frames handed over, or dropped by a jump, give their room back.
    EXPECT_EQ(first.glRows(9, 4, 2, PixelFormat::Rgba8),
              direct.glRows(9, 4, 2, PixelFormat::Rgba8));
    EXPECT_LE(waitFor(2 * kFrame), 2 * kFrame);
  }
  EXPECT_EQ(budget->inUse(), 0u);
}

// A failed write stops the run the same way; the command line's tests fill a disk to show it.
TEST(RenderLoop, PicturesComeInOrderAndAFailureAnywhereStopsTheRunLeavingNothing) {
  enum class Stage { None, Decoding, Stopping };
  for (Stage stage : {Stage::None, Stage::Decoding, Stage::Stopping}) {
    const std::string folder = testsupport::makeTempDirectory("loop");
    std::unique_ptr<Engine> engine =
        testsupport::startEngine({32, 18, 25.0, 1.0f, 12, ""}, [&](Engine& e) {
          e.setSourceFrames(frameSourceOf(std::make_shared<PrefetchingSource>(
              std::make_shared<NumberedSource>(stage == Stage::Decoding ? 5 : -1), 3)));
        });
    engine->setParam("borderWidth", ParamValue::ofFloat(0));  // every picture its source frame
    auto sink = std::make_unique<AsyncFrameSink>(
        openFrameSink(parseOutputTarget(folder + "/out_%04d.png"), 32, 18, {25, 1}), 2, 3);
    RenderRun run = framesFromTo(0, 11);
    std::vector<int32_t> written;
    int32_t started = 0;
    run.beforeFrame = [&] {
      if (stage == Stage::Stopping && started == 5) throw std::runtime_error("stopped");
      ++started;
    };
    run.written = [&](int32_t n) { written.push_back(n); };
    std::string error;
    try {
      renderFrames(*engine, run, *sink);
      std::vector<std::string> names = sink->commit();
      ASSERT_EQ(names.size(), 12u);
      for (int32_t frame : {0, 6, 11})
        EXPECT_EQ(readImageFile(names[static_cast<std::size_t>(frame)]).pixel(2, 3),
                  (Rgba8{static_cast<uint8_t>(frame), 32, 0, 255}));
    } catch (const std::runtime_error& failure) {
      error = failure.what();
    }
    const char* expected[] = {"", "clip.mp4: cannot decode video: frame 5", "stopped"};
    EXPECT_EQ(error, expected[static_cast<int>(stage)]);
    if (stage == Stage::None) {
      EXPECT_EQ(written, (std::vector<int32_t>{1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12}));
      // Three textures a frame, two frames in flight: the pool stops growing after the start.
      EXPECT_LE(engine->texturesMade(), 9u);
    } else {
      sink.reset();  // as the command line's unwinding does
      EXPECT_TRUE(std::filesystem::is_empty(folder)) << expected[static_cast<int>(stage)];
    }
    engine.reset();
    std::filesystem::remove_all(folder);
  }
}

// Records the frames each of its readers was asked for.
struct ReaderLog {
  std::vector<std::vector<int32_t>> asked;
  FrameSource open() {
    asked.emplace_back();
    const std::size_t reader = asked.size() - 1;
    return [this, reader](int32_t frame, int32_t width, int32_t height, refhost::PixelFormat) {
      asked[reader].push_back(frame);
      return std::vector<uint8_t>(static_cast<std::size_t>(width) * height * 4, 255);
    };
  }
};

TEST(RenderLoop, ATimeShiftedCopyReadsOnInOrderWithAReaderOfItsOwn) {
  ReaderLog log;
  auto started = testsupport::startEngine({32, 18, 25.0, 1.0f, 40, ""}, [&](Engine& e) {
    e.setSourceFrames(log.open(), [&] { return log.open(); });
  });
  Engine& engine = *started;
  engine.setParam("inputFrameShift1", ParamValue::ofInt(5));
  class Dropping : public FrameSink {
    void write(int32_t, const RgbaImage&) override {}
    std::vector<std::string> commit() override { return {}; }
  } sink;
  renderFrames(engine, framesFromTo(0, 9), sink);
  // The frame rendered and the frame five ahead, each from a reader going forward only.
  ASSERT_EQ(log.asked.size(), 2u);
  std::vector<int32_t> expected;
  for (int32_t frame = 0; frame <= 9; ++frame) expected.push_back(frame);
  EXPECT_EQ(log.asked[0], expected);
  for (int32_t& frame : expected) frame += 5;
  EXPECT_EQ(log.asked[1], expected);
  engine.finish();
}

}  // namespace
}  // namespace refhost
