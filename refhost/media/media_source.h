// Media sources: where the pictures of the effect's own input and of every other layer come
// from (a generated pattern, a solid colour, a still image or a video file), and their bridge to
// the host's frame delivery.
#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "refhost/media/colour.h"
#include "refhost/media/damaged_frames.h"
#include "refhost/media/frame_rate.h"
#include "refhost/media/rgba_image.h"
#include "refhost/media/test_patterns.h"

namespace refhost {

// What a media holds, as far as a composition cares.
struct MediaInfo {
  // The picture's size as players show it: upright (a display rotation or a photo's EXIF
  // orientation applied) and at square pixels (a sample aspect ratio applied). 0 for generated
  // pictures, which take any size.
  int32_t width = 0;
  int32_t height = 0;
  int32_t bitDepth = 8;  // bits a channel of the stored pictures
  // What the pictures were converted to RGB from; still images and generated pictures are
  // sRGB/BT.709 RGB already.
  ColourDescription colour = ColourDescription::bt709();
  // Pictures of its own that change over time at its own rate (a video, an animated GIF or
  // WebP), as its content says whatever its name; false for stills and generated pictures.
  bool video = false;
  FrameRate frameRate;  // a video's nominal rate (see VideoReader); none for the rest
  double duration = 0;  // seconds; 0 for what has no end (stills, patterns)
  bool hasAudio = false;
};

struct MediaSpec {
  enum class Kind { Pattern, Colour, File };
  Kind kind = Kind::Pattern;
  Pattern pattern = Pattern::Counter;
  std::array<float, 4> colour{0, 0, 0, 1};  // red, green, blue, alpha from 0 to 1
  std::string path;                         // a file, as open() will find it
  // A picture of other proportions than the size asked for is shown whole at its own
  // proportions, centred, with transparent bars beside it ("contain"), instead of stretched.
  bool keepProportions = false;
  // What the media turned out to hold when it was first opened (a scene's media are opened
  // as the scene is read); empty until then. Later openings take its word for what the file
  // is instead of probing it again.
  std::optional<MediaInfo> info;
  // A file's frames found damaged by every source opened from this spec and its copies.
  std::shared_ptr<DamagedFrames> damage;

  static MediaSpec ofPattern(Pattern pattern);
  static MediaSpec ofColour(const std::array<float, 4>& rgba);
  static MediaSpec ofFile(const std::string& path);
};

class MediaSource {
 public:
  virtual ~MediaSource() = default;
  // The picture at composition frame `index` (at the rate the media was opened for), stretched
  // to the size, top row first, in the format. Frames before a video's first show its first,
  // after its last its last.
  virtual RgbaImage frame(int32_t index, int32_t width, int32_t height, PixelFormat format) = 0;
  // The same picture in GL's row order, bottom row first, as the host uploads it.
  virtual std::vector<uint8_t> glRows(int32_t index, int32_t width, int32_t height,
                                      PixelFormat format);
  // How many composition frames the media covers; 0 when it looks the same at every frame or
  // never ends.
  virtual int32_t frameCount() const { return 0; }
  // False when every frame is the same picture, which lets a caller keep the last one.
  virtual bool changesOverTime() const { return true; }
  virtual MediaInfo info() const { return {}; }
};

// A media that makes its pictures in GL's row order (decoders writing straight into upload
// order, queues of such rows): the top-first picture is those rows turned over.
class GlRowsSource : public MediaSource {
 public:
  RgbaImage frame(int32_t index, int32_t width, int32_t height, PixelFormat format) final;
  std::vector<uint8_t> glRows(int32_t index, int32_t width, int32_t height,
                              PixelFormat format) override = 0;
};

// Throws std::runtime_error naming the file, in one line, when a file cannot be opened or
// decoded, or holds what the host does not show (see VideoReader). Whether a file is a video
// or a still is decided by its content (see probeFile). Composition frame n at
// `compositionRate` shows the media's picture whose presentation time is the latest at or
// before n / compositionRate, as players and editors choose it.
std::shared_ptr<MediaSource> openMediaSource(const MediaSpec& spec, FrameRate compositionRate);

}  // namespace refhost
