// The four kinds of media source and the choice between them.
#include "refhost/media/media_source.h"

#include <algorithm>
#include <cctype>

#include "refhost/media/image_files.h"
#include "refhost/media/video_reader.h"

namespace refhost {
namespace {

class PatternSource : public MediaSource {
 public:
  explicit PatternSource(Pattern pattern) : pattern_(pattern) {}
  RgbaImage frame(int32_t index, int32_t width, int32_t height) override {
    return generatePattern(pattern_, index, width, height);
  }
  bool changesOverTime() const override { return pattern_ == Pattern::Counter; }

 private:
  Pattern pattern_;
};

class ColourSource : public MediaSource {
 public:
  explicit ColourSource(const std::array<float, 4>& colour) : colour_(colour) {}
  RgbaImage frame(int32_t, int32_t width, int32_t height) override {
    return solidColour(colour_, width, height);
  }
  bool changesOverTime() const override { return false; }

 private:
  std::array<float, 4> colour_;
};

// A still image decodes once; the picture at the last size asked is kept, since every frame
// of a render asks for the same one.
class StillImageSource : public MediaSource {
 public:
  explicit StillImageSource(const std::string& path) : image_(readImageFile(path)) {}
  RgbaImage frame(int32_t, int32_t width, int32_t height) override {
    if (scaled_.width != width || scaled_.height != height)
      scaled_ = resized(image_, width, height);
    return scaled_;
  }
  bool changesOverTime() const override { return false; }

 private:
  RgbaImage image_;
  RgbaImage scaled_;
};

class VideoSource : public MediaSource {
 public:
  explicit VideoSource(const std::string& path) : reader_(path) {}
  RgbaImage frame(int32_t index, int32_t width, int32_t height) override {
    return reader_.frame(index, width, height);
  }
  std::vector<uint8_t> glRows(int32_t index, int32_t width, int32_t height) override {
    return reader_.glRows(index, width, height);
  }
  int32_t frameCount() const override { return reader_.frameCount(); }

 private:
  VideoReader reader_;
};

}  // namespace

std::vector<uint8_t> MediaSource::glRows(int32_t index, int32_t width, int32_t height) {
  RgbaImage image = frame(index, width, height);
  return flipRows(image.pixels, image.width, image.height);
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
  return spec;
}

bool isVideoPath(const std::string& path) {
  std::string::size_type dot = path.rfind('.');
  if (dot == std::string::npos || path.find('/', dot) != std::string::npos) return false;
  std::string extension = path.substr(dot + 1);
  std::transform(extension.begin(), extension.end(), extension.begin(),
                 [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  for (const char* video :
       {"mp4", "mov", "mkv", "m4v", "avi", "webm", "mxf", "mpg", "mpeg", "ts"}) {
    if (extension == video) return true;
  }
  return false;
}

std::shared_ptr<MediaSource> openMediaSource(const MediaSpec& spec) {
  switch (spec.kind) {
    case MediaSpec::Kind::Pattern:
      return std::make_shared<PatternSource>(spec.pattern);
    case MediaSpec::Kind::Colour:
      return std::make_shared<ColourSource>(spec.colour);
    case MediaSpec::Kind::File:
      if (isVideoPath(spec.path)) return std::make_shared<VideoSource>(spec.path);
      return std::make_shared<StillImageSource>(spec.path);
  }
  return nullptr;
}

}  // namespace refhost
