// The Windows host writes no video (see video_reader_windows.cpp): opening a video output fails
// with the same message as opening a video file.
#include "refhost/pipeline/video_writer.h"

namespace refhost {

[[noreturn]] void videoUnavailable(const std::string& path);

// Without FFmpeg there is no muxer to ask. Saying yes lets a video output reach the writer,
// whose message says why there is no video at all.
bool containerHolds(VideoContainer, const std::string&) { return true; }

struct VideoWriter::Encoder {};

VideoWriter::VideoWriter(const std::string& path, VideoContainer, int32_t, int32_t, double,
                         const VideoEncoding&, const std::string&, const AudioClip&) {
  videoUnavailable(path);
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
