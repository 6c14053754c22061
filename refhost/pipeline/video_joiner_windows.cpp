// The Windows host reads and writes no video (see video_reader_windows.cpp): there are no
// pieces to read or join, and saying so is the same message as for any video file.
#include "refhost/pipeline/video_joiner.h"

namespace refhost {

[[noreturn]] void videoUnavailable(const std::string& path);

PieceHeader readPieceHeader(const std::string& path) { videoUnavailable(path); }

void joinPieces(const std::vector<PieceToJoin>&, const JoinedVideo& output) {
  videoUnavailable(output.shownName);
}

}  // namespace refhost
