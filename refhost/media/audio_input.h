// One clip's sound read from its file: the audio stream's packets from the clip's start, or its
// samples decoded and cut to the clip, exactly from its first sample to its last.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

struct AVCodecContext;
struct AVCodecParameters;
struct AVFrame;
struct AVPacket;
struct AVRational;

namespace refhost {

// Which sound a render carries: the audio of `path` from `startSeconds` after the file's start
// (the start of its video, when it has one, so that sound and pictures keep the file's own
// alignment) for `seconds`, silent where the file's sound ends before. Going by time rather
// than by the file's frames keeps the sound in step with frames rendered at any rate.
struct AudioClip {
  std::string path;
  double startSeconds = 0;
  double seconds = 0;
  // The sound was asked for by name: a file without any is an error, not a silent video.
  bool required = false;
};

class AudioInput {
 public:
  // Null when the file has no audio track and the clip does not require one. Throws
  // std::runtime_error naming the file when it cannot be read, or has no sound it requires.
  static std::unique_ptr<AudioInput> open(const AudioClip& clip);
  ~AudioInput();
  AudioInput(const AudioInput&) = delete;
  AudioInput& operator=(const AudioInput&) = delete;

  const std::string& path() const;
  const AVCodecParameters* parameters() const;
  AVRational timeBase() const;
  // The clip's start and end in the stream's seconds.
  double start() const;
  double end() const;
  // Whether the file's sound lasts to the clip's end, so that its packets alone fill the clip.
  bool coversClip() const;

  // The next packet of the audio stream, or null at the end of the file. Valid until the next
  // call.
  AVPacket* nextPacket();

  // Decoded samples from here on, in the stream's own format and rate: the next run of the
  // clip's samples, counted from its start in `pts` (silence first where the file's sound
  // starts after the clip does), or null once the clip or the file has ended. Valid until the
  // next call.
  AVFrame* nextSamples();
  // The decoder of the samples (opened on first use): their format, rate and channels.
  const AVCodecContext* decoder();

  [[noreturn]] void fail(const std::string& what, int code = 0) const;

 private:
  struct State;
  explicit AudioInput(std::unique_ptr<State> state);
  std::unique_ptr<State> state_;
};

}  // namespace refhost
