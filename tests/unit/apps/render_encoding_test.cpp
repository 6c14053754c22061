// How `veltrane render` writes its outputs: each codec at the depth asked, converted and tagged
// with the scene's colour; and the settings it refuses, in one line before anything is written.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <sstream>

#include "cli_runner.h"
#include "refhost/media/image_files.h"

namespace {

// A flat orange (204, 77, 26 in 8 bits) over the whole frame: decoding it through the wrong
// matrix or range moves it by 10 levels or more.
nlohmann::json flatScene(const nlohmann::json& colorSpace = nullptr) {
  nlohmann::json scene = smallScene("bars", 5);
  scene["source"] = {{"color", {0.8, 0.3, 0.1}}};
  if (!colorSpace.is_null()) scene["colorSpace"] = colorSpace;
  return scene;
}

TEST(RenderEncoding, EachCodecWritesItsDepthAndTheScenesColour) {
  ScratchDirectory folder;
  const std::string bt709 = writeScene(folder, flatScene());
  writeText(folder.file("full601.json"), flatScene({{"matrix", "bt601"},
                                                    {"range", "full"},
                                                    {"primaries", "smpte170m"},
                                                    {"transfer", "smpte170m"}})
                                             .dump());
  const std::string full601 = folder.file("full601.json");
  const std::string hd = "bt709,tv,bt709,bt709", sd = "smpte170m,pc,smpte170m,smpte170m";
  const struct {
    const char* out;
    std::string scene;
    const char* codec;
    const char* pixels;
    std::string colour;   // space, range, primaries, transfer; empty for stills
    const char* options;  // separated by spaces
  } cases[] = {
      {"default.mp4", bt709, "h264", "yuv420p", hd, ""},
      {"default.mov", bt709, "prores", "yuv422p10le", hd, ""},
      {"default.webm", bt709, "vp9", "yuv420p", hd, ""},
      {"h265.mkv", bt709, "hevc", "yuv420p10le", hd,
       "--codec h265 --bit-depth 10 --preset ultrafast"},
      {"h264.mov", bt709, "h264", "yuv420p", hd, "--codec h264 --crf 30"},
      {"ffv1.mkv", bt709, "ffv1", "yuv444p10le", hd, "--codec ffv1 --bit-depth 10"},
      {"vp9.mp4", bt709, "vp9", "yuv420p10le", hd, "--codec vp9 --bit-depth 10"},
      {"av1.webm", bt709, "av1", "yuv420p10le", hd, "--codec av1 --bit-depth 10 --crf 40"},
      {"av1.mp4", bt709, "av1", "yuv420p", hd, "--codec av1"},
      // Full range: H.264 decoders name it yuvj420p.
      {"full.mkv", full601, "h264", "yuvj420p", sd, ""},
      {"full.webm", full601, "vp9", "yuv420p", sd, ""},
      {"full_ffv1.mkv", full601, "ffv1", "yuv444p", sd, "--codec ffv1"},
      // ProRes has no full range: limited, and said so.
      {"full.mov", full601, "prores", "yuv422p10le", "smpte170m,tv,smpte170m,smpte170m", ""},
      {"still16.png", bt709, "png", "rgba64be", "", "--bit-depth 16"},
      {"still.png", bt709, "png", "rgba", "", ""},
  };
  for (const auto& c : cases) {
    std::vector<std::string> args{"render", c.scene, "-o", folder.file(c.out)};
    std::istringstream options(c.options);
    for (std::string option; options >> option;) args.push_back(option);
    CliRun run = runCli(args);
    ASSERT_EQ(run.status, 0) << c.out << ": " << run.err;
    const std::string probe = commandOutput(
        "ffprobe -v error -select_streams v -show_entries "
        "stream=codec_name,pix_fmt,color_space,color_range,color_primaries,color_transfer "
        "-of json " +
        folder.file(c.out));
    const nlohmann::json stream = nlohmann::json::parse(probe)["streams"][0];
    EXPECT_EQ(stream["codec_name"], c.codec) << c.out;
    EXPECT_EQ(stream["pix_fmt"], c.pixels) << c.out;
    if (c.colour.empty()) continue;
    EXPECT_EQ(stream["color_space"].get<std::string>() + "," +
                  stream["color_range"].get<std::string>() + "," +
                  stream["color_primaries"].get<std::string>() + "," +
                  stream["color_transfer"].get<std::string>(),
              c.colour)
        << c.out;
    const std::string rgb = commandOutput("ffmpeg -v error -i " + folder.file(c.out) +
                                          " -frames:v 1 -f rawvideo -pix_fmt rgb24 -");
    ASSERT_EQ(rgb.size(), 64u * 36 * 3) << c.out;
    const int expected[3] = {204, 77, 26};
    for (int channel = 0; channel < 3; ++channel) {
      const int got = static_cast<uint8_t>(rgb[static_cast<std::size_t>(channel) + 3 * 700]);
      EXPECT_NEAR(got, expected[channel], 4) << c.out << " channel " << channel;
    }
  }
  // The deep still is read back as half floats and the default one as bytes, the same picture.
  const refhost::RgbaImage deep = refhost::readImageFile(folder.file("still16.png"));
  const refhost::RgbaImage bytes = refhost::readImageFile(folder.file("still.png"));
  EXPECT_EQ(deep.format, refhost::PixelFormat::RgbaHalf);
  EXPECT_EQ(bytes.format, refhost::PixelFormat::Rgba8);
  EXPECT_NEAR(deep.channel(20, 20, 0), bytes.channel(20, 20, 0), 0.5 / 255);
}

TEST(RenderEncoding, RefusesSettingsTheOutputCannotTakeInOneLine) {
  ScratchDirectory folder;
  nlohmann::json scene = smallScene("bars");
  writeText(folder.file("sound.wav"), "");  // exists; its contents are never reached
  const std::string path = writeScene(folder, scene);
  const std::string mp4 = folder.file("x.mp4"), missing = folder.file("missing.wav");
  const std::string png = "option '--bit-depth': expected 8 or 16 for a .png output, got '10'";
  const struct {
    std::vector<std::string> options;
    std::string line;  // after "veltrane render: "
  } cases[] = {
      {{"-o", mp4, "--codec", "xvid"},
       "option '--codec': expected one of h264, h265, prores, ffv1, vp9, av1, got 'xvid'"},
      {{"-o", mp4, "--codec", "prores"},
       "option '--codec': a .mp4 file cannot hold prores; use .mov or .mkv"},
      {{"-o", folder.file("x.mov"), "--codec", "ffv1"},
       "option '--codec': a .mov file cannot hold ffv1; use .mkv"},
      {{"-o", folder.file("x.mov"), "--codec", "vp9"},
       "option '--codec': a .mov file cannot hold vp9; use .mp4, .mkv or .webm"},
      {{"-o", mp4, "--bit-depth", "10"},
       "option '--bit-depth': h264 is 8-bit here; use h265, prores, ffv1, vp9 or av1 for 10-bit"},
      {{"-o", folder.file("x.mov"), "--bit-depth", "8"},
       "option '--bit-depth': prores is 10-bit here; use h264, h265, ffv1, vp9 or av1 for 8-bit"},
      {{"-o", mp4, "--codec", "h265", "--bit-depth", "16"},
       "option '--bit-depth': expected 8 or 10 for a video output, got '16' (16 is for .png "
       "outputs)"},
      {{"-o", folder.file("x.exr"), "--bit-depth", "16"},
       "option '--bit-depth': an .exr output is always half float; the option applies to .png "
       "(8 or 16) and video (8 or 10) outputs"},
      {{"-o", folder.file("x.png"), "--bit-depth", "10"}, png},
      {{"-o", folder.file("x.mov"), "--crf", "20"},
       "option '--crf': prores has no CRF quality (ProRes 422 HQ has a fixed quality); h264, "
       "h265, vp9 and av1 have one"},
      {{"-o", mp4, "--crf", "52"},
       "option '--crf': expected a whole number from 0 to 51 for h264, got '52'"},
      {{"-o", folder.file("x.webm"), "--codec", "av1", "--crf", "0"},
       "option '--crf': expected a whole number from 1 to 63 for av1, got '0'"},
      {{"-o", folder.file("x.webm"), "--preset", "fast"},
       "option '--preset': vp9 takes no preset; h264 and h265 do"},
      {{"-o", mp4, "--codec", "h265", "--preset", "turbo"},
       "option '--preset': expected one of ultrafast, superfast, veryfast, faster, fast, medium, "
       "slow, slower, veryslow, placebo for h265, got 'turbo'"},
      {{"-o", folder.file("f_%04d.png"), "--codec", "h264"},
       "option '--codec': a .png sequence holds pictures, not video; it applies to .mp4, .mov, "
       ".mkv and .webm outputs"},
      {{"-o", mp4, "--audio-from", missing},
       "option '--audio-from': expected a file with sound, '" + missing + "' does not exist"},
      {{"-o", mp4, "--audio-from", folder.path()},
       "option '--audio-from': expected a file with sound, '" + folder.path() + "' is a directory"},
      {{"-o", mp4, "--audio-from", "layer", "Z"},
       "option '--audio-from': expected 'layer' and the name of one of the scene's layers "
       "('Split Screen', 'A'), got 'Z'"},
      {{"-o", mp4, "--audio-from", "layer", "A"},
       "option '--audio-from': clip 2 (a pattern) is generated, without sound"},
      {{"-o", mp4, "--audio-from", "layer"},
       "option '--audio-from': expected a layer's name after 'layer'"},
      {{"-o", folder.file("x.png"), "--audio-from", folder.file("sound.wav")},
       "option '--audio-from': a .png output has no sound; it applies to .mp4, .mov, .mkv and "
       ".webm outputs"},
      {{"-o", mp4, "--audio-from", folder.file("sound.wav"), "--no-audio"},
       "give --audio-from or --no-audio, not both"}};
  for (const auto& c : cases) {
    const std::vector<std::string> before = folder.entries();
    std::vector<std::string> args{"render", path};
    args.insert(args.end(), c.options.begin(), c.options.end());
    CliRun run = runCli(args);
    EXPECT_EQ(run.status, 2) << c.line;
    EXPECT_EQ(run.err, "veltrane render: " + c.line + " (see 'veltrane render --help')\n");
    EXPECT_TRUE(run.out.empty()) << run.out;
    EXPECT_EQ(folder.entries(), before) << c.line;
  }
}

}  // namespace
