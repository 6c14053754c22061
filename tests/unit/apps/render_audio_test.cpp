// `veltrane render` keeps the sound of a video source: the audio of the frames rendered, as
// long as the video and starting with it (checked with ffprobe), copied where the container
// takes the codec and AAC where it does not, and none with --no-audio.
#include <gtest/gtest.h>

#include <cstdio>
#include <nlohmann/json.hpp>

#include "cli_runner.h"

namespace {

std::string output(const std::string& command) {
  std::string text;
  if (FILE* pipe = popen(command.c_str(), "r")) {
    char buffer[4096];
    for (std::size_t n; (n = fread(buffer, 1, sizeof buffer, pipe)) > 0;) text.append(buffer, n);
    pclose(pipe);
  }
  return text;
}

TEST(RenderAudio, VideoOutputsCarryTheRenderedFramesSound) {
  ScratchDirectory folder;
  // Three seconds of test picture; the tone sounds from the second second on.
  const std::string make =
      "ffmpeg -v error -y -f lavfi -i testsrc=size=64x36:rate=25:duration=3 "
      "-f lavfi -i \"sine=frequency=440:duration=3,volume='if(lt(t,1),0,1)'"
      ":eval=frame\" -c:v libx264 -c:a ";
  ASSERT_EQ(std::system((make + "aac " + folder.file("aac.mp4")).c_str()), 0);
  ASSERT_EQ(std::system((make + "pcm_s16le " + folder.file("pcm.mkv")).c_str()), 0);
  struct Case {
    const char* source;
    const char* out;
    const char* frames;
    const char* codec;  // of the audio written; empty: no audio
    bool loud;
  };
  const Case cases[] = {{"aac.mp4", "copied.mp4", "25-49", "aac", true},
                        {"pcm.mkv", "encoded.mp4", "25-49", "aac", true},
                        {"pcm.mkv", "copied.mov", "0-24", "pcm_s16le", false},
                        {"aac.mp4", "silent.mp4", "10-40", "", false}};
  for (const Case& c : cases) {
    nlohmann::json scene = smallScene("bars", 75);
    scene["source"] = {{"file", c.source}};
    std::vector<std::string> args{
        "render", writeScene(folder, scene), "-o", folder.file(c.out), "--frames", c.frames};
    if (!*c.codec) args.push_back("--no-audio");
    CliRun run = runCli(args);
    ASSERT_EQ(run.status, 0) << run.err;
    nlohmann::json streams =
        nlohmann::json::parse(output("ffprobe -v error -show_entries "
                                     "stream=codec_type,codec_name,start_time,duration -of json " +
                                     folder.file(c.out)))["streams"];
    ASSERT_EQ(streams.size(), *c.codec ? 2u : 1u) << c.out;
    if (!*c.codec) continue;
    const nlohmann::json& video = streams[0];
    const nlohmann::json& audio = streams[1];
    EXPECT_EQ(audio["codec_name"], c.codec) << c.out;
    // Within one audio packet (1024 samples, 21 ms at 48 kHz) of the video.
    for (const char* field : {"start_time", "duration"}) {
      EXPECT_NEAR(std::stod(audio[field].get<std::string>()),
                  std::stod(video[field].get<std::string>()), 0.03)
          << c.out << " " << field;
    }
    std::string levels = output("ffmpeg -v info -i " + folder.file(c.out) +
                                " -map 0:a -af volumedetect -f null - 2>&1");
    std::size_t at = levels.find("mean_volume: ");
    ASSERT_NE(at, std::string::npos) << levels;
    const double mean = std::stod(levels.substr(at + 13));
    EXPECT_EQ(mean > -40, c.loud) << c.out << " mean volume " << mean;
  }
}

}  // namespace
