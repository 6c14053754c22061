// The Windows host writes no video (see video_reader_windows.cpp): opening a video output fails
// with the same message as opening a video file.
#include "refhost/pipeline/video_writer.h"

namespace refhost {

[[noreturn]] void videoUnavailable(const std::string& path);

struct VideoWriter::Encoder {};

VideoWriter::VideoWriter(const std::string& path, VideoContainer, int32_t, int32_t, double,
                         const std::string&, const AudioClip&) {
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
