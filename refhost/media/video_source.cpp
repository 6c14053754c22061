// The video source over the reader.
#include "refhost/media/video_source.h"

#include <algorithm>
#include <cmath>

#include "refhost/media/video_reader.h"

namespace refhost {
namespace {

class VideoSource : public GlRowsSource {
 public:
  VideoSource(const std::string& path, FrameRate compositionRate,
              std::shared_ptr<DamagedFrames> damage)
      : reader_(path, std::move(damage)),
        rate_(compositionRate.valid() ? compositionRate : FrameRate{25, 1}) {}
  std::vector<uint8_t> glRows(int32_t index, int32_t width, int32_t height,
                              PixelFormat format) override {
    return reader_.glRowsAt(index, rate_, width, height, format);
  }
  int32_t frameCount() const override {
    const double frames = std::ceil(reader_.info().duration * rate_.perSecond() - 1e-6);
    return frames > 0 ? static_cast<int32_t>(std::min(frames, 1e9)) : 0;
  }
  MediaInfo info() const override { return reader_.info(); }

 private:
  VideoReader reader_;
  FrameRate rate_;
};

}  // namespace

std::shared_ptr<MediaSource> openVideoSource(const std::string& path, FrameRate compositionRate,
                                             std::shared_ptr<DamagedFrames> damage) {
  return std::make_shared<VideoSource>(path, compositionRate, std::move(damage));
}

}  // namespace refhost
