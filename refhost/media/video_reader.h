// Frames of a video file by presentation time, decoded with FFmpeg's libraries and shown as
// players show them: converted with the stream's colour description, upright and at square
// pixels. The decoder stays open between calls, so frames asked in order cost one decode each
// and a jump costs one seek.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "refhost/media/colour.h"
#include "refhost/media/media_source.h"
#include "refhost/media/rgba_image.h"

namespace refhost {

class VideoReader {
 public:
  // Throws std::runtime_error naming the path when it holds no decodable video stream, or one
  // the host would show with wrong colours: HDR (PQ or HLG transfer) or BT.2020's wide gamut.
  explicit VideoReader(const std::string& path);
  ~VideoReader();
  VideoReader(const VideoReader&) = delete;
  VideoReader& operator=(const VideoReader&) = delete;

  const MediaInfo& info() const;

  // The picture shown `seconds` after the stream's start: the frame whose presentation time is
  // the latest at or before it (the first frame before the first, the last after the last),
  // scaled to the size, in GL's row order (bottom row first), in the format.
  std::vector<uint8_t> glRowsAt(double seconds, int32_t width, int32_t height, PixelFormat format);
  // The same picture top row first.
  RgbaImage frameAt(double seconds, int32_t width, int32_t height,
                    PixelFormat format = PixelFormat::Rgba8);

 private:
  struct Decoder;
  std::unique_ptr<Decoder> decoder_;
};

}  // namespace refhost
