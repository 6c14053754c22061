// A video whose index is intact but whose picture data is damaged past some point, as a copy
// cut short in the middle with its index at the front is: the frames before the damage decode,
// and the first one after it fails with one line naming the file and the frame.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>

#include "refhost/test_patterns.h"
#include "refhost/video_reader.h"
#include "refhost/video_writer.h"
#include "support/temp_paths.h"

TEST(DamagedVideo, TheFailingFrameIsNamedWithTheFile) {
  const std::string folder = testsupport::makeTempDirectory("veltrane_video_");
  const std::string path = folder + "/damaged.mp4";
  refhost::VideoWriter writer(path, refhost::VideoContainer::Mp4, 64, 36, 25.0);
  for (int frame = 0; frame < 30; ++frame)
    writer.write(refhost::generatePattern(refhost::Pattern::Counter, frame, 64, 36));
  writer.finish();
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

  refhost::VideoReader reader(path);
  int decoded = 0;
  std::string message;
  try {
    for (; decoded < 30; ++decoded) reader.frame(decoded, 64, 36);
  } catch (const std::runtime_error& error) {
    message = error.what();
  }
  EXPECT_GT(decoded, 0);
  EXPECT_EQ(message.rfind(path + ": cannot decode video: frame " + std::to_string(decoded), 0), 0u)
      << message;
  EXPECT_EQ(message.find('\n'), std::string::npos) << message;
  std::filesystem::remove_all(folder);
}
