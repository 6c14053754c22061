// The Windows host writes no video: FFmpeg's libraries are not built for Windows. Opening a
// video output fails with a message that says so.
#include <stdexcept>

#include "refhost/pipeline/video_writer.h"

namespace refhost {

// Without FFmpeg there is no muxer to ask. Saying yes lets a video output reach the writer,
// whose message says why there is no video at all.
bool containerHolds(VideoContainer, const std::string&) { return true; }

struct VideoWriter::Encoder {};

VideoWriter::VideoWriter(const std::string& path, VideoContainer, int32_t, int32_t, FrameRate,
                         const VideoEncoding&, const std::string&, const std::vector<AudioClip>&) {
  throw std::runtime_error(path +
                           ": video files need FFmpeg's libraries, which the Windows build "
                           "leaves out (use a still image or a PNG sequence)");
}
VideoWriter::~VideoWriter() = default;
void VideoWriter::write(const RgbaImage&) {}
void VideoWriter::finish() {}
const std::string& VideoWriter::codecName() const {
  static const std::string none;
  return none;
}
const std::string& VideoWriter::note() const { return codecName(); }

}  // namespace refhost
