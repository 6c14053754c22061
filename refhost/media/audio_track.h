// The sound of a video source carried into a rendered video: the audio of the frames rendered,
// stream-copied where the output container takes its codec, else encoded as AAC.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

struct AVFormatContext;

namespace refhost {

// Which sound a render carries: the audio of `path` from the moment its frame `firstFrame` is
// shown (at the file's own frame rate), lasting `frameCount` frames of the output at
// `frameRate`. An empty path carries none.
struct AudioClip {
  std::string path;
  int32_t firstFrame = 0;
  int32_t frameCount = 0;
  double frameRate = 25.0;
};

class AudioTrack {
 public:
  // Adds the clip's audio as a stream of `output` (before its header is written). Null when the
  // file has no audio track. Throws std::runtime_error naming the file when it has one that
  // cannot be carried.
  static std::unique_ptr<AudioTrack> open(const AudioClip& clip, AVFormatContext* output);
  ~AudioTrack();
  AudioTrack(const AudioTrack&) = delete;
  AudioTrack& operator=(const AudioTrack&) = delete;

  // Writes the audio up to `seconds` of the output (interleaved by the muxer with the video).
  void writeUntil(double seconds);
  // Writes the rest of the clip, the encoder's last packets included.
  void finish();

 private:
  struct State;
  explicit AudioTrack(std::unique_ptr<State> state);
  std::unique_ptr<State> state_;
};

}  // namespace refhost
