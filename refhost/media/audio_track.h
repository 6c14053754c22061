// Sound carried into a rendered video: the audio of a file over the time of the frames
// rendered, stream-copied where the output container takes its codec, else encoded as AAC (as
// Opus where the container takes no AAC, as WebM).
#pragma once

#include <cstdint>
#include <memory>
#include <string>

struct AVFormatContext;

namespace refhost {

// Which sound a render carries: the audio of `path` from `startSeconds` after the file's start
// (the start of its video, when it has one, so that sound and pictures keep the file's own
// alignment) for `seconds`. Going by time rather than by the file's frames keeps the sound in
// step with frames rendered at any rate. An empty path carries none.
struct AudioClip {
  std::string path;
  double startSeconds = 0;
  double seconds = 0;
  // The sound was asked for by name: a file without any is an error, not a silent video.
  bool required = false;
};

class AudioTrack {
 public:
  // Adds the clip's audio as a stream of `output` (before its header is written). Null when the
  // file has no audio track and the clip does not require one. Throws std::runtime_error
  // naming the file when it has one that cannot be carried, or none that is required.
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
