// Frames of a video file by presentation time, decoded with FFmpeg's libraries and shown as
// players show them: converted with the stream's colour description, upright and at square
// pixels, damaged frames concealed as the decoder conceals them. The decoder stays open
// between calls, so frames asked in order cost one decode each and a jump costs one seek.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "refhost/media/colour.h"
#include "refhost/media/damaged_frames.h"
#include "refhost/media/frame_rate.h"
#include "refhost/media/media_source.h"
#include "refhost/media/rgba_image.h"

namespace refhost {

class VideoReader {
 public:
  // Throws std::runtime_error naming the path when it holds no decodable video stream, or one
  // the host would show with wrong colours: HDR (PQ or HLG transfer) or BT.2020's wide gamut.
  // Frames found damaged while decoding are recorded in `damage` when one is given.
  explicit VideoReader(const std::string& path, std::shared_ptr<DamagedFrames> damage = nullptr);
  ~VideoReader();
  VideoReader(const VideoReader&) = delete;
  VideoReader& operator=(const VideoReader&) = delete;

  // The frame rate is the stream's nominal one, as FFmpeg guesses it (a variable rate's
  // steady rate, not its average), snapped to the common rates.
  const MediaInfo& info() const;

  // The picture shown at frame `frame` of a composition at `rate` (frame / rate seconds after
  // the stream's first frame): the frame whose presentation time is the latest at or before
  // it (the first frame before the first, the last after the last), scaled to the size, in
  // GL's row order (bottom row first), in the format. A frame that does not decode at all
  // leaves the last one that did in its place.
  std::vector<uint8_t> glRowsAt(int64_t frame, FrameRate rate, int32_t width, int32_t height,
                                PixelFormat format);
  // The same picture top row first.
  RgbaImage frameAt(int64_t frame, FrameRate rate, int32_t width, int32_t height,
                    PixelFormat format = PixelFormat::Rgba8);

 private:
  struct Decoder;
  std::unique_ptr<Decoder> decoder_;
};

}  // namespace refhost
