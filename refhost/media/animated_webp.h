// Animated WebP images played as video through libwebp's animation decoder (FFmpeg decodes
// only still WebP): each frame composed onto the canvas, shown from its time for its duration.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "refhost/media/frame_rate.h"
#include "refhost/media/media_source.h"

namespace refhost {

// True for a WebP file of more than one frame.
bool isAnimatedWebp(const std::string& path);

class WebpAnimationSource : public MediaSource {
 public:
  // Composition frame n at `compositionRate` shows the frame whose time is the latest at or
  // before n / compositionRate, as for videos. Throws std::runtime_error naming the file when
  // libwebp cannot read it.
  WebpAnimationSource(const std::string& path, FrameRate compositionRate);
  ~WebpAnimationSource() override;

  RgbaImage frame(int32_t index, int32_t width, int32_t height, PixelFormat format) override;
  int32_t frameCount() const override;
  MediaInfo info() const override { return info_; }

 private:
  struct Decoder;
  std::unique_ptr<Decoder> decoder_;
  FrameRate rate_;
  MediaInfo info_;
  std::vector<int64_t> starts_;  // each frame's time in milliseconds
};

}  // namespace refhost
