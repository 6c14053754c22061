// Media sources: where the pictures of the effect's own input and of every other layer come
// from (a generated pattern, a solid colour, a still image or a video file), and their bridge to
// the host's frame delivery.
#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "refhost/media/rgba_image.h"
#include "refhost/media/test_patterns.h"

namespace refhost {

struct MediaSpec {
  enum class Kind { Pattern, Colour, File };
  Kind kind = Kind::Pattern;
  Pattern pattern = Pattern::Counter;
  std::array<float, 4> colour{0, 0, 0, 1};  // red, green, blue, alpha from 0 to 1
  std::string path;                         // a file, as open() will find it

  static MediaSpec ofPattern(Pattern pattern);
  static MediaSpec ofColour(const std::array<float, 4>& rgba);
  static MediaSpec ofFile(const std::string& path);
};

class MediaSource {
 public:
  virtual ~MediaSource() = default;
  // Frame `index` stretched to the size, top row first. Frames outside a video hold its first
  // or last frame.
  virtual RgbaImage frame(int32_t index, int32_t width, int32_t height) = 0;
  // The same picture in GL's row order, bottom row first, as the host uploads it.
  virtual std::vector<uint8_t> glRows(int32_t index, int32_t width, int32_t height);
  // How many frames the media holds; 0 when it looks the same at every frame or never ends.
  virtual int32_t frameCount() const { return 0; }
  // False when every frame is the same picture, which lets a caller keep the last one.
  virtual bool changesOverTime() const { return true; }
};

// Throws std::runtime_error naming the file when a file cannot be opened or decoded.
std::shared_ptr<MediaSource> openMediaSource(const MediaSpec& spec);

// Files with these endings are decoded as video; everything else as a still image.
bool isVideoPath(const std::string& path);

}  // namespace refhost
