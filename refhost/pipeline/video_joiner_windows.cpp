// The Windows host reads and writes no video (see video_writer_windows.cpp): there are no
// pieces to read or join, and saying so is the same message as for any video file.
#include <stdexcept>

#include "refhost/pipeline/video_joiner.h"

namespace refhost {
namespace {

[[noreturn]] void videoUnavailable(const std::string& path) {
  throw std::runtime_error(path +
                           ": video files need FFmpeg's libraries, which the Windows build "
                           "leaves out (use a still image or a PNG sequence)");
}

}  // namespace

PieceHeader readPieceHeader(const std::string& path) { videoUnavailable(path); }

void joinPieces(const std::vector<PieceToJoin>&, const JoinedVideo& output) {
  videoUnavailable(output.shownName);
}

}  // namespace refhost
