// `veltrane render` end to end: frames arrive upright, in order and at the right time in every
// kind of output, with a progress line telling the rate and the time left.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"
#include "refhost/media/image_files.h"
#include "refhost/media/test_patterns.h"
#include "refhost/media/video_reader.h"

namespace {

TEST(RenderCommand, StillsAreUpright) {
  ScratchDirectory folder;
  CliRun run =
      runCli({"render", writeScene(folder, smallScene("gradient")), "-o", folder.file("g.png")});
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

// Sequences are written by several writers and videos through a queue: every frame of the
// counter source must still arrive in its own place.
TEST(RenderCommand, EveryOutputKindCarriesTheFramesAskedInOrder) {
  ScratchDirectory folder;
  std::string scene = writeScene(folder, smallScene("counter", 30));
  // EXR stills come back as half floats.
  auto code = [](const refhost::RgbaImage& image) {
    return static_cast<int>(
        refhost::readCounterCode(refhost::converted(image, refhost::PixelFormat::Rgba8))
            .value_or(9999));
  };
  CliRun still = runCli({"render", scene, "-o", folder.file("f.exr"), "--frame", "5"});
  ASSERT_EQ(still.status, 0) << still.err;
  EXPECT_EQ(code(refhost::readImageFile(folder.file("f.exr"))), 5);
  const std::pair<std::string, std::vector<std::string>> runs[] = {
      {"s_%04d.png", {"--frames", "1-29"}}, {"v.mkv", {"--frames", "1-29"}}, {"all.mkv", {}}};
  for (const auto& [output, frames] : runs) {
    std::vector<std::string> args{"render", scene, "-o", folder.file(output)};
    args.insert(args.end(), frames.begin(), frames.end());
    CliRun run = runCli(args);
    ASSERT_EQ(run.status, 0) << run.err;
    const std::string count = frames.empty() ? "30/30" : "29/29";
    for (const std::string& progress : {count + "  ", std::string(" fps "), std::string(" s left")})
      EXPECT_NE(run.err.find(progress), std::string::npos) << output << ": " << run.err;
  }
  auto video = refhost::openMediaSource(refhost::MediaSpec::ofFile(folder.file("v.mkv")), {25, 1});
  auto all = refhost::openMediaSource(refhost::MediaSpec::ofFile(folder.file("all.mkv")), {25, 1});
  ASSERT_EQ(video->frameCount(), 29);
  ASSERT_EQ(all->frameCount(), 30);
  for (int frame = 1; frame <= 29; ++frame) {
    char name[32];
    std::snprintf(name, sizeof name, "s_%04d.png", frame);
    EXPECT_EQ(code(refhost::readImageFile(folder.file(name))), frame) << name;
    EXPECT_EQ(code(video->frame(frame - 1, 64, 36, refhost::PixelFormat::Rgba8)), frame)
        << "video frame " << frame - 1;
  }
  for (int frame : {0, 7, 29, 3})
    EXPECT_EQ(code(all->frame(frame, 64, 36, refhost::PixelFormat::Rgba8)), frame) << frame;
  EXPECT_EQ(folder.entries().size(), 33u);  // scene, still, 29 frames, two videos: nothing else
}

// The bare-GL replica of `--floor` draws the effect's own picture (the bench stops when it does
// not); every case gets its times.
TEST(BenchCommand, ReportsEveryCase) {
  CliRun run = runCli({"bench", "--sizes", "64x36,96x54", "--cuts", "1,3,8", "--repeat", "1",
                       "--warmup", "0", "--json"});
  ASSERT_EQ(run.status, 0) << run.err;
  nlohmann::json rows = nlohmann::json::parse(run.out)["results"];
  ASSERT_EQ(rows.size(), 12u);  // 2 sizes x 3 cut counts x 2 input kinds
  EXPECT_EQ(rows.back()["width"], 96);
  EXPECT_EQ(rows.back()["cuts"], 8);
  EXPECT_EQ(rows.back()["inputs"], "layers");
  EXPECT_GT(rows.back()["fetchMs"].get<double>(), 0.0);  // nine layers were fetched
  for (const nlohmann::json& row : rows) EXPECT_GT(row["renderMs"].get<double>(), 0.0) << row;

  // The table's total is the sum of the four parts beside it.
  run = runCli({"bench", "--sizes", "64x36", "--cuts", "3", "--inputs", "layers", "--repeat", "1",
                "--warmup", "0"});
  ASSERT_EQ(run.status, 0) << run.err;
  double render = 0, fetch = 0, upload = 0, readback = 0, total = 0;
  const std::size_t row = run.out.find("\n64x36");
  ASSERT_NE(row, std::string::npos) << run.out;
  ASSERT_EQ(std::sscanf(run.out.c_str() + row, " 64x36 3 layers %lf %lf %lf %lf %lf", &render,
                        &fetch, &upload, &readback, &total),
            5)
      << run.out;
  EXPECT_NEAR(total, render + fetch + upload + readback, 0.021) << run.out;
}

}  // namespace
