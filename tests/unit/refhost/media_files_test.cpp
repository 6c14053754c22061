// Media on disk: stills written and read back exactly, small videos encoded and decoded frame
// by frame by index, damaged ones failing at the first frame they cannot give, and the kinds of
// output their names choose. (What appears on disk, and when, is checked through the command
// line.)
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <iterator>

#include "refhost/media/image_files.h"
#include "refhost/media/media_source.h"
#include "refhost/media/test_patterns.h"
#include "refhost/media/video_reader.h"
#include "refhost/pipeline/frame_output.h"
#include "refhost/pipeline/video_writer.h"
#include "support/temp_paths.h"

namespace refhost {
namespace {

using testsupport::ScratchDirectory;

// Counter frames first .. first + frames - 1 at 25 fps, encoded with the codec every container
// gets.
void writeCounterVideo(const std::string& path, VideoContainer container, int32_t width,
                       int32_t height, int32_t frames, int32_t first = 0) {
  VideoWriter writer(path, container, width, height, 25.0);
  EXPECT_EQ(writer.codecName(), "libx264") << writer.note();
  for (int32_t i = first; i < first + frames; ++i)
    writer.write(generatePattern(Pattern::Counter, i, width, height));
  writer.finish();
}

TEST(ImageFiles, StillsRoundTripExactlyAndStretchAsSources) {
  ScratchDirectory folder;
  RgbaImage image(32, 8);  // every byte value in some channel, alpha neither 0 nor 255
  for (std::size_t i = 0; i < image.pixels.size(); ++i)
    image.pixels[i] = static_cast<uint8_t>((i * 7 + i / 4) & 0xFF);
  for (ImageFormat format : {ImageFormat::Png, ImageFormat::Exr}) {
    // The writer goes by the format, not the name: a temporary name has no useful ending.
    const std::string path = folder.file(format == ImageFormat::Png ? "still.tmp1" : "still.tmp2");
    writeImageFile(image, path, format);
    const RgbaImage back = readImageFile(path);
    EXPECT_EQ(back.width, 32);
    EXPECT_EQ(back.pixels, image.pixels) << path;
  }

  writeImageFile(RgbaImage(2, 2, {10, 20, 30, 255}), folder.file("flat.png"), ImageFormat::Png);
  auto source = openMediaSource(MediaSpec::ofFile(folder.file("flat.png")), 25.0);
  const RgbaImage frame = source->frame(12, 6, 4, PixelFormat::Rgba8);
  EXPECT_EQ(frame.width, 6);
  EXPECT_EQ(frame.pixel(5, 3), (Rgba8{10, 20, 30, 255}));
  EXPECT_EQ(source->frameCount(), 0);

  std::ofstream(folder.file("junk.png")) << "not an image";
  for (const char* bad : {"junk.png", "missing.mp4"}) {
    try {
      openMediaSource(MediaSpec::ofFile(folder.file(bad)), 25.0);
      ADD_FAILURE() << bad << " opened";
    } catch (const std::runtime_error& error) {
      EXPECT_NE(std::string(error.what()).find(bad), std::string::npos) << error.what();
    }
  }
}

// Twelve counter frames in each container, then frames asked in order and out of order.
TEST(VideoFiles, DecodedFrameNShowsCounterN) {
  ScratchDirectory folder;
  const int32_t width = 64, height = 36, frames = 12;
  const std::pair<VideoContainer, const char*> containers[] = {{VideoContainer::Mp4, "clip.mp4"},
                                                               {VideoContainer::Mov, "clip.mov"},
                                                               {VideoContainer::Mkv, "clip.mkv"}};
  for (const auto& [container, name] : containers) {
    writeCounterVideo(folder.file(name), container, width, height, frames);
    VideoReader reader(folder.file(name));
    EXPECT_EQ(reader.info().width, width);
    EXPECT_DOUBLE_EQ(reader.info().frameRate, 25.0);
    EXPECT_DOUBLE_EQ(reader.info().duration, frames / 25.0) << name;
    // Beyond either end the nearest frame holds; the last asks for a scaled picture.
    const std::pair<int32_t, int32_t> asked[] = {{0, 0}, {1, 1}, {9, 9}, {4, 4},   {11, 11},
                                                 {5, 5}, {5, 5}, {0, 0}, {40, 11}, {-3, 0}};
    for (const auto& [index, shown] : asked)
      EXPECT_EQ(readCounterCode(reader.frameAt(index / 25.0, width, height)), shown)
          << name << " " << index;
    EXPECT_EQ(readCounterCode(reader.frameAt(6 / 25.0, 2 * width, 2 * height)), 6) << name;
  }
  // Odd sizes are padded to even ones.
  writeCounterVideo(folder.file("odd.mp4"), VideoContainer::Mp4, 65, 37, 1, 3);
  VideoReader reader(folder.file("odd.mp4"));
  EXPECT_EQ(reader.info().width, 66);
  EXPECT_EQ(reader.info().height, 38);
  EXPECT_EQ(readCounterCode(reader.frameAt(0, 66, 38)), 3);
}

// A video whose index is intact but whose picture data is damaged past some point, as a copy
// cut short in the middle with its index at the front is: the frames before the damage decode,
// and the first one after it fails with one line naming the file and the frame.
TEST(VideoFiles, TheFirstUndecodableFrameIsNamedWithTheFile) {
  ScratchDirectory folder;
  const std::string path = folder.file("damaged.mp4");
  writeCounterVideo(path, VideoContainer::Mp4, 64, 36, 30);
  std::ifstream in(path, std::ios::binary);
  std::string bytes(std::istreambuf_iterator<char>(in), {});
  // Zero the second half of the picture data box: 4 bytes of big-endian size, then "mdat".
  const std::size_t box = bytes.find("mdat");
  ASSERT_NE(box, std::string::npos);
  std::size_t size = 0;
  for (std::size_t i = box - 4; i < box; ++i) size = size << 8 | static_cast<uint8_t>(bytes[i]);
  ASSERT_LE(box - 4 + size, bytes.size());
  std::fill(bytes.begin() + static_cast<long>(box + size / 2),
            bytes.begin() + static_cast<long>(box - 4 + size), '\0');
  std::ofstream(path, std::ios::binary | std::ios::trunc) << bytes;

  VideoReader reader(path);
  int decoded = 0;
  std::string message;
  try {
    for (; decoded < 30; ++decoded) reader.frameAt(decoded / 25.0, 64, 36);
  } catch (const std::runtime_error& error) {
    message = error.what();
  }
  EXPECT_GT(decoded, 0);
  EXPECT_EQ(message.rfind(path + ": cannot decode video: frame " + std::to_string(decoded), 0), 0u)
      << message;
  EXPECT_EQ(message.find('\n'), std::string::npos) << message;
}

TEST(OutputTarget, NamesChooseTheKindOfOutput) {
  const struct {
    const char* path;
    OutputKind kind;
    ImageFormat format;
  } cases[] = {
      {"out.png", OutputKind::Still, ImageFormat::Png},
      {"dir/OUT.EXR", OutputKind::Still, ImageFormat::Exr},
      {"frames/f_%04d.png", OutputKind::Sequence, ImageFormat::Png},
      {"f%d.exr", OutputKind::Sequence, ImageFormat::Exr},
      {"clip.mp4", OutputKind::Video, ImageFormat::Png},
      {"clip.MKV", OutputKind::Video, ImageFormat::Png},
      {"clip.mov", OutputKind::Video, ImageFormat::Png},
  };
  for (const auto& c : cases) {
    const OutputTarget target = parseOutputTarget(c.path);
    EXPECT_EQ(target.kind, c.kind) << c.path;
    if (c.kind != OutputKind::Video) {
      EXPECT_EQ(target.imageFormat, c.format) << c.path;
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
