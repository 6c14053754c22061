// Demuxing a file's audio over a clip's time, and decoding it cut to the sample.
#include "refhost/media/audio_input.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/samplefmt.h>
}

#include <algorithm>
#include <cmath>
#include <limits>
#include <stdexcept>

#include "refhost/media/ffmpeg_utilities.h"

namespace refhost {
namespace {

double seconds(int64_t timestamp, AVRational base) {
  return static_cast<double>(timestamp) * av_q2d(base);
}

}  // namespace

struct AudioInput::State {
  std::string path;
  AVFormatContext* input = nullptr;
  AVStream* source = nullptr;
  AVPacket* packet = nullptr;
  double start = 0, end = 0;  // the clip in the source's seconds

  AVCodecContext* decoder = nullptr;
  AVFrame* decoded = nullptr;
  AVFrame* samples = nullptr;                            // what nextSamples hands out
  int64_t cursor = std::numeric_limits<int64_t>::min();  // next sample from the clip's start
  int64_t total = 0;                                     // samples the clip lasts
  bool pending = false;  // `decoded` holds a frame not handed out yet
  bool draining = false;
  bool ended = false;

  ~State() {
    av_frame_free(&samples);
    av_frame_free(&decoded);
    avcodec_free_context(&decoder);
    av_packet_free(&packet);
    avformat_close_input(&input);
  }

  [[noreturn]] void fail(const std::string& what, int code = 0) const {
    throw std::runtime_error(path + ": cannot carry the audio: " + what +
                             (code ? " (" + avErrorText(code) + ")" : ""));
  }

  void check(int result, const char* what) const {
    if (result < 0) fail(what, result);
  }

  // The clip's span in the source's timestamps: from its start, which is where the video
  // shows its first frame when there is a video (as the video reader counts), else where the
  // file starts.
  void findClip(const AudioClip& clip) {
    const int video = av_find_best_stream(input, AVMEDIA_TYPE_VIDEO, -1, -1, nullptr, 0);
    double origin = 0;
    if (video >= 0 && input->streams[video]->start_time != AV_NOPTS_VALUE) {
      origin = seconds(input->streams[video]->start_time, input->streams[video]->time_base);
    } else if (input->start_time != AV_NOPTS_VALUE) {
      origin = seconds(input->start_time, AV_TIME_BASE_Q);
    }
    start = origin + clip.startSeconds;
    end = start + std::max(clip.seconds, 0.0);
  }

  void openDecoder() {
    const AVCodec* decoding = avcodec_find_decoder(source->codecpar->codec_id);
    if (!decoding)
      fail(std::string("no decoder for ") + avcodec_get_name(source->codecpar->codec_id));
    decoder = avcodec_alloc_context3(decoding);
    decoded = av_frame_alloc();
    samples = av_frame_alloc();
    if (!decoder || !decoded || !samples) fail("out of memory");
    check(avcodec_parameters_to_context(decoder, source->codecpar), "codec data");
    decoder->pkt_timebase = source->time_base;
    check(avcodec_open2(decoder, decoding, nullptr), "the decoder refused");
    if (decoder->ch_layout.order == AV_CHANNEL_ORDER_UNSPEC)
      av_channel_layout_default(&decoder->ch_layout, decoder->ch_layout.nb_channels);
    total = std::llround((end - start) * decoder->sample_rate);
  }

  // `count` samples of `frame` from `first` on into `samples`, or silence where `frame` is null.
  AVFrame* handOut(const AVFrame* frame, int64_t first, int64_t count) {
    av_frame_unref(samples);
    samples->format = decoder->sample_fmt;
    samples->sample_rate = decoder->sample_rate;
    samples->nb_samples = static_cast<int>(count);
    check(av_channel_layout_copy(&samples->ch_layout, &decoder->ch_layout), "channel layout");
    check(av_frame_get_buffer(samples, 0), "out of memory");
    const int channels = decoder->ch_layout.nb_channels;
    if (frame) {
      av_samples_copy(samples->extended_data, frame->extended_data, 0, static_cast<int>(first),
                      static_cast<int>(count), channels, decoder->sample_fmt);
    } else {
      av_samples_set_silence(samples->extended_data, 0, static_cast<int>(count), channels,
                             decoder->sample_fmt);
    }
    samples->pts = std::max<int64_t>(cursor, 0);
    return samples;
  }

