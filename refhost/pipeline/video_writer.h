// Encodes RGBA frames, 8-bit or half-float, into a video file with FFmpeg's libraries, with the
// codec, quality, bit depth and colour of a VideoEncoding.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "refhost/media/audio_input.h"
#include "refhost/media/frame_rate.h"
#include "refhost/media/rgba_image.h"
#include "refhost/pipeline/video_encoding.h"

namespace refhost {

// FFmpeg's muxer for the container, and the tag a video stream of the coding (FFmpeg's name of
// it, "hevc") is filed under in the container (0: the muxer's own choice). The joiner of
// pieces writes its streams as the writer does.
const char* muxerName(VideoContainer container);
uint32_t videoCodecTag(const std::string& coding, VideoContainer container);

class VideoWriter {
 public:
  // Opens the file for frames of the size at the rate, its time base exactly one frame,
  // written as the container whatever the path's name. Chroma-subsampled video needs even
  // sizes: an odd width or height is padded by repeating the last column or row. Throws
  // std::invalid_argument for settings refusalOf() refuses, std::runtime_error for the rest,
  // naming the file by `shownName` when given (the user's name for a file written under a
  // temporary one), else by the path. With audio clips, the file carries their sound too, mixed
  // when there are several (see AudioTrack).
  VideoWriter(const std::string& path, VideoContainer container, int32_t width, int32_t height,
              FrameRate frameRate, const VideoEncoding& encoding, const std::string& shownName = "",
              const std::vector<AudioClip>& audio = {});
  // Without finish() the file is closed as it is (unplayable); the caller deletes it.
  ~VideoWriter();
  VideoWriter(const VideoWriter&) = delete;
  VideoWriter& operator=(const VideoWriter&) = delete;

  // A picture of the writer's size, top row first, in either pixel format: 8-bit pictures are
  // converted from their bytes, half-float ones through 16 bits a channel, whatever the depth
  // of the video.
  void write(const RgbaImage& frame);
  // Flushes the encoder and completes the file.
  void finish();

  // The FFmpeg encoder writing the video ("libx264", "libsvtav1", ...).
  const std::string& codecName() const;
  // Empty, or something the user should know about how the video was written.
  const std::string& note() const;

 private:
  struct Encoder;
  std::unique_ptr<Encoder> encoder_;
};

}  // namespace refhost
