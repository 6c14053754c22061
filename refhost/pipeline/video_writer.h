// Encodes RGBA frames into a video file with FFmpeg's libraries: H.264 through libx264 where
// the libraries have it, else the container's own default video encoder.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "refhost/media/audio_track.h"
#include "refhost/media/rgba_image.h"

namespace refhost {

enum class VideoContainer { Mp4, Mov, Mkv };

class VideoWriter {
 public:
  // Opens the file for frames of the size at the rate (frames per second), written as the
  // container whatever the path's name. 4:2:0 video needs even sizes: an odd width or height
  // is padded by repeating the last column or row. Throws std::runtime_error naming the file
  // by `shownName` when given (the user's name for a file written under a temporary one), else
  // by the path. With an audio clip, the file carries its sound too (see AudioClip).
  VideoWriter(const std::string& path, VideoContainer container, int32_t width, int32_t height,
              double frameRate, const std::string& shownName = "", const AudioClip& audio = {});
  // Without finish() the file is closed as it is (unplayable); the caller deletes it.
  ~VideoWriter();
  VideoWriter(const VideoWriter&) = delete;
  VideoWriter& operator=(const VideoWriter&) = delete;

  // A picture of the writer's size, top row first.
  void write(const RgbaImage& frame);
  // Flushes the encoder and completes the file.
  void finish();

  const std::string& codecName() const;
  // Empty, or why the encoder is not libx264.
  const std::string& note() const;

 private:
  struct Encoder;
  std::unique_ptr<Encoder> encoder_;
};

}  // namespace refhost
