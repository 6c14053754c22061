// `veltrane render` end to end: frames arrive upright and at the right time in every kind of
// output.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"
#include "refhost/image_files.h"
#include "refhost/test_patterns.h"
#include "refhost/video_reader.h"

namespace {

using nlohmann::json;

CliRun render(const std::string& scene, const std::vector<std::string>& more) {
  std::vector<std::string> args{"render", scene, "--plugin", VELTRANE_MODULE_PATH};
  args.insert(args.end(), more.begin(), more.end());
  return runCli(args);
}

TEST(RenderCommand, StillsAreUpright) {
  ScratchDirectory folder;
  CliRun run = render(writeScene(folder, smallScene("gradient")), {"-o", folder.file("g.png")});
  ASSERT_EQ(run.status, 0) << run.err;
  EXPECT_NE(run.out.find("wrote " + folder.file("g.png")), std::string::npos) << run.out;
  refhost::RgbaImage image = refhost::readImageFile(folder.file("g.png"));
  refhost::RgbaImage expected = refhost::generatePattern(refhost::Pattern::Gradient, 0, 64, 36);
  ASSERT_EQ(image.pixels.size(), expected.pixels.size());
  int worst = 0;
  for (std::size_t i = 0; i < image.pixels.size(); ++i)
    worst = std::max(worst, std::abs(image.pixels[i] - expected.pixels[i]));
  EXPECT_LE(worst, 1);                    // resampling at texel centres
  EXPECT_GE(image.pixel(10, 0)[1], 254);  // the first row is the top: green is full there
  EXPECT_LE(image.pixel(10, 35)[1], 1);
}

TEST(RenderCommand, EveryOutputKindCarriesTheFramesAsked) {
  ScratchDirectory folder;
  std::string scene = writeScene(folder, smallScene("counter"));
  auto code = [](const refhost::RgbaImage& image) {
    return static_cast<int>(refhost::readCounterCode(image).value_or(9999));
  };
  CliRun still = render(scene, {"-o", folder.file("f.exr"), "--frame", "5"});
  ASSERT_EQ(still.status, 0) << still.err;
  EXPECT_EQ(code(refhost::readImageFile(folder.file("f.exr"))), 5);

  CliRun sequence = render(scene, {"-o", folder.file("s_%04d.png"), "--frames", "2-4"});
  ASSERT_EQ(sequence.status, 0) << sequence.err;
  for (int frame : {2, 3, 4}) {
    std::string name = folder.file("s_000" + std::to_string(frame) + ".png");
    EXPECT_EQ(code(refhost::readImageFile(name)), frame) << name;
  }

  CliRun video = render(scene, {"--output", folder.file("v.mkv")});
  ASSERT_EQ(video.status, 0) << video.err;
  EXPECT_NE(video.err.find("10/10"), std::string::npos);  // the progress bar reached the end
  refhost::VideoReader reader(folder.file("v.mkv"));
  EXPECT_EQ(reader.frameCount(), 10);
  for (int frame : {0, 7, 9, 3}) EXPECT_EQ(code(reader.frame(frame, 64, 36)), frame);
  EXPECT_EQ(folder.entries().size(), 6u);  // scene, still, three frames, video: no leftovers
}

TEST(RenderCommand, TheShippedDemoSceneRenders) {
  ScratchDirectory folder;
  CliRun run = render(std::string(VELTRANE_SOURCE_DIR) + "/docs/examples/demo.json",
                      {"-o", folder.file("demo.png"), "--frame", "40", "--profile", "compat"});
  ASSERT_EQ(run.status, 0) << run.err;
  EXPECT_EQ(refhost::readImageFile(folder.file("demo.png")).width, 640);
}

TEST(BenchCommand, ReportsEveryCase) {
  CliRun run = runCli({"bench", "--plugin", VELTRANE_MODULE_PATH, "--sizes", "64x36,80x45",
                       "--cuts", "1,3", "--repeat", "1", "--warmup", "0", "--json"});
  ASSERT_EQ(run.status, 0) << run.err;
  json document = json::parse(run.out);
  ASSERT_EQ(document["results"].size(), 8u);  // 2 sizes x 2 cut counts x 2 input kinds
  const json& last = document["results"].back();
  EXPECT_EQ(last["width"], 80);
  EXPECT_EQ(last["cuts"], 3);
  EXPECT_EQ(last["inputs"], "layers");
  EXPECT_GT(last["renderMs"].get<double>(), 0.0);
  EXPECT_GT(last["fetchMs"].get<double>(), 0.0);  // nine layers were fetched
}

}  // namespace
