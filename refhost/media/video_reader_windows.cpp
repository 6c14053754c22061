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
const MediaInfo& VideoReader::info() const {
  static const MediaInfo none;
  return none;
}
std::vector<uint8_t> VideoReader::glRowsAt(double, int32_t, int32_t, PixelFormat) { return {}; }
RgbaImage VideoReader::frameAt(double, int32_t, int32_t, PixelFormat) { return {}; }

}  // namespace refhost
