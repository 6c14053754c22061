// The four kinds of media source and the choice between them.
#include "refhost/media/media_source.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "refhost/media/image_files.h"
#include "refhost/media/moving_pictures.h"

namespace refhost {
namespace {

// Generated pictures are 8-bit; a deeper picture is asked of them as the same values in the
// deeper format.
RgbaImage inFormat(RgbaImage picture, PixelFormat format) {
  return picture.format == format ? picture : converted(picture, format);
}

class PatternSource : public MediaSource {
 public:
  explicit PatternSource(Pattern pattern) : pattern_(pattern) {}
  RgbaImage frame(int32_t index, int32_t width, int32_t height, PixelFormat format) override {
    return inFormat(generatePattern(pattern_, index, width, height), format);
  }
  bool changesOverTime() const override { return pattern_ == Pattern::Counter; }

 private:
  Pattern pattern_;
};

class ColourSource : public MediaSource {
 public:
  explicit ColourSource(const std::array<float, 4>& colour) : colour_(colour) {}
  RgbaImage frame(int32_t, int32_t width, int32_t height, PixelFormat format) override {
    return inFormat(solidColour(colour_, width, height), format);
  }
  bool changesOverTime() const override { return false; }

 private:
  std::array<float, 4> colour_;
};

// A still image decodes once; the picture at the last size and format asked is kept, since
// every frame of a render asks for the same one.
class StillImageSource : public MediaSource {
 public:
  explicit StillImageSource(const std::string& path) : image_(readImageFile(path)) {}
  RgbaImage frame(int32_t, int32_t width, int32_t height, PixelFormat format) override {
    if (scaled_.width != width || scaled_.height != height || scaled_.format != format)
      scaled_ = resized(inFormat(image_, format), width, height);
    return scaled_;
  }
  bool changesOverTime() const override { return false; }
  MediaInfo info() const override {
    MediaInfo info;
    info.width = image_.width;
    info.height = image_.height;
    info.bitDepth = image_.format == PixelFormat::Rgba8 ? 8 : 16;
    return info;
  }

 private:
  RgbaImage image_;
  RgbaImage scaled_;
};

// A media's pictures shown whole at their own proportions inside the size asked for.
class ProportionalSource : public GlRowsSource {
 public:
  explicit ProportionalSource(std::shared_ptr<MediaSource> inner)
      : inner_(std::move(inner)), info_(inner_->info()) {}
  // Straight from the media's own rows: a picture that fills the size is passed on as it
  // comes, without a copy (large frames of several media are in flight at once).
  std::vector<uint8_t> glRows(int32_t index, int32_t width, int32_t height,
                              PixelFormat format) override {
    const Fitted fitted = fit(width, height);
    if (fitted.width == width && fitted.height == height)
      return inner_->glRows(index, width, height, format);
    const std::vector<uint8_t> inside = inner_->glRows(index, fitted.width, fitted.height, format);
    const std::size_t pixel = bytesPerPixel(format);
    std::vector<uint8_t> rows(static_cast<std::size_t>(width) * height * pixel);
    // Rows count from the bottom here: the bars below the picture are the ones at the end.
    const int32_t bottom = height - fitted.height - fitted.top;
    for (int32_t y = 0; y < fitted.height; ++y)
      std::memcpy(&rows[((static_cast<std::size_t>(y + bottom)) * width + fitted.left) * pixel],
                  &inside[static_cast<std::size_t>(y) * fitted.width * pixel],
                  static_cast<std::size_t>(fitted.width) * pixel);
    return rows;
  }
  int32_t frameCount() const override { return inner_->frameCount(); }
  bool changesOverTime() const override { return inner_->changesOverTime(); }
  MediaInfo info() const override { return info_; }

 private:
  struct Fitted {
    int32_t width, height, left, top;
  };
  // The largest picture of the media's proportions inside the size, centred; within a pixel of
  // the size, the size itself.
  Fitted fit(int32_t width, int32_t height) const {
    if (info_.width <= 0 || info_.height <= 0 || width <= 0 || height <= 0)
      return {width, height, 0, 0};
    const double scale = std::min(static_cast<double>(width) / info_.width,
                                  static_cast<double>(height) / info_.height);
    const auto w = static_cast<int32_t>(std::lround(info_.width * scale));
    const auto h = static_cast<int32_t>(std::lround(info_.height * scale));
    if (std::abs(w - width) <= 1 && std::abs(h - height) <= 1) return {width, height, 0, 0};
    return {std::clamp(w, 1, width), std::clamp(h, 1, height),
            (width - std::clamp(w, 1, width)) / 2, (height - std::clamp(h, 1, height)) / 2};
  }

  std::shared_ptr<MediaSource> inner_;
  MediaInfo info_;
};

std::shared_ptr<MediaSource> opened(const MediaSpec& spec, FrameRate compositionRate);

}  // namespace

std::vector<uint8_t> MediaSource::glRows(int32_t index, int32_t width, int32_t height,
                                         PixelFormat format) {
  RgbaImage image = frame(index, width, height, format);
  return flipRows(image.pixels, image.width, image.height);
}

RgbaImage GlRowsSource::frame(int32_t index, int32_t width, int32_t height, PixelFormat format) {
  RgbaImage picture(width, height, format);
  picture.pixels = flipRows(glRows(index, width, height, format), width, height);
  return picture;
}

MediaSpec MediaSpec::ofPattern(Pattern pattern) {
  MediaSpec spec;
  spec.kind = Kind::Pattern;
  spec.pattern = pattern;
  return spec;
}

MediaSpec MediaSpec::ofColour(const std::array<float, 4>& rgba) {
  MediaSpec spec;
  spec.kind = Kind::Colour;
  spec.colour = rgba;
  return spec;
}

MediaSpec MediaSpec::ofFile(const std::string& path) {
  MediaSpec spec;
  spec.kind = Kind::File;
  spec.path = path;
  spec.damage = std::make_shared<DamagedFrames>();
  return spec;
}

std::shared_ptr<MediaSource> openMediaSource(const MediaSpec& spec, FrameRate compositionRate) {
  std::shared_ptr<MediaSource> source = opened(spec, compositionRate);
  if (spec.keepProportions) return std::make_shared<ProportionalSource>(std::move(source));
  return source;
}

namespace {

std::shared_ptr<MediaSource> opened(const MediaSpec& spec, FrameRate compositionRate) {
  switch (spec.kind) {
    case MediaSpec::Kind::Pattern:
      return std::make_shared<PatternSource>(spec.pattern);
    case MediaSpec::Kind::Colour:
      return std::make_shared<ColourSource>(spec.colour);
    case MediaSpec::Kind::File:
      if (auto moving = openMovingPictures(spec, compositionRate)) return moving;
      return std::make_shared<StillImageSource>(spec.path);
  }
  return nullptr;
}

}  // namespace

}  // namespace refhost
