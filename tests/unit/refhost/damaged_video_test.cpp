// A video whose index is intact but whose picture data is damaged past some point, as a copy
// cut short in the middle leaves a file that keeps its index at the front: the frames before
// the damage decode, and the first one after it fails with one line naming the file and frame.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>

#include "refhost/test_patterns.h"
#include "refhost/video_reader.h"
#include "refhost/video_writer.h"
#include "support/temp_paths.h"

namespace refhost {
namespace {

TEST(DamagedVideo, TheFailingFrameIsNamedWithTheFile) {
  const std::string folder = testsupport::makeTempDirectory("veltrane_damaged_video_");
  const std::string path = folder + "/damaged.mp4";
  constexpr int kFrames = 30;
  {
    VideoWriter writer(path, VideoContainer::Mp4, 64, 36, 25.0);
    for (int frame = 0; frame < kFrames; ++frame)
      writer.write(generatePattern(Pattern::Counter, frame, 64, 36));
    writer.finish();
  }
  std::string bytes;
  {
    std::ifstream in(path, std::ios::binary);
    bytes.assign(std::istreambuf_iterator<char>(in), {});
  }
  // The picture data box: a 4-byte big-endian size, then "mdat". Zero its second half.
  std::string::size_type box = bytes.find("mdat");
  ASSERT_NE(box, std::string::npos);
  ASSERT_GE(box, 4u);
  std::size_t size = 0;
  for (std::size_t i = box - 4; i < box; ++i) size = size << 8 | static_cast<uint8_t>(bytes[i]);
  std::size_t end = box - 4 + size;
  ASSERT_LE(end, bytes.size());
  std::fill(bytes.begin() + static_cast<std::ptrdiff_t>(box + (end - box) / 2),
            bytes.begin() + static_cast<std::ptrdiff_t>(end), '\0');
  std::ofstream(path, std::ios::binary | std::ios::trunc) << bytes;

  VideoReader reader(path);
  int decoded = 0;
  std::string message;
  try {
    for (; decoded < kFrames; ++decoded) reader.frame(decoded, 64, 36);
  } catch (const std::runtime_error& error) {
    message = error.what();
  }
  EXPECT_GT(decoded, 0);
  EXPECT_LT(decoded, kFrames);
  EXPECT_EQ(
      message.rfind(path + ": cannot decode video: frame " + std::to_string(decoded) + ": ", 0), 0u)
      << message;
  EXPECT_EQ(message.find('\n'), std::string::npos) << message;
  std::filesystem::remove_all(folder);
}

}  // namespace
}  // namespace refhost
