// Media on disk: stills and videos written and read back within their depth's precision, odd
// sizes padded, and the kinds of output their names choose.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <set>

#include "refhost/media/image_files.h"
#include "refhost/media/media_source.h"
#include "refhost/media/test_patterns.h"
#include "refhost/media/video_reader.h"
#include "refhost/pipeline/frame_output.h"
#include "refhost/pipeline/video_writer.h"
#include "support/files.h"
#include "support/temp_paths.h"

namespace refhost {
namespace {

using testsupport::commandOutput;
using testsupport::ScratchDirectory;

constexpr PixelFormat kBytes = PixelFormat::Rgba8, kHalf = PixelFormat::RgbaHalf;

// Opaque grey rising from black to white over `width` columns in steps a half float keeps
// apart, in `rows` rows.
RgbaImage fineRamp(int32_t width, int32_t rows) {
  RgbaImage ramp(width, rows, kHalf);
  for (int32_t y = 0; y < rows; ++y) {
    for (int32_t x = 0; x < width; ++x) {
      for (int c = 0; c < 4; ++c)
        ramp.setChannel(x, y, c, c == 3 ? 1.0f : static_cast<float>(x) / (width - 1));
    }
  }
  return ramp;
}

TEST(ImageFiles, StillsRoundTripExactlyAndStretchAsSources) {
  ScratchDirectory folder;
  RgbaImage image(32, 8);  // every byte value in some channel, alpha neither 0 nor 255
  for (std::size_t i = 0; i < image.pixels.size(); ++i)
    image.pixels[i] = static_cast<uint8_t>((i * 7 + i / 4) & 0xFF);
  // An 8-bit PNG comes back as the same bytes; an EXR as half floats that are the bytes / 255
  // to the nearest half, so rounding back gives the bytes again.
  const std::pair<ImageFormat, PixelFormat> formats[] = {{ImageFormat::Png, kBytes},
                                                         {ImageFormat::Exr, kHalf}};
  for (const auto& [format, readAs] : formats) {
    // The writer goes by the format, not the name: a temporary name has no useful ending.
    const std::string path = folder.file(format == ImageFormat::Png ? "still.tmp1" : "still.tmp2");
    writeImageFile(image, path, format);
    const RgbaImage back = readImageFile(path);
    EXPECT_EQ(back.width, 32);
    EXPECT_EQ(back.format, readAs) << path;
    EXPECT_EQ(converted(back, kBytes).pixels, image.pixels) << path;
  }

  writeImageFile(RgbaImage(2, 2, {10, 20, 30, 255}), folder.file("flat.png"), ImageFormat::Png);
  auto source = openMediaSource(MediaSpec::ofFile(folder.file("flat.png")), {25, 1});
  const RgbaImage frame = source->frame(12, 6, 4, kBytes);
  EXPECT_EQ(frame.width, 6);
  EXPECT_EQ(frame.pixel(5, 3), (Rgba8{10, 20, 30, 255}));
  EXPECT_EQ(source->frameCount(), 0);

  // Kept at its proportions, a 4x2 picture (a red row over a blue one) stands unscaled and
  // centred in a 4x5 frame between transparent bars, the odd row falling below.
  RgbaImage wide(4, 2, Rgba8{0, 0, 255, 255});
  wide.fillRect(0, 0, 4, 1, {255, 0, 0, 255});
  writeImageFile(wide, folder.file("wide.png"), ImageFormat::Png);
  MediaSpec contained = MediaSpec::ofFile(folder.file("wide.png"));
  contained.keepProportions = true;
  const RgbaImage shown = openMediaSource(contained, {25, 1})->frame(0, 4, 5, kBytes);
  const Rgba8 rows[] = {
      {0, 0, 0, 0}, {255, 0, 0, 255}, {0, 0, 255, 255}, {0, 0, 0, 0}, {0, 0, 0, 0}};
  for (int32_t y = 0; y < 5; ++y)
    for (int32_t x = 0; x < 4; ++x) EXPECT_EQ(shown.pixel(x, y), rows[y]) << x << "," << y;

  testsupport::writeText(folder.file("junk.png"), "not an image");
  for (const char* bad : {"junk.png", "missing.mp4"}) {
    try {
      openMediaSource(MediaSpec::ofFile(folder.file(bad)), {25, 1});
      ADD_FAILURE() << bad << " opened";
    } catch (const std::runtime_error& error) {
      EXPECT_NE(std::string(error.what()).find(bad), std::string::npos) << error.what();
    }
  }
}

// A ramp finer than 8 bits, with values beyond 0 and 1 at its ends, through each still format
// and depth: deep files keep every step apart (read back as half floats), 8-bit ones hold 256
// levels at most; a PNG clamps to 0 to 1 and rounds to its depth, an EXR keeps the halves.
TEST(ImageFiles, DeepStillsKeepTheStepsOfHalfFloatPictures) {
  ScratchDirectory folder;
  RgbaImage ramp = fineRamp(1024, 2);
  ramp.setChannel(0, 1, 0, -0.5f);
  ramp.setChannel(1023, 1, 0, 1.5f);
  const struct {
    const char* name;
    PixelFormat from;
    ImageFormat format;
    int32_t depth;
    PixelFormat readAs;
    float tolerance;  // of a value from 0 to 1 against the ramp's
    std::size_t levels;
  } cases[] = {
      // A 16-bit step (1 / 65535) plus the half float's own rounding.
      {"half16.png", kHalf, ImageFormat::Png, 16, kHalf, 1.0f / 65535 + 1.0f / 2048, 1024},
      {"half8.png", kHalf, ImageFormat::Png, 8, kBytes, 0.5f / 255, 256},
      {"half.exr", kHalf, ImageFormat::Exr, 8, kHalf, 0.0f, 1024},
      {"bytes16.png", kBytes, ImageFormat::Png, 16, kHalf, 0.5f / 255 + 1.0f / 2048, 256},
  };
  for (const auto& c : cases) {
    const RgbaImage picture = converted(ramp, c.from);
    writeImageFile(picture, folder.file(c.name), c.format, c.depth);
    const RgbaImage back = readImageFile(folder.file(c.name));
    ASSERT_EQ(back.format, c.readAs) << c.name;
    ASSERT_EQ(back.width, 1024) << c.name;
    std::set<float> levels;
    float worst = 0;
    for (int32_t x = 0; x < 1024; ++x) {
      levels.insert(back.channel(x, 0, 0));
      for (int32_t y = 0; y < 2; ++y) {
        for (int ch = 0; ch < 4; ++ch) {
          const float held = ramp.channel(x, y, ch);
          const float expected = c.format == ImageFormat::Exr ? held : std::clamp(held, 0.0f, 1.0f);
          worst = std::max(worst, std::abs(back.channel(x, y, ch) - expected));
        }
      }
    }
    EXPECT_LE(worst, c.tolerance + 1e-6f) << c.name;
    EXPECT_EQ(levels.size(), c.levels) << c.name;
  }
  EXPECT_THROW(writeImageFile(ramp, folder.file("x.png"), ImageFormat::Png, 10),
               std::runtime_error);
}

// Odd sizes are padded to even ones where the chroma is subsampled, from either kind of
// picture, and read back at that size showing the frame written; full chroma keeps the size.
TEST(VideoFiles, OddSizesArePaddedWhereChromaIsSubsampled) {
  ScratchDirectory folder;
  VideoEncoding h265 = encodingFor("h265"), ffv1 = encodingFor("ffv1");
  h265.bitDepth = 10;
  const struct {
    const char* name;
    VideoEncoding encoding;
    PixelFormat pictures;
    int32_t width, height;
  } odd[] = {{"odd8.mkv", encodingFor("h264"), kBytes, 66, 38},
             {"odd10.mkv", h265, kHalf, 66, 38},
             {"odd.mkv", ffv1, kHalf, 65, 37}};
  for (const auto& c : odd) {
    VideoWriter writer(folder.file(c.name), VideoContainer::Mkv, 65, 37, {25, 1}, c.encoding);
    writer.write(converted(generatePattern(Pattern::Counter, 3, 65, 37), c.pictures));
    writer.finish();
    VideoReader reader(folder.file(c.name));
    EXPECT_EQ(reader.info().width, c.width) << c.name;
    EXPECT_EQ(reader.info().height, c.height) << c.name;
    EXPECT_EQ(readCounterCode(reader.frameAt(0, {25, 1}, c.width, c.height)), 3) << c.name;
  }
}

// A ramp of 1024 steps through each kind of picture and video depth, lossless 4:4:4 so that
// only the depth limits it: a half-float picture in a 10-bit video keeps far more levels than 8
// bits can (decoded by ffmpeg to 16-bit grey); 8-bit pictures and videos stay within 256.
TEST(VideoFiles, TenBitVideoKeepsTheLevelsOfHalfFloatPictures) {
  ScratchDirectory folder;
  const RgbaImage ramp = fineRamp(1024, 4);
  const struct {
    const char* name;
    PixelFormat picture;
    int32_t depth;
    std::size_t fewest, most;  // distinct grey levels along the ramp
  } cases[] = {
      // Limited range has some 877 luma levels in 10 bits, 220 in 8.
      {"half10.mkv", kHalf, 10, 800, 1024},
      {"bytes10.mkv", kBytes, 10, 200, 256},
      {"half8.mkv", kHalf, 8, 200, 256},
  };
  for (const auto& c : cases) {
    VideoEncoding encoding = encodingFor("ffv1");
    encoding.bitDepth = c.depth;
    const std::string path = folder.file(c.name);
    VideoWriter writer(path, VideoContainer::Mkv, 1024, 4, {25, 1}, encoding);
    writer.write(converted(ramp, c.picture));
    writer.finish();
    const std::string grey =
        commandOutput("ffmpeg -v error -i " + path + " -f rawvideo -pix_fmt gray16le -");
    ASSERT_EQ(grey.size(), 1024u * 4 * 2) << c.name;
    std::set<uint16_t> levels;
    for (std::size_t x = 0; x < 1024; ++x) {
      uint16_t level;
      std::memcpy(&level, &grey[x * 2], 2);
      levels.insert(level);
    }
    EXPECT_GE(levels.size(), c.fewest) << c.name;
    EXPECT_LE(levels.size(), c.most) << c.name;
  }
  // A setting the codec does not have is refused before any file is made.
  VideoEncoding h264TenBit = encodingFor("h264");
  h264TenBit.bitDepth = 10;
  EXPECT_THROW(VideoWriter(folder.file("no.mp4"), VideoContainer::Mp4, 64, 36, {25, 1}, h264TenBit),
               std::invalid_argument);
}

TEST(OutputTarget, NamesChooseTheKindOfOutput) {
  const struct {
    const char* path;
    OutputKind kind;
    ImageFormat format;
    const char* codec;  // a video's default
    int32_t bitDepth;
  } cases[] = {{"out.png", OutputKind::Still, ImageFormat::Png, "", 8},
               {"dir/OUT.EXR", OutputKind::Still, ImageFormat::Exr, "", 8},
               {"frames/f_%04d.png", OutputKind::Sequence, ImageFormat::Png, "", 8},
               {"f%d.exr", OutputKind::Sequence, ImageFormat::Exr, "", 8},
               {"clip.mp4", OutputKind::Video, ImageFormat::Png, "h264", 8},
               {"clip.MKV", OutputKind::Video, ImageFormat::Png, "h264", 8},
               {"clip.mov", OutputKind::Video, ImageFormat::Png, "prores", 10},
               {"clip.webm", OutputKind::Video, ImageFormat::Png, "vp9", 8}};
  for (const auto& c : cases) {
    const OutputTarget target = parseOutputTarget(c.path);
    EXPECT_EQ(target.kind, c.kind) << c.path;
    if (c.kind != OutputKind::Video) {
      EXPECT_EQ(target.imageFormat, c.format) << c.path;
      EXPECT_EQ(target.imageBitDepth, c.bitDepth) << c.path;
    } else {
      EXPECT_EQ(target.video.codec, c.codec) << c.path;
      EXPECT_EQ(target.video.bitDepth, c.bitDepth) << c.path;
      EXPECT_EQ(target.video.colour, ColourDescription::bt709()) << c.path;
    }
  }
  for (const char* bad : {"out.jpg", "out", "f_%04d.mp4", "f_%s.png", "f_%04d_%04d.png",
                          "f_%123d.png", "dir.png/out", "d%02d/f.png"}) {
    EXPECT_THROW(parseOutputTarget(bad), std::invalid_argument) << bad;
  }
  EXPECT_EQ(parseOutputTarget("a/f_%04d.png").frameName(7), "a/f_0007.png");
  EXPECT_EQ(parseOutputTarget("f%d.exr").frameName(12345), "f12345.exr");
  EXPECT_EQ(parseOutputTarget("f%03d.exr").frameName(-2), "f-002.exr");
}

}  // namespace
}  // namespace refhost
