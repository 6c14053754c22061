// The overlapped render loop and its stages: decoding ahead gives exactly the wrapped source's
// frames in any order of asking, and a failure in decoding or drawing stops the run with that
// failure's own message and leaves no file behind.
#include "refhost/engine/composition.h"
#include "refhost/engine/frame_pipeline.h"

#include <GL/glew.h>
#include <gtest/gtest.h>

#include <filesystem>

#include "refhost/pipeline/frame_prefetch.h"
#include "refhost/media/image_files.h"
#include "support/gl_host.h"
#include "support/temp_paths.h"

namespace refhost {
namespace {

// Frame i at width w is w * 1000 + i in every byte's place; fails at `failAt`.
class NumberedSource : public MediaSource {
 public:
  explicit NumberedSource(int32_t failAt = -1) : failAt_(failAt) {}
  RgbaImage frame(int32_t index, int32_t width, int32_t height) override {
    if (index == failAt_)
      throw std::runtime_error("clip.mp4: cannot decode video: frame " + std::to_string(index));
    return RgbaImage(width, height,
                     {static_cast<uint8_t>(index), static_cast<uint8_t>(width), 0, 1});
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
    EXPECT_EQ(ahead.glRows(r[0], r[1], 2), direct.glRows(r[0], r[1], 2)) << r[0] << " " << r[1];
  // The worker has met the failing frame by now; it surfaces when asked for, and again.
  for (int attempt = 0; attempt < 2; ++attempt)
    EXPECT_THROW(ahead.glRows(7, 2, 2), std::runtime_error);
  EXPECT_EQ(ahead.glRows(8, 2, 2), direct.glRows(8, 2, 2));
}

using FramePipeline = testsupport::GlHostTest;

// A failed write stops the run the same way; the command line's tests fill a disk to show it.
TEST_F(FramePipeline, AFailureInDecodingOrDrawingStopsTheRunWithItsMessageAndLeavesNothing) {
  enum class Stage { None, Decoding, Drawing };
  const FrameSettings settings{32, 18, 25.0, 1.0f, 12, ""};
  for (Stage stage : {Stage::None, Stage::Decoding, Stage::Drawing}) {
    const std::string folder = testsupport::makeTempDirectory("pipeline");
    host().setSourceFrames(frameSourceOf(std::make_shared<PrefetchingSource>(
        std::make_shared<NumberedSource>(stage == Stage::Decoding ? 5 : -1), 3)));
    auto sink = std::make_unique<AsyncFrameSink>(
        openFrameSink(parseOutputTarget(folder + "/out_%04d.png"), 32, 18, 25.0), 2, 3);
    std::vector<int32_t> written;
    auto draw = [&](RenderFrame& frame) {
      if (stage == Stage::Drawing && frame.context().time == 5)
        throw std::runtime_error("message 10 answered 5, expected 1");
      const WispRenderContext& c = frame.context();
      glCopyImageSubData(c.source.id, GL_TEXTURE_2D, 0, 0, 0, 0, c.output.id, GL_TEXTURE_2D, 0, 0,
                         0, 0, 32, 18, 1);
    };
    std::string error;
    try {
      renderFrames(host(), settings, 0, 11, draw, *sink, [&](int32_t n) { written.push_back(n); });
      std::vector<std::string> names = sink->commit();
      ASSERT_EQ(names.size(), 12u);
      // The last frame written shows its own source frame.
      EXPECT_EQ(readImageFile(names.back()).pixel(31, 0), (Rgba8{11, 32, 0, 1}));
    } catch (const std::runtime_error& failure) {
      error = failure.what();
    }
    const char* expected[] = {"", "clip.mp4: cannot decode video: frame 5",
                              "message 10 answered 5, expected 1"};
    EXPECT_EQ(error, expected[static_cast<int>(stage)]);
    if (stage == Stage::None) {
      EXPECT_EQ(written.size(), 12u);
      EXPECT_EQ(written.back(), 12);
      // Three textures a frame, two frames in flight: the pool stops growing after the start.
      EXPECT_LE(host().texturePool().created(), 9u);
    } else {
      sink.reset();  // as the command line's unwinding does
      EXPECT_TRUE(std::filesystem::is_empty(folder)) << expected[static_cast<int>(stage)];
    }
    std::filesystem::remove_all(folder);
  }
}

}  // namespace
}  // namespace refhost
