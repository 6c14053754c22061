// Frames of a video file by index, decoded with FFmpeg's libraries. The decoder stays open
// between calls, so frames asked in order cost one decode each and a jump costs one seek.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "refhost/media/rgba_image.h"

namespace refhost {

class VideoReader {
 public:
  // Throws std::runtime_error naming the path when it holds no decodable video stream.
  explicit VideoReader(const std::string& path);
  ~VideoReader();
  VideoReader(const VideoReader&) = delete;
  VideoReader& operator=(const VideoReader&) = delete;

  int32_t width() const;
  int32_t height() const;
  double frameRate() const;
  // The number of frames the file declares (or its duration implies); 0 when unknown.
  int32_t frameCount() const;

  // Frame `index` counted from 0 at the stream's rate, scaled to the size, top row first.
  // Indexes before the first frame give the first, after the last the last.
  RgbaImage frame(int32_t index, int32_t width, int32_t height);
  // The same picture in GL's row order (bottom row first), converted straight into it.
  std::vector<uint8_t> glRows(int32_t index, int32_t width, int32_t height);

 private:
  struct Decoder;
  std::unique_ptr<Decoder> decoder_;
};

}  // namespace refhost
