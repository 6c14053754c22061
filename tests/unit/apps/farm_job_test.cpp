// A job divided into chunks and assembled equals a single render of it; a chunk that does not fit
// is refused in one line with nothing written, and rendering it again gives the clean result.
#include <gtest/gtest.h>
#include <signal.h>

#include <filesystem>
#include <functional>

#include "cli_runner.h"
#include "support/child_process.h"

namespace {

namespace fs = std::filesystem;

// A folder with two clips of smooth moving pictures made by FFmpeg (which CRF 18 keeps well above
// 45 dB), the first with a tone, and a scene of 60 frames that shows the first clip 7 frames back
// and 9 ahead and the second as a layer from frame 23 on, 3 frames back.
class FarmJob : public ::testing::Test {
 protected:
  void SetUp() override {
    auto make = [&](const std::string& options, const char* name) {
      return std::system(
          ("ffmpeg -v error -y -f lavfi -i gradients=size=320x180:rate=25:duration=4:" + options +
           " -c:v libx264 -g 30 " + folder.file(name))
              .c_str());
    };
    ASSERT_EQ(make("speed=0.02 -f lavfi -i sine=frequency=440:duration=4 -c:a aac", "a.mp4"), 0);
    ASSERT_EQ(make("speed=0.05:seed=3:n=5", "b.mp4"), 0);
    writeText(scene, scene_text());
  }

  static std::string scene_text(int borderWidth = 2) {
    return R"({"width": 320, "height": 180, "fps": 25, "duration": 60, "source": {"file": "a.mp4"},
 "layers": [{"guid": "bbbbbbbb-0000-4000-8000-000000000002", "name": "B", "firstFrame": 23,
             "source": {"file": "b.mp4"}}],
 "params": {"numberOfCuts": 2, "cutPosition_0": [-20, 0], "cutDirection_0": 10,
            "cutPosition_1": [30, 0], "cutDirection_1": 100, "inputFrameShift0": -7,
            "inputFrameShift1": 9, "inputLayer2": "bbbbbbbb-0000-4000-8000-000000000002",
            "inputFrameShift2": -3, "borderWidth": )" +
           std::to_string(borderWidth) + "}}";
  }

  // Plans the job and renders every chunk; returns the number of chunks.
  std::size_t renderChunks(const std::string& out, std::vector<std::string> options) {
    options.insert(options.begin(), {"plan", scene, "-o", folder.file(out)});
    const CliRun plan = runCli(options);
    EXPECT_EQ(plan.status, 0) << plan.err;
    const std::size_t chunks = static_cast<std::size_t>(
        std::count(plan.out.begin(), plan.out.end(), '\n'));  // a command a chunk
    for (std::size_t i = 0; i < chunks; ++i) renderChunk(out, i);
    return chunks;
  }
  void renderChunk(const std::string& out, std::size_t index) {
    const CliRun run = runCli(
        {"render", "--plan", folder.file(out) + ".plan.json", "--chunk", std::to_string(index)});
    EXPECT_EQ(run.status, 0) << run.err;
  }
  CliRun assemble(const std::string& out) {
    return runCli({"assemble", folder.file(out) + ".plan.json"});
  }
  // What FFmpeg reads of a stream: each video frame's checksum, the sound's packets, or every
  // frame's presentation time.
  std::string digest(const std::string& file, const std::string& what) {
    const std::string path = folder.file(file);
    if (what == "times")
      return commandOutput(
          "for s in v a; do ffprobe -v error -select_streams $s -show_entries "
          "frame=pts_time -of csv=p=0 " +
          path + " | grep -Eo '^[0-9.]+'; done");
    const std::string map = what == "frames" ? "-map 0:v -f framemd5" : "-map 0:a -c copy -f md5";
    return commandOutput("ffmpeg -v error -i " + path + " " + map + " - | grep -v '^#'");
  }

