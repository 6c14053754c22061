// The sound of one or more clips as an encoder takes it, through FFmpeg's filters: each clip
// resampled (aresample) to the encoder's rate, format and channels, several mixed by amix (each
// at 1/n of its level, so the sum cannot clip, n counting the clips still sounding), and the
// whole padded with silence to the output's length and cut there, in the encoder's frames.
#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "refhost/media/audio_input.h"

struct AVCodecContext;
struct AVFrame;

namespace refhost {

class AudioMixer {
 public:
  // For an opened encoder; `totalSamples` at its rate is the length of the output's sound.
  // Throws std::runtime_error naming the first clip's file when the filters refuse.
  AudioMixer(std::vector<std::unique_ptr<AudioInput>> inputs, const AVCodecContext* encoder,
             int64_t totalSamples);
  ~AudioMixer();
  AudioMixer(const AudioMixer&) = delete;
  AudioMixer& operator=(const AudioMixer&) = delete;

  // The next frame of samples for the encoder, or null after the last. Valid until the next
  // call.
  AVFrame* next();

 private:
  struct Graph;
  std::unique_ptr<Graph> graph_;
};

}  // namespace refhost
