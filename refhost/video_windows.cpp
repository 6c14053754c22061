// The Windows host has no video: FFmpeg's libraries are not built for Windows. Opening a video
// file or a video output fails with a message that says so; the rest of the host is unchanged.
#include <stdexcept>

#include "refhost/video_reader.h"
#include "refhost/video_writer.h"

namespace refhost {
namespace {

[[noreturn]] void unavailable(const std::string& path) {
  throw std::runtime_error(path +
                           ": video files need FFmpeg's libraries, which the Windows build "
                           "leaves out (use a still image or a PNG sequence)");
}

}  // namespace

struct VideoReader::Decoder {};
struct VideoWriter::Encoder {};

VideoReader::VideoReader(const std::string& path) { unavailable(path); }
VideoReader::~VideoReader() = default;
int32_t VideoReader::width() const { return 0; }
int32_t VideoReader::height() const { return 0; }
double VideoReader::frameRate() const { return 0; }
int32_t VideoReader::frameCount() const { return 0; }
RgbaImage VideoReader::frame(int32_t, int32_t, int32_t) { return {}; }
std::vector<uint8_t> VideoReader::glRows(int32_t, int32_t, int32_t) { return {}; }

VideoWriter::VideoWriter(const std::string& path, VideoContainer, int32_t, int32_t, double,
                         const std::string&, const AudioClip&) {
  unavailable(path);
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
