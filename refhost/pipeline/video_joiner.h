// Joining the pieces of one video that were encoded apart (the chunks of a job rendered on
// several machines) into the whole video by copying their packets, as FFmpeg's concat demuxer
// does: nothing is re-encoded, and the sound of the whole video is added once.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <stdexcept>
#include <string>
#include <vector>

#include "refhost/media/audio_input.h"
#include "refhost/media/frame_rate.h"
#include "refhost/pipeline/video_encoding.h"

namespace refhost {

// What a piece's header says: the tags it was written with (see JoinablePiece; names in lower
// case) and its video stream's parameters as one text, equal for pieces that can be joined.
struct PieceHeader {
  std::map<std::string, std::string> tags;
  std::string streamParameters;
};

// Throws std::runtime_error naming the file when it cannot be read or holds no video.
PieceHeader readPieceHeader(const std::string& path);

struct PieceToJoin {
  std::string path;
  int64_t firstFrame = 0;  // its place in the whole video
  int32_t frameCount = 0;
};

struct JoinedVideo {
  std::string path;       // written here
  std::string shownName;  // what errors name it by (the user's name of a staged file)
  VideoContainer container = VideoContainer::Mp4;
  FrameRate frameRate{25, 1};
  std::vector<AudioClip> audio;  // the whole video's sound, encoded once; none: silent
};

// A piece that does not fit the others; `piece()` is its index.
class PieceMismatch : public std::runtime_error {
 public:
  PieceMismatch(std::size_t piece, const std::string& what)
      : std::runtime_error(what), piece_(piece) {}
  std::size_t piece() const { return piece_; }

 private:
  std::size_t piece_;
};

// Writes the pieces' video, in the order given, into one file with their timestamps (each
// piece's frames at its place), and the audio clip's sound beside it. Throws PieceMismatch when
// a piece's stream parameters differ from the first's, it holds other frames than its place
// says (missing, extra or out of order), its first frame is not a keyframe, or its decoding
// order would run back into the piece before it; std::runtime_error naming the output when
// writing fails.
void joinPieces(const std::vector<PieceToJoin>& pieces, const JoinedVideo& output);

}  // namespace refhost
