// Video files read as players show them, against what ffmpeg itself decodes: colours, depth,
// turns, pixel shapes, frames by presentation time; and every kind of file read by what it holds.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <set>
#include <sstream>

#include "refhost/media/media_source.h"
#include "refhost/media/video_reader.h"
#include "support/child_process.h"
#include "support/files.h"
#include "support/spoiled_media.h"
#include "support/temp_paths.h"

namespace refhost {
namespace {

using testsupport::ChildProcess;
using testsupport::ScratchDirectory;
using testsupport::slurp;
using testsupport::Spoiling;
using testsupport::writeText;

// Runs the ffmpeg command line quietly; its own messages are the failure when it fails.
void ffmpeg(const ScratchDirectory& folder, std::vector<std::string> arguments) {
  arguments.insert(arguments.begin(), {"ffmpeg", "-nostdin", "-v", "error", "-y"});
  const std::string log = folder.file("ffmpeg.log");
  ChildProcess process(arguments, "/dev/null", log);
  ASSERT_EQ(process.wait(120), 0) << slurp(log);
}

// `frames` of FFmpeg's moving test picture at 25 fps, encoded with the space-separated options.
void makeClip(const ScratchDirectory& folder, const std::string& name, const std::string& size,
              const std::string& options, int frames = 4) {
  std::vector<std::string> arguments = {
      "-f", "lavfi", "-i", "testsrc2=size=" + size, "-frames:v", std::to_string(frames)};
  std::istringstream words(options);
  for (std::string word; words >> word;) arguments.push_back(word);
  arguments.push_back(folder.file(name));
  ffmpeg(folder, arguments);
}

// Every frame of the clip as ffmpeg shows it (after the filter when given): packed RGB of 8 bits,
// or planar RGB of 16 bits (green, blue, red). Bilinear chroma as ours: the scaler's other
// interpolations move single pixels at the picture's hard colour edges by up to 180 levels.
std::string shownByFfmpeg(const ScratchDirectory& folder, const std::string& path,
                          const char* filter, PixelFormat format) {
  std::vector<std::string> arguments = {"-i", path};
  if (filter) arguments.insert(arguments.end(), {"-vf", filter});
  const std::string raw = folder.file("shown.raw");
  arguments.insert(arguments.end(),
                   {"-sws_flags", "bilinear", "-fps_mode", "passthrough", "-pix_fmt",
                    format == PixelFormat::Rgba8 ? "rgb24" : "gbrp16le", "-f", "rawvideo", raw});
  ffmpeg(folder, arguments);
  return slurp(raw);
}

// Our frame `frame` (at 25 fps) against ffmpeg's, in levels of 255 on average and at worst. Both
// convert with the same tables, so 8 bits agree but for rounding; half floats put white at 1
// where ffmpeg's 16 bits leave it up to 0.4% short. A wrong matrix or range is off by several
// levels on average, a wrong turn by tens.
void expectShownAlike(VideoReader& reader, const std::string& theirs, int frame, PixelFormat format,
                      const std::string& name) {
  const RgbaImage ours =
      reader.frameAt(frame, {25, 1}, reader.info().width, reader.info().height, format);
  const std::size_t pixels = static_cast<std::size_t>(ours.width) * ours.height;
  const bool deep = format == PixelFormat::RgbaHalf;
  const std::size_t start = pixels * 3 * (deep ? 2 : 1) * frame;
  ASSERT_GE(theirs.size(), start + pixels * 3 * (deep ? 2 : 1)) << name << " frame " << frame;
  const auto* bytes = reinterpret_cast<const uint8_t*>(theirs.data() + start);
  double mean = 0, max = 0;
  for (std::size_t i = 0; i < pixels; ++i) {
    for (int c = 0; c < 3; ++c) {
      // Packed red, green, blue; or planes of green, blue, red.
      const uint8_t* sample = deep ? bytes + 2 * (pixels * ((c + 2) % 3) + i) : bytes + 3 * i + c;
      const double level = deep ? (sample[0] | sample[1] << 8) / 257.0 : sample[0];
      const auto x = static_cast<int32_t>(i % ours.width), y = static_cast<int32_t>(i / ours.width);
      const double gap = std::fabs(ours.channel(x, y, c) * 255.0 - level);
      mean += gap / (3 * pixels);
      max = std::max(max, gap);
    }
  }
  EXPECT_LE(mean, deep ? 1.0 : 0.25) << name << " frame " << frame << (deep ? " deep" : "");
  EXPECT_LE(max, deep ? 2.0 : 1.0) << name << " frame " << frame << (deep ? " deep" : "");
}

// Frames 0 and 3 of clips of each colour description, depth and pixel shape.
TEST(VideoInput, PicturesMatchWhatFfmpegShows) {
  ScratchDirectory folder;
  const std::string bt709 = " -colorspace bt709 -color_primaries bt709 -color_trc bt709";
  const struct {
    const char* name;
    const char* size;
    std::string options;
    const char* shownBy;  // ffmpeg's filter for the picture we show, when not its default
    int32_t width, height, bitDepth, matrix;
    bool fullRange;
  } clips[] = {
      {"601.mp4", "320x180",
       "-pix_fmt yuv420p -colorspace smpte170m -color_primaries smpte170m -color_trc smpte170m "
       "-color_range tv",
       nullptr, 320, 180, 8, 6, false},
      {"709.mp4", "320x180", "-pix_fmt yuv420p -color_range tv" + bt709, nullptr, 320, 180, 8, 1,
       false},
      {"jpeg.mp4", "320x180", "-pix_fmt yuvj420p" + bt709, nullptr, 320, 180, 8, 1, true},
      {"pc.mp4", "320x180", "-pix_fmt yuv420p -color_range pc -colorspace bt470bg", nullptr, 320,
       180, 8, 5, true},
      {"10bit.mp4", "320x180", "-pix_fmt yuv420p10le -color_range tv" + bt709, nullptr, 320, 180,
       10, 1, false},
      {"rgb.mkv", "320x180", "-pix_fmt gbrp -c:v ffv1", nullptr, 320, 180, 8, 0, true},
      // Untagged HD is taken as BT.709, where ffmpeg's own default would be BT.601.
      {"hd.mp4", "1280x720", "-pix_fmt yuv420p", "scale=in_color_matrix=bt709", 1280, 720, 8, 1,
       false},
      // Stored at 240x180 with pixels 4:3 wide: shown at 320x180.
      {"anamorphic.mp4", "240x180", "-pix_fmt yuv420p -vf setsar=4/3",
       "scale=iw*sar:ih:flags=bilinear,setsar=1", 320, 180, 8, 6, false},
  };
  for (const auto& clip : clips) {
    const std::string path = folder.file(clip.name);
    makeClip(folder, clip.name, clip.size, clip.options);
    VideoReader reader(path);
    const MediaInfo& info = reader.info();
    EXPECT_EQ(info.width, clip.width) << clip.name;
    EXPECT_EQ(info.height, clip.height) << clip.name;
    EXPECT_EQ(info.bitDepth, clip.bitDepth) << clip.name;
    EXPECT_EQ(info.colour.matrix, clip.matrix) << clip.name;
    EXPECT_EQ(info.colour.fullRange, clip.fullRange) << clip.name;
    for (PixelFormat format : {PixelFormat::Rgba8, PixelFormat::RgbaHalf}) {
      const std::string theirs = shownByFfmpeg(folder, path, clip.shownBy, format);
      for (int frame : {0, 3}) expectShownAlike(reader, theirs, frame, format, clip.name);
    }
  }
}

// A copy of an MP4 whose track's display matrix is a, b, c, d (16.16 fixed point in the file).
void writeWithDisplayMatrix(const std::string& from, const std::string& to, int a, int b, int c,
                            int d) {
  std::string bytes = slurp(from);
  const std::size_t box = bytes.find("tkhd");
  ASSERT_NE(box, std::string::npos);
  // After the version, flags, two times, the track id, a reserved word, the duration (32 or 64
  // bits each by the version), 8 reserved bytes and 8 of layer, group and volume.
  std::size_t at = box + 4 + 4 + (bytes[box + 4] == 1 ? 32 : 20) + 16;
  // 1.0 in 16.16, multiplied rather than shifted in: the entries may be negative.
  constexpr int kOne = 1 << 16;
  for (int value : {a * kOne, b * kOne, 0, c * kOne, d * kOne, 0, 0, 0, 1 << 30}) {
    for (int shift = 24; shift >= 0; shift -= 8)
      bytes[at++] = static_cast<char>(static_cast<uint32_t>(value) >> shift & 0xFF);
  }
  writeText(to, bytes);
}

TEST(VideoInput, TurnedPicturesShowUpright) {
  ScratchDirectory folder;
  // Without chroma subsampling: ffmpeg turns the picture before converting it, which moves
  // subsampled chroma by half a sample, and ours after.
  makeClip(folder, "stored.mp4", "320x180", "-pix_fmt yuv444p");
  const struct {
    const char* name;
    const char* rotate;  // the muxer's tag, or the matrix below patched in
    int a, b, c, d;
    int32_t width, height;
  } clips[] = {{"rotate90.mp4", "90", 0, 0, 0, 0, 180, 320},
               {"rotate180.mp4", "180", 0, 0, 0, 0, 320, 180},
               {"rotate270.mp4", "270", 0, 0, 0, 0, 180, 320},
               {"mirrored.mp4", nullptr, -1, 0, 0, 1, 320, 180},
               {"upside-down.mp4", nullptr, 1, 0, 0, -1, 320, 180},
               {"transposed.mp4", nullptr, 0, 1, 1, 0, 180, 320}};
  for (const auto& clip : clips) {
    const std::string path = folder.file(clip.name);
    if (clip.rotate) {
      ffmpeg(folder, {"-i", folder.file("stored.mp4"), "-c", "copy", "-metadata:s:v",
                      std::string("rotate=") + clip.rotate, path});
    } else {
      writeWithDisplayMatrix(folder.file("stored.mp4"), path, clip.a, clip.b, clip.c, clip.d);
    }
    VideoReader reader(path);
    EXPECT_EQ(reader.info().width, clip.width) << clip.name;
    EXPECT_EQ(reader.info().height, clip.height) << clip.name;
    for (PixelFormat format : {PixelFormat::Rgba8, PixelFormat::RgbaHalf}) {
      const std::string theirs = shownByFfmpeg(folder, path, nullptr, format);
      for (int frame : {0, 3}) expectShownAlike(reader, theirs, frame, format, clip.name);
    }
  }
}

// A limited-range 10-bit ramp holds 877 levels (64 to 940); read as half floats, they stay
// apart instead of falling onto 8 bits' 220.
TEST(VideoInput, TenBitsKeepTheirLevelsAsHalfFloats) {
  ScratchDirectory folder;
  const std::string path = folder.file("ramp.mp4");
  ffmpeg(folder, {"-f", "lavfi", "-i",
                  "nullsrc=s=1024x4,format=yuv420p10le,geq=lum='64+X*876/1023':cb=512:cr=512",
                  "-frames:v", "1", "-c:v", "libx264", "-qp", "0", path});
  VideoReader reader(path);
  EXPECT_EQ(reader.info().bitDepth, 10);
  const RgbaImage picture = reader.frameAt(0, {25, 1}, 1024, 4, PixelFormat::RgbaHalf);
  std::set<float> levels;
  for (int32_t x = 0; x < 1024; ++x) levels.insert(picture.channel(x, 1, 1));
  EXPECT_GE(levels.size(), 700u);
  EXPECT_EQ(*levels.begin(), 0.0f);
  EXPECT_EQ(*levels.rbegin(), 1.0f);
}

// Frame n of these clips is grey level 16 + 18 n, which tells which frame a picture shows.
int32_t frameShown(const RgbaImage& picture) {
  const double luma = picture.channel(picture.width / 2, picture.height / 2, 1) * 219.0 + 16.0;
  return static_cast<int32_t>(std::lround((luma - 16.0) / 18.0));
}

// Clips at constant rates and at a variable one: the picture at time t is the latest frame
// presented at or before t, the first before it, the last after it.
TEST(VideoInput, FramesAreChosenByPresentationTime) {
  ScratchDirectory folder;
  // A variable rate: steady at first, then a pause, three short frames and a long gap.
  const char* variable =
      "if(lt(N,3),N*40,if(lt(N,5),200+(N-3)*40,if(lt(N,8),257+(N-5)*17,800+(N-8)*40)))";
  const std::vector<double> shown{0, 40, 80, 200, 240, 257, 274, 291, 800, 840, 880, 920};
  const struct {
    const char* name;
    int rate;
    double duration;
    int32_t compositionFrames;      // at 25 fps
    const char* times;              // a setpts expression in milliseconds for a variable rate
    std::vector<double> presented;  // its frames' times in milliseconds
  } clips[] = {{"25.mp4", 25, 0.48, 12, nullptr, {}},
               {"60.mp4", 60, 0.2, 5, nullptr, {}},
               {"variable.mp4", 25, 0, 0, variable, shown}};
  for (const auto& clip : clips) {
    const std::string path = folder.file(clip.name);
    std::string filter = "color=black:s=64x32:r=" + std::to_string(clip.rate) +
                         ",format=yuv420p,geq=lum='16+18*N':cb=128:cr=128";
    if (clip.times) filter += std::string(",settb=1/1000,setpts='(") + clip.times + ")/1000/TB'";
    // Variable times in milliseconds reach the file as they are (the encoder's time base would
    // otherwise be the nominal rate's).
    std::vector<std::string> arguments = {"-f", "lavfi", "-i", filter, "-frames:v", "12"};
    if (clip.times)
      arguments.insert(arguments.end(), {"-fps_mode", "passthrough", "-enc_time_base", "1:1000"});
    arguments.insert(arguments.end(), {"-c:v", "libx264", path});
    ffmpeg(folder, arguments);
    VideoReader reader(path);
    if (!clip.times) {
      EXPECT_EQ(reader.info().frameRate, (FrameRate{clip.rate, 1})) << clip.name;
      EXPECT_NEAR(reader.info().duration, clip.duration, 1e-9) << clip.name;
      EXPECT_EQ(openMediaSource(MediaSpec::ofFile(path), {25, 1})->frameCount(),
                clip.compositionFrames)
          << clip.name;
    }
    // Each frame's time, just before and between it and the next, asked back and forth.
    std::vector<std::pair<double, int32_t>> asked = {{-1, 0}, {5, 11}};
    auto presented = [&](int32_t n) {
      return clip.times ? clip.presented[n] / 1000 : static_cast<double>(n) / clip.rate;
    };
    for (int32_t n = 0; n < 12; ++n) {
      asked.push_back({presented(n), n});
      asked.push_back({presented(n) - 0.001, std::max(n - 1, 0)});
      if (n < 11) asked.push_back({(presented(n) + presented(n + 1)) / 2, n});
    }
    std::shuffle(asked.begin(), asked.end(), std::mt19937(7));
    // Asked as frames of a rate that counts every time here in whole ticks.
    constexpr FrameRate kTicks{6000, 1};
    for (const auto& [seconds, frame] : asked)
      EXPECT_EQ(frameShown(reader.frameAt(std::llround(seconds * 6000), kTicks, 8, 8)), frame)
          << clip.name << " at " << seconds;
  }
}

// A photo of four coloured quarters (red, green above; blue, white below), stored turned so
// that the EXIF orientation turns it upright again.
void makePhoto(const ScratchDirectory& folder, const std::string& name, int orientation) {
  const char* stored[] = {"",           "null",        "hflip",       "hflip,vflip",
                          "vflip",      "transpose=0", "transpose=2", "transpose=3",
                          "transpose=1"};
  ffmpeg(folder, {"-f", "lavfi", "-i",
                  "nullsrc=s=64x48,format=rgb24,geq=r='255*eq(gte(X,W/2),gte(Y,H/2))':"
                  "g='255*gte(X,W/2)':b='255*gte(Y,H/2)'," +
                      std::string(stored[orientation]),
                  "-frames:v", "1", "-q:v", "2", folder.file(name)});
  testsupport::tagExifOrientation(folder.file(name), orientation);
}

// Every kind of file FFmpeg decodes, read by what it holds whatever its name: its size upright,
// nominal rate, length, sound and the frames found damaged (concealed), or the line refusing it.
TEST(VideoInput, FilesAreReadByWhatTheyHold) {
  ScratchDirectory folder;
  const std::string testPicture = "testsrc2=size=160x96:rate=25";
  const std::string x264 = "-c:v libx264 -pix_fmt yuv420p -g 10";
  makeClip(folder, "phone.3gp", "160x96", x264, 10);
  ffmpeg(folder, {"-f", "lavfi", "-i", testPicture, "-f", "lavfi", "-i", "sine", "-frames:v", "10",
                  "-c:v", "libx264", "-c:a", "aac", "-shortest", folder.file("camera.mts")});
  makeClip(folder, "animated.gif", "64x36", "-r 10", 5);
  makeClip(folder, "animated.webp", "64x36", "-r 10 -c:v libwebp_anim -loop 0", 5);
  makeClip(folder, "one.gif", "64x36", "", 1);
  // 30 fps with every twentieth frame dropped, and 30 fps slowed to 10 for a second.
  for (const auto& [name, kept] :
       {std::pair<const char*, const char*>{"dropped.mp4", "not(eq(mod(n,20),19))"},
        {"slowed.mp4", "lt(n,30)+gte(n,60)+not(mod(n,3))"}})
    ffmpeg(folder, {"-f", "lavfi", "-i", "testsrc2=size=64x36:rate=30", "-t", "4", "-vf",
                    std::string("select='") + kept + "'", "-fps_mode", "passthrough",
                    "-video_track_timescale", "90000", folder.file(name)});
  for (const char* name : {"cut.mp4", "overwritten.mp4"}) {
    makeClip(folder, name, "160x96", x264, 30);
    testsupport::spoilPacket(folder.file(name), 14,
                             *name == 'c' ? Spoiling::CutInHalf : Spoiling::Overwritten);
  }
  for (int orientation : {1, 3, 6, 8})
    makePhoto(folder, "photo" + std::to_string(orientation) + ".jpg", orientation);
  makeClip(folder, "whole.jpg", "160x96", "", 1);
  makeClip(folder, "whole.png", "160x96", "", 1);
  const std::string jpeg = slurp(folder.file("whole.jpg")), png = slurp(folder.file("whole.png"));
  writeText(folder.file("half.jpg"), jpeg.substr(0, jpeg.size() / 2));
  writeText(folder.file("spoilt.png"), png.substr(0, png.size() / 2) + std::string(64, '\0') +
                                           png.substr(png.size() / 2 + 64));
  ffmpeg(folder, {"-f", "lavfi", "-i", "sine", "-t", "1", folder.file("sound.mp4")});
  const std::string bt2020 = "-pix_fmt yuv420p10le -color_primaries bt2020 -colorspace bt2020nc";
  makeClip(folder, "pq.mov", "64x36", bt2020 + " -color_trc smpte2084", 1);
  makeClip(folder, "hlg.mp4", "64x36", bt2020 + " -color_trc arib-std-b67", 1);
  makeClip(folder, "wide.mp4", "64x36", bt2020 + " -color_trc bt709", 1);

  const struct {
    const char* name;
    int32_t width, height;
    FrameRate rate;   // nominal; none for a still
    int32_t frames;   // at that rate
    int32_t damaged;  // frames the decoder found damaged, read through once
    bool sound;
  } files[] = {{"phone.3gp", 160, 96, {25, 1}, 10, 0, false},
               {"camera.mts", 160, 96, {25, 1}, 10, 0, true},
               {"animated.gif", 64, 36, {10, 1}, 5, 0, false},
               {"animated.webp", 64, 36, {10, 1}, 5, 0, false},
               {"one.gif", 64, 36, {}, 0, 0, false},
               {"dropped.mp4", 64, 36, {30, 1}, 119, 0, false},
               {"slowed.mp4", 64, 36, {30, 1}, 120, 0, false},
               {"cut.mp4", 160, 96, {25, 1}, 30, 1, false},
               {"overwritten.mp4", 160, 96, {25, 1}, 30, 1, false},
               {"photo1.jpg", 64, 48, {}, 0, 0, false},
               {"photo3.jpg", 64, 48, {}, 0, 0, false},
               {"photo6.jpg", 64, 48, {}, 0, 0, false},
               {"photo8.jpg", 64, 48, {}, 0, 0, false},
               {"half.jpg", 160, 96, {}, 0, 1, false}};
  for (const auto& file : files) {
    SCOPED_TRACE(file.name);
    MediaSpec spec = MediaSpec::ofFile(folder.file(file.name));
    const std::shared_ptr<MediaSource> source = openMediaSource(spec, file.rate);
    const MediaInfo info = source->info();
    EXPECT_EQ(info.width, file.width);
    EXPECT_EQ(info.height, file.height);
    EXPECT_EQ(info.video, file.rate.valid());
    EXPECT_EQ(info.frameRate, file.rate);
    EXPECT_EQ(info.hasAudio, file.sound);
    EXPECT_EQ(source->frameCount(), file.frames);
    for (int32_t frame = 0; frame < std::max(file.frames, 1); ++frame) {
      const RgbaImage picture = source->frame(frame, info.width, info.height, PixelFormat::Rgba8);
      // The photos show their quarters where they belong.
      if (std::string(file.name).rfind("photo", 0) != 0) continue;
      const Rgba8 quarters[] = {
          {255, 0, 0, 255}, {0, 255, 0, 255}, {0, 0, 255, 255}, {255, 255, 255, 255}};
      for (int q = 0; q < 4; ++q)
        for (int c = 0; c < 3; ++c)
          EXPECT_NEAR(picture.pixel(16 + 32 * (q % 2), 12 + 24 * (q / 2))[c], quarters[q][c], 24)
              << "quarter " << q;
    }
    EXPECT_EQ(spec.damage->count(), file.damaged);
  }

  // Refused in one line after the path. The host renders SDR BT.709 and BT.601, without tone or
  // gamut mapping.
  const std::pair<const char*, std::string> refused[] = {
      {"spoilt.png", "cannot read image: its data is damaged ("},
      {"sound.mp4", "it holds sound but no picture"},
      {"pq.mov",
       "HDR video (transfer smpte2084, primaries bt2020, matrix bt2020nc) is not shown by this "
       "host: it renders in SDR BT.709/BT.601; convert it first (for example with ffmpeg's "
       "zscale and tonemap filters)"},
      {"hlg.mp4", "HDR video (transfer arib-std-b67, primaries bt2020"},
      {"wide.mp4", "wide-gamut video (primaries bt2020, matrix bt2020nc)"}};
  for (const auto& [name, line] : refused) {
    const std::string path = folder.file(name);
    try {
      openMediaSource(MediaSpec::ofFile(path), {});
      ADD_FAILURE() << name << " opened";
    } catch (const std::runtime_error& error) {
      EXPECT_EQ(std::string(error.what()).rfind(path + ": " + line, 0), 0u) << error.what();
      EXPECT_EQ(std::string(error.what()).find('\n'), std::string::npos) << error.what();
    }
  }
}

}  // namespace
}  // namespace refhost