  ScratchDirectory folder;
  const std::string scene = folder.file("scene.json");
};

TEST_F(FarmJob, AssembledChunksEqualASingleRender) {
  struct Case {
    const char* out;
    std::vector<std::string> job;     // the render's options
    std::vector<std::string> chunks;  // how the plan divides it
    bool lossless;
  };
  const Case cases[] = {
      {"lossless.mkv", {"--codec", "ffv1"}, {"--chunks", "4"}, true},
      // The last chunk is frame 41 alone.
      {"h264.mp4", {"--crf", "18", "--frames", "3-41"}, {"--chunk-frames", "19"}, false},
      {"h265.mov", {"--codec", "h265", "--crf", "18"}, {"--chunks", "3", "--gop", "12"}, false},
  };
  for (const Case& c : cases) {
    std::vector<std::string> planned = c.job;
    planned.insert(planned.end(), c.chunks.begin(), c.chunks.end());
    renderChunks(c.out, planned);
    const CliRun assembled = assemble(c.out);
    ASSERT_EQ(assembled.status, 0) << assembled.err;
    std::vector<std::string> single{"render", scene, "-o",
                                    folder.file(std::string("single-") + c.out)};
    single.insert(single.end(), c.job.begin(), c.job.end());
    ASSERT_EQ(runCli(single).status, 0);
    const std::string whole = std::string("single-") + c.out;
    EXPECT_EQ(digest(c.out, "times"), digest(whole, "times")) << c.out;
    EXPECT_EQ(digest(c.out, "sound"), digest(whole, "sound")) << c.out;
    if (c.lossless) {
      EXPECT_EQ(digest(c.out, "frames"), digest(whole, "frames")) << c.out;
      continue;
    }
    const std::string psnr =
        commandOutput("ffmpeg -i " + folder.file(c.out) + " -i " + folder.file(whole) +
                      " -lavfi '[0:v][1:v]psnr' -f null - 2>&1 | grep -o 'min:[0-9.inf]*'");
    ASSERT_GT(psnr.size(), 4u) << c.out;
    EXPECT_GE(std::stod(psnr.substr(4)), 45.0) << c.out << " " << psnr;
  }
}

TEST_F(FarmJob, RefusesChunksThatDoNotFitAndTakesThemRenderedAgain) {
  ASSERT_EQ(renderChunks("job.mkv", {"--codec", "ffv1", "--chunks", "4"}), 4u);
  ASSERT_EQ(assemble("job.mkv").status, 0);
  const std::string clean = digest("job.mkv", "frames");
  // Chunks of the same frames from another version of the scene, and with other settings.
  writeText(folder.file("edited.json"), scene_text(5));
  runCli({"plan", folder.file("edited.json"), "--codec", "ffv1", "--chunks", "4", "-o",
          folder.file("edited.mkv")});
  runCli({"render", "--plan", folder.file("edited.mkv.plan.json"), "--chunk", "1"});
  writeText(folder.file("same.json"), scene_text());
  runCli({"plan", folder.file("same.json"), "--codec", "ffv1", "--chunks", "4", "--gop", "5", "-o",
          folder.file("gop.mkv")});
  runCli({"render", "--plan", folder.file("gop.mkv.plan.json"), "--chunk", "2"});
  const std::string plan = folder.file("job.mkv.plan.json");
  auto chunk = [&](int i) { return folder.file("job.chunk00" + std::to_string(i) + ".mkv"); };
  auto killWhenStaged = [&](int pid) {
    testsupport::waitUntil(
        [&] {
          for (const std::string& name : folder.entries())
            if (name.rfind(".job.chunk003.mkv.partial", 0) == 0) return true;
          return false;
        },
        60);
    kill(pid, SIGKILL);
  };

  struct Case {
    const char* what;
    std::function<void()> damage;
    const char* says;
    int redo;  // the chunk rendered again afterwards; -1: none
  };
  auto replaceWith = [&](const std::string& other, int i) {
    return [&, other, i] {
      fs::copy_file(folder.file(other), chunk(i), fs::copy_options::overwrite_existing);
    };
  };
  const Case cases[] = {
      {"missing", [&] { fs::remove(chunk(2)); }, "chunk 2 (", 2},
      {"another scene", replaceWith("edited.chunk001.mkv", 1), "another version of the scene", 1},
      {"other settings", replaceWith("gop.chunk002.mkv", 2), "other settings", 2},
      {"out of order", replaceWith("job.chunk000.mkv", 3),
       "holds chunk 0, frames 0-14, not chunk 3", 3},
      {"cut short", [&] { fs::resize_file(chunk(1), fs::file_size(chunk(1)) / 2); }, "chunk 1", 1},
      {"killed while rendered",
       [&] {
         fs::remove(chunk(3));
         EXPECT_EQ(runCli({"render", "--plan", plan, "--chunk", "3"}, VELTRANE_MODULE_PATH,
                          killWhenStaged)
                       .status,
                   -1);
         EXPECT_FALSE(fs::exists(chunk(3)));
       },
       "chunk 3 (", 3}};
  for (const Case& c : cases) {
    c.damage();
    const CliRun refused = assemble("job.mkv");
    EXPECT_EQ(refused.status, 1) << c.what;
    EXPECT_NE(refused.err.find(c.says), std::string::npos) << c.what << ": " << refused.err;
    EXPECT_EQ(std::count(refused.err.begin(), refused.err.end(), '\n'), 1) << refused.err;
    EXPECT_EQ(digest("job.mkv", "frames"), clean) << c.what;
    renderChunk("job.mkv", static_cast<std::size_t>(c.redo));
    ASSERT_EQ(assemble("job.mkv").status, 0) << c.what;
    EXPECT_EQ(digest("job.mkv", "frames"), clean) << c.what;
  }

  // A chunk out of range, or a scene edited since the plan, writes nothing.
  const std::vector<std::string> before = folder.entries();
  const CliRun outside = runCli({"render", "--plan", plan, "--chunk", "4"});
  EXPECT_NE(outside.err.find("has chunks 0 to 3, got '4'"), std::string::npos) << outside.err;
  writeText(scene, scene_text(3));
  const CliRun edited = runCli({"render", "--plan", plan, "--chunk", "0"});
  EXPECT_NE(edited.err.find("has changed since"), std::string::npos) << edited.err;
  EXPECT_NE(assemble("job.mkv").status, 0);
  EXPECT_EQ(folder.entries(), before);
}

}  // namespace
