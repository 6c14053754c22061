// `veltrane render` carries sound: the audio of the frames rendered, timed by the composition's
// clock whatever the file's rate, as long as the video and starting with it (checked with
// ffprobe); copied where the container takes the codec, else encoded (AAC, Opus for WebM);
// from the effect's own source, from another file or a layer's with --audio-from, and none
// with --no-audio.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"

namespace {

struct Span {
  double start = 1e9, end = -1e9;
};

// Each stream's time from its first packet's start to its last one's end, as the file has them
// (Matroska keeps no duration a stream).
std::vector<Span> streamSpans(const std::string& path) {
  std::vector<Span> spans;
  const nlohmann::json packets =
      nlohmann::json::parse(commandOutput("ffprobe -v error -show_entries "
                                          "packet=stream_index,pts_time,duration_time -of json " +
                                          path))["packets"];
  for (const nlohmann::json& packet : packets) {
    const std::size_t stream = packet["stream_index"].get<std::size_t>();
    if (spans.size() <= stream) spans.resize(stream + 1);
    const double start = std::stod(packet["pts_time"].get<std::string>());
    const double length = packet.contains("duration_time")
                              ? std::stod(packet["duration_time"].get<std::string>())
                              : 0;
    spans[stream].start = std::min(spans[stream].start, start);
    spans[stream].end = std::max(spans[stream].end, start + length);
  }
  return spans;
}

TEST(RenderAudio, VideoOutputsCarryTheRenderedFramesSound) {
  ScratchDirectory folder;
  // Three seconds of test picture at 25 fps; the tone sounds from the second second on.
  const std::string make =
      "ffmpeg -v error -y -f lavfi -i testsrc=size=64x36:rate=25:duration=3 "
      "-f lavfi -i \"sine=frequency=440:duration=3,volume='if(lt(t,1),0,1)'"
      ":eval=frame\" -c:v libx264 -c:a ";
  ASSERT_EQ(std::system((make + "aac " + folder.file("aac.mp4")).c_str()), 0);
  ASSERT_EQ(std::system((make + "pcm_s16le " + folder.file("pcm.mkv")).c_str()), 0);
  struct Case {
    const char* source;  // the effect's own source; empty: a pattern, which has no sound
    std::vector<std::string> options;
    const char* out;
    const char* frames;
    int fps;
    const char* codec;  // of the audio written; empty: no audio
    bool loud;
  };
  const Case cases[] = {
      {"aac.mp4", {}, "copied.mp4", "25-49", 25, "aac", true},
      {"pcm.mkv", {}, "encoded.mp4", "25-49", 25, "aac", true},
      {"pcm.mkv", {}, "copied.mov", "0-24", 25, "pcm_s16le", false},
      {"pcm.mkv", {}, "opus.webm", "25-49", 25, "opus", true},
      {"aac.mp4", {"--no-audio"}, "silent.mp4", "10-40", 25, "", false},
      // Frames 25-49 at 50 fps are the file's first second (silent), not its frames 25-49.
      {"aac.mp4", {}, "fifty.mp4", "25-49", 50, "aac", false},
      {"", {"--audio-from", folder.file("aac.mp4")}, "other.mkv", "25-49", 25, "aac", true},
      // Layer B's file, not the own source's: its PCM is what the .mov copies.
      {"aac.mp4", {"--audio-from", "layer", "B"}, "layer.mov", "30-60", 25, "pcm_s16le", true},
  };
  for (const Case& c : cases) {
    nlohmann::json scene = smallScene("bars", 150);
    scene["fps"] = c.fps;
    if (*c.source) scene["source"] = {{"file", c.source}};
    scene["layers"].push_back({{"guid", "bbbbbbbb-0000-4000-8000-000000000002"},
                               {"name", "B"},
                               {"source", {{"file", "pcm.mkv"}}}});
    std::vector<std::string> args{
        "render", writeScene(folder, scene), "-o", folder.file(c.out), "--frames", c.frames};
    args.insert(args.end(), c.options.begin(), c.options.end());
    CliRun run = runCli(args);
    ASSERT_EQ(run.status, 0) << run.err;
    nlohmann::json streams = nlohmann::json::parse(
        commandOutput("ffprobe -v error -show_entries stream=codec_type,codec_name -of json " +
                      folder.file(c.out)))["streams"];
    ASSERT_EQ(streams.size(), *c.codec ? 2u : 1u) << c.out;
    if (!*c.codec) continue;
    EXPECT_EQ(streams[1]["codec_name"], c.codec) << c.out;
    // With the video at both ends, to whole packets: a copy cannot cut the packets at either
    // end (23 ms each here).
    const std::vector<Span> spans = streamSpans(folder.file(c.out));
    ASSERT_EQ(spans.size(), 2u) << c.out;
    EXPECT_NEAR(spans[1].start, spans[0].start, 0.05) << c.out;
    EXPECT_NEAR(spans[1].end, spans[0].end, 0.05) << c.out;
    std::string levels = commandOutput("ffmpeg -v info -i " + folder.file(c.out) +
                                       " -map 0:a -af volumedetect -f null - 2>&1");
    std::size_t at = levels.find("mean_volume: ");
    ASSERT_NE(at, std::string::npos) << levels;
    const double mean = std::stod(levels.substr(at + 13));
    EXPECT_EQ(mean > -40, c.loud) << c.out << " mean volume " << mean;
  }
}

}  // namespace
