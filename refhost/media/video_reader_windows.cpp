// The Windows host has no video: FFmpeg's libraries are not built for Windows. Opening a video
// file fails with a message that says so; the rest of the host is unchanged.
#include <stdexcept>

#include "refhost/media/video_reader.h"

namespace refhost {

[[noreturn]] void videoUnavailable(const std::string& path) {
  throw std::runtime_error(path +
                           ": video files need FFmpeg's libraries, which the Windows build "
                           "leaves out (use a still image or a PNG sequence)");
}

struct VideoReader::Decoder {};

VideoReader::VideoReader(const std::string& path) { videoUnavailable(path); }
VideoReader::~VideoReader() = default;
int32_t VideoReader::width() const { return 0; }
int32_t VideoReader::height() const { return 0; }
double VideoReader::frameRate() const { return 0; }
int32_t VideoReader::frameCount() const { return 0; }
RgbaImage VideoReader::frame(int32_t, int32_t, int32_t) { return {}; }
std::vector<uint8_t> VideoReader::glRows(int32_t, int32_t, int32_t) { return {}; }

}  // namespace refhost
