// Sound carried into a rendered video: one clip's audio over the time of the frames rendered,
// stream-copied where the output container takes its codec and the file's sound lasts the
// clip, else encoded as AAC (as Opus where the container takes no AAC, as WebM); several
// clips' mixed (see AudioMixer) and encoded.
#pragma once

#include <memory>
#include <vector>

#include "refhost/media/audio_input.h"

struct AVFormatContext;

namespace refhost {

class AudioTrack {
 public:
  // Adds the clips' sound as a stream of `output` (before its header is written). Null when
  // none of the files has an audio track and none requires one. Throws std::runtime_error
  // naming the file when one has sound that cannot be carried, or none that is required.
  static std::unique_ptr<AudioTrack> open(const std::vector<AudioClip>& clips,
                                          AVFormatContext* output);
  ~AudioTrack();
  AudioTrack(const AudioTrack&) = delete;
  AudioTrack& operator=(const AudioTrack&) = delete;

  // Writes the audio up to `seconds` of the output (interleaved by the muxer with the video).
  void writeUntil(double seconds);
  // Writes the rest of the sound, the encoder's last packets included.
  void finish();

 private:
  struct State;
  explicit AudioTrack(std::unique_ptr<State> state);
  std::unique_ptr<State> state_;
};

}  // namespace refhost
