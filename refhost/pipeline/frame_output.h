// Where a render's frames go and how they are written: one still image (PNG or EXR), a
// numbered image sequence, or a video file with its encoding. Everything is written under
// temporary names and moved into place at the end.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "refhost/media/image_files.h"
#include "refhost/media/rgba_image.h"
#include "refhost/pipeline/video_writer.h"

namespace refhost {

enum class OutputKind { Still, Sequence, Video };

struct OutputTarget {
  OutputKind kind = OutputKind::Still;
  std::string path;  // a sequence's path holds its frame-number pattern
  ImageFormat imageFormat = ImageFormat::Png;
  int32_t imageBitDepth = 8;  // a PNG's, 8 or 16; EXR is always half float
  VideoContainer container = VideoContainer::Mp4;
  VideoEncoding video;  // a video's

  // A sequence's file name for the frame: the pattern's %0Nd (or %d) replaced by the number,
  // zero-padded to N digits.
  std::string frameName(int32_t frame) const;
};

// By the name: a pattern with one %0Nd or %d in the file name (not a folder's) and ending in
// .png or .exr is a sequence; .png and .exr alone are stills; .mp4, .mov, .mkv and .webm are
// videos (letter case ignored), encoded as the container's default codec is (defaultCodec()).
// Throws std::invalid_argument saying what was expected.
OutputTarget parseOutputTarget(const std::string& path);

class FrameSink {
 public:
  virtual ~FrameSink() = default;  // deletes whatever was not committed
  // A picture of the sink's size, top row first, in either pixel format.
  virtual void write(int32_t frame, const RgbaImage& picture) = 0;
  // The same for a picture the caller is done with; a sink that keeps pictures takes it over.
  virtual void write(int32_t frame, RgbaImage&& picture) { write(frame, std::as_const(picture)); }
  // Moves everything written into place, all or nothing; returns the final names. Every write
  // and the flush at the end is checked: errors name the final name and the system's reason.
  virtual std::vector<std::string> commit() = 0;
  // Empty, or something the user should know about how the frames were written.
  virtual std::string note() const { return ""; }
  // True when write() may run on several threads at once (for different frames).
  virtual bool concurrentWrites() const { return false; }
};

// Throws std::runtime_error naming the file when it cannot be created (std::invalid_argument
// for a video encoding refusalOf() refuses). A video carries the audio clips' sound, those
// that have any, mixed when there are several.
std::unique_ptr<FrameSink> openFrameSink(const OutputTarget& target, int32_t width, int32_t height,
                                         FrameRate frameRate,
                                         const std::vector<AudioClip>& audio = {});

}  // namespace refhost