  // The part of a decoded frame inside the clip, or silence before it for a sound that starts
  // after the clip does; null when nothing of it is inside.
  AVFrame* keep(const AVFrame* frame) {
    if (cursor == std::numeric_limits<int64_t>::min()) {
      int64_t pts = frame->best_effort_timestamp != AV_NOPTS_VALUE ? frame->best_effort_timestamp
                                                                   : frame->pts;
      cursor = pts == AV_NOPTS_VALUE
                   ? 0
                   : std::llround((seconds(pts, source->time_base) - start) * decoder->sample_rate);
      if (cursor > 0) {
        const int64_t silence = std::min(cursor, total);
        cursor = 0;
        AVFrame* lead = handOut(nullptr, 0, silence);
        cursor = silence;
        // The decoded frame follows on the next call.
        pending = true;
        return lead;
      }
    }
    const int64_t first = std::max<int64_t>(0, -cursor);
    const int64_t last = std::min<int64_t>(frame->nb_samples, total - cursor);
    AVFrame* kept = last > first ? handOut(frame, first, last - first) : nullptr;
    cursor += frame->nb_samples;
    if (cursor >= total) ended = true;
    return kept;
  }

  AVFrame* next() {
    while (!ended) {
      if (pending) {
        pending = false;
        AVFrame* kept = keep(decoded);
        if (!pending) av_frame_unref(decoded);  // else it follows the silence before it
        if (kept) return kept;
        continue;
      }
      const int result = avcodec_receive_frame(decoder, decoded);
      if (result == 0) {
        pending = true;
        continue;
      }
      if (result == AVERROR_EOF) break;
      // A damaged packet of sound is skipped, as players skip it; the sound goes on after it.
      if (result == AVERROR(ENOMEM)) fail("out of memory", result);
      if (result != AVERROR(EAGAIN)) continue;
      if (draining) break;
      const int read = av_read_frame(input, packet);
      if (read == AVERROR_EOF) {
        draining = true;
        avcodec_send_packet(decoder, nullptr);
        continue;
      }
      check(read, "reading the file failed");
      if (packet->stream_index == source->index &&
          avcodec_send_packet(decoder, packet) == AVERROR(ENOMEM))
        fail("out of memory", AVERROR(ENOMEM));
      av_packet_unref(packet);
    }
    ended = true;
    return nullptr;
  }
};

AudioInput::AudioInput(std::unique_ptr<State> state) : state_(std::move(state)) {}
AudioInput::~AudioInput() = default;

std::unique_ptr<AudioInput> AudioInput::open(const AudioClip& clip) {
  auto state = std::make_unique<State>();
  State& s = *state;
  s.path = clip.path;
  s.check(avformat_open_input(&s.input, clip.path.c_str(), nullptr, nullptr),
          "cannot open the file");
  s.check(avformat_find_stream_info(s.input, nullptr), "no stream info");
  const int index = av_find_best_stream(s.input, AVMEDIA_TYPE_AUDIO, -1, -1, nullptr, 0);
  if (index < 0 && clip.required) s.fail("it has no sound");
  if (index < 0) return nullptr;
  s.source = s.input->streams[index];
  // Only the sound is read from here on.
  for (unsigned i = 0; i < s.input->nb_streams; ++i)
    if (static_cast<int>(i) != index) s.input->streams[i]->discard = AVDISCARD_ALL;
  s.findClip(clip);
  s.packet = av_packet_alloc();
  if (!s.packet) s.fail("out of memory");
  const int64_t target = std::llround(s.start / av_q2d(s.source->time_base));
  if (s.start > 0)
    s.check(av_seek_frame(s.input, index, target, AVSEEK_FLAG_BACKWARD), "seeking failed");
  return std::unique_ptr<AudioInput>(new AudioInput(std::move(state)));
}

const std::string& AudioInput::path() const { return state_->path; }
const AVCodecParameters* AudioInput::parameters() const { return state_->source->codecpar; }
AVRational AudioInput::timeBase() const { return state_->source->time_base; }
double AudioInput::start() const { return state_->start; }
double AudioInput::end() const { return state_->end; }

bool AudioInput::coversClip() const {
  const AVStream* source = state_->source;
  double last = 0;
  if (source->duration != AV_NOPTS_VALUE) {
    const int64_t first = source->start_time != AV_NOPTS_VALUE ? source->start_time : 0;
    last = seconds(first + source->duration, source->time_base);
  } else if (state_->input->duration != AV_NOPTS_VALUE) {
    last = seconds(state_->input->duration, AV_TIME_BASE_Q);
  }
  // Within a packet of audio (some 20 ms): the copy ends on whole packets anyway.
  return last + 0.03 >= state_->end;
}

AVPacket* AudioInput::nextPacket() {
  State& s = *state_;
  for (;;) {
    av_packet_unref(s.packet);
    const int result = av_read_frame(s.input, s.packet);
    if (result == AVERROR_EOF) return nullptr;
    s.check(result, "reading the file failed");
    if (s.packet->stream_index == s.source->index) return s.packet;
  }
}

AVFrame* AudioInput::nextSamples() {
  if (!state_->decoder) state_->openDecoder();
  return state_->next();
}

const AVCodecContext* AudioInput::decoder() {
  if (!state_->decoder) state_->openDecoder();
  return state_->decoder;
}

void AudioInput::fail(const std::string& what, int code) const { state_->fail(what, code); }

}  // namespace refhost
