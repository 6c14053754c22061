// `veltrane render` with its stages overlapped: every frame of the counter source arrives in
// its own place, in order, in a sequence written by several writers and in a video, and the
// progress line tells the rate and the time left.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"
#include "refhost/image_files.h"
#include "refhost/test_patterns.h"
#include "refhost/video_reader.h"

namespace {

TEST(RenderPipeline, EveryFrameOfTheCounterArrivesInOrder) {
  ScratchDirectory folder;
  const nlohmann::json scene = {{"width", 64},
                                {"height", 36},
                                {"fps", 25},
                                {"duration", 30},
                                {"source", {{"pattern", "counter"}}},
                                {"params", {{"borderWidth", 0}, {"cutPosition_0", {28, 0}}}}};
  writeText(folder.file("scene.json"), scene.dump());
  auto code = [](const refhost::RgbaImage& image) {
    return static_cast<int>(refhost::readCounterCode(image).value_or(9999));
  };
  for (const char* output : {"f_%04d.png", "v.mkv"}) {
    CliRun run = runCli({"render", folder.file("scene.json"), "--plugin", VELTRANE_MODULE_PATH,
                         "-o", folder.file(output), "--frames", "1-29"});
    ASSERT_EQ(run.status, 0) << run.err;
    EXPECT_NE(run.err.find(" fps "), std::string::npos) << run.err;
    EXPECT_NE(run.err.find(" s left"), std::string::npos) << run.err;
  }
  refhost::VideoReader video(folder.file("v.mkv"));
  ASSERT_EQ(video.frameCount(), 29);
  for (int frame = 1; frame <= 29; ++frame) {
    char name[32];
    std::snprintf(name, sizeof name, "f_%04d.png", frame);
    EXPECT_EQ(code(refhost::readImageFile(folder.file(name))), frame) << name;
    EXPECT_EQ(code(video.frame(frame - 1, 64, 36)), frame) << "video frame " << frame - 1;
  }
  EXPECT_EQ(folder.entries().size(), 31u);  // scene, 29 frames, the video: nothing else
}

}  // namespace
