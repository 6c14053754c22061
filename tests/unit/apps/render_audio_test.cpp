// `veltrane render` and `split` carry the sound asked for, timed by the composition's clock, as
// long as the video; copied or encoded as the container takes it, or none with a note why.
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

// The mean volume of a file's sound from `from` seconds on, in dB.
double meanVolume(const std::string& path, double from = 0) {
  const std::string levels = commandOutput("ffmpeg -v info -ss " + std::to_string(from) + " -i " +
                                           path + " -map 0:a -af volumedetect -f null - 2>&1");
  const std::size_t at = levels.find("mean_volume: ");
  EXPECT_NE(at, std::string::npos) << levels;
  return at == std::string::npos ? 0 : std::stod(levels.substr(at + 13));
}

// Rendered scenes and splits of clips, each video's sound checked against its pictures' span
// and for its codec and level; a silent one's note.
TEST(RenderAudio, VideoOutputsCarryTheSoundAskedFor) {
  ScratchDirectory folder;
  // Three seconds of test picture at 25 fps; the tone sounds from the second second on.
  const std::string make =
      "ffmpeg -v error -y -f lavfi -i testsrc=size=64x36:rate=25:duration=3 "
      "-f lavfi -i \"sine=frequency=440:duration=3,volume='if(lt(t,1),0,1)'"
      ":eval=frame\" -c:v libx264 -c:a ";
  const std::string aac = folder.file("aac.mp4");
  ASSERT_EQ(std::system((make + "aac " + aac).c_str()), 0);
  ASSERT_EQ(std::system((make + "pcm_s16le " + folder.file("pcm.mkv")).c_str()), 0);
  // For splits: a quiet tone of 2 s, 3 s without sound, a loud tone of 4 s.
  auto clip = [&](const char* name, const char* seconds, const std::string& sound) {
    commandOutput("ffmpeg -v error -f lavfi -i testsrc=size=64x36:rate=25 " + sound + " -t " +
                  seconds + " -c:v libx264 -c:a aac " + folder.file(name));
    return folder.file(name);
  };
  const std::string quiet = clip("quiet.mp4", "2", "-f lavfi -i sine=440,volume=0.1");
  const std::string none = clip("none.mp4", "3", ""),
                    loud = clip("loud.mp4", "4", "-f lavfi -i sine=880");
  const double kLoud = -40;  // the tone heard, in mean dB; below it only silence
  struct Case {
    const char* out;
    const char* source;        // a rendered scene's own source ("": a pattern, without sound),
    int fps;                   // its rate; or 0: a split of the clips in `options`
    const char* codec;         // of the audio written; "": none
    double quietest, loudest;  // its mean volume in dB
    std::vector<std::string> options;
    std::string silence = "";  // why there is no audio, as the note says
  };
  const std::vector<std::string> clips{quiet, none, loud};
  auto split = [&](std::vector<std::string> options) {
    options.insert(options.begin(), clips.begin(), clips.end());
    return options;
  };
  const std::vector<std::string> layerB{"--frames", "30-60", "--audio-from", "layer", "B"};
  const std::string firstClipSilent =
      "clip 1 (none.mp4) has no sound; --audio-from N or --audio mix takes the sound of other "
      "clips";
  const Case cases[] = {
      {"copied.mp4", "aac.mp4", 25, "aac", kLoud, 0, {"--frames", "25-49"}},
      {"encoded.mp4", "pcm.mkv", 25, "aac", kLoud, 0, {"--frames", "25-49"}},
      {"copied.mov", "pcm.mkv", 25, "pcm_s16le", -200, kLoud, {"--frames", "0-24"}},
      {"opus.webm", "pcm.mkv", 25, "opus", kLoud, 0, {"--frames", "25-49"}},
      {"silent.mp4", "aac.mp4", 25, "", 0, 0, {"--frames", "10-40", "--no-audio"}, "--no-audio"},
      // Frames 25-49 at 50 fps are the file's first second (silent), not its frames 25-49.
      {"fifty.mp4", "aac.mp4", 50, "aac", -200, kLoud, {"--frames", "25-49"}},
      {"other.mkv", "", 25, "aac", kLoud, 0, {"--frames", "25-49", "--audio-from", aac}},
      // Layer B's file, not the own source's: its PCM is what the .mov copies.
      {"layer.mov", "aac.mp4", 25, "pcm_s16le", kLoud, 0, layerB},
      // A split's clips by number: the first's by default, clip 3's, two mixed at a level
      // between theirs, the sound as long as the longest clip (silent after the first clip's).
      {"first.mp4", "", 0, "aac", -45, -37, clips},
      {"third.mp4", "", 0, "aac", -25, -17, split({"--audio-from", "3"})},
      {"mix.mp4", "", 0, "aac", -31, -24, split({"--audio", "mix"})},
      {"both.mp4", "", 0, "aac", -31, -20, split({"--audio", "1,3", "--duration", "longest"})},
      {"padded.mp4", "", 0, "aac", -48, -40, split({"--duration", "longest"})},
      {"without.mp4", "", 0, "", 0, 0, {none, quiet}, firstClipSilent},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.out);
    std::vector<std::string> args{"split"};
    if (c.fps) {
      nlohmann::json scene = smallScene("bars", 150);
      scene["fps"] = c.fps;
      if (*c.source) scene["source"] = {{"file", c.source}};
      scene["layers"].push_back({{"guid", "bbbbbbbb-0000-4000-8000-000000000002"},
                                 {"name", "B"},
                                 {"source", {{"file", "pcm.mkv"}}}});
      args = {"render", writeScene(folder, scene)};
    }
    args.insert(args.end(), c.options.begin(), c.options.end());
    args.insert(args.end(), {"-o", folder.file(c.out), "--quiet"});
    CliRun run = runCli(args);
    ASSERT_EQ(run.status, 0) << run.err;
    nlohmann::json streams = nlohmann::json::parse(
        commandOutput("ffprobe -v error -show_entries stream=codec_type,codec_name -of json " +
                      folder.file(c.out)))["streams"];
    ASSERT_EQ(streams.size(), *c.codec ? 2u : 1u);
    if (!*c.codec) {
      EXPECT_NE(run.err.find("has no sound: " + c.silence), std::string::npos) << run.err;
      continue;
    }
    EXPECT_EQ(streams[1]["codec_name"], c.codec);
    // With the video at both ends, to whole packets: a copy cannot cut the packets at either
    // end (23 ms each here).
    const std::vector<Span> spans = streamSpans(folder.file(c.out));
    ASSERT_EQ(spans.size(), 2u);
    EXPECT_NEAR(spans[1].start, spans[0].start, 0.05);
    EXPECT_NEAR(spans[1].end, spans[0].end, 0.05);
    const double mean = meanVolume(folder.file(c.out));
    EXPECT_GE(mean, c.quietest);
    EXPECT_LE(mean, c.loudest);
  }
  EXPECT_LT(meanVolume(folder.file("padded.mp4"), 2.5), -80) << "silence after the first clip";
}

}  // namespace
