// Muxing a render's sound into its video: packets copied with their times shifted to the clip,
// or the mixer's samples encoded with the first of AAC, Opus and Vorbis the container takes.
#include "refhost/media/audio_track.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
}

#include <algorithm>
#include <cmath>
#include <limits>
#include <stdexcept>

#include "refhost/media/audio_mixer.h"
#include "refhost/media/ffmpeg_utilities.h"

namespace refhost {
namespace {

double seconds(int64_t timestamp, AVRational base) {
  return static_cast<double>(timestamp) * av_q2d(base);
}

// The encoder's rate nearest the source's (AAC and Opus know fixed sets of rates).
int nearestRate(const AVCodec* encoder, int wanted) {
  if (!encoder->supported_samplerates) return wanted;
  int best = encoder->supported_samplerates[0];
  for (const int* rate = encoder->supported_samplerates; *rate; ++rate)
    if (std::abs(*rate - wanted) < std::abs(best - wanted)) best = *rate;
  return best;
}

// The encoder for sound the container cannot take as it is: AAC, the usual one, where the
// container holds it; WebM holds only Opus and Vorbis.
const AVCodec* soundEncoderFor(const AVOutputFormat* muxer) {
  for (const char* name : {"aac", "libopus", "libvorbis"}) {
    const AVCodec* codec = avcodec_find_encoder_by_name(name);
    if (codec && avformat_query_codec(muxer, codec->id, FF_COMPLIANCE_NORMAL) == 1) return codec;
  }
  return nullptr;
}

// Planar float where the encoder takes it (AAC, Vorbis), else its first sample format (Opus
// takes interleaved samples only).
AVSampleFormat sampleFormatFor(const AVCodec* encoder) {
  if (!encoder->sample_fmts) return AV_SAMPLE_FMT_FLTP;
  for (const AVSampleFormat* format = encoder->sample_fmts; *format != AV_SAMPLE_FMT_NONE; ++format)
    if (*format == AV_SAMPLE_FMT_FLTP) return *format;
  return encoder->sample_fmts[0];
}

}  // namespace

struct AudioTrack::State {
  std::string path;                   // the first clip's file, which messages name
  AVFormatContext* output = nullptr;  // the video writer's
  AVStream* target = nullptr;
  AVPacket* packet = nullptr;
  double written = 0;  // seconds of output audio handed to the muxer
  bool ended = false;

  // Stream copy: the one clip, and the shift that puts its first packet at or just after 0.
  std::unique_ptr<AudioInput> copied;
  int64_t shift = AV_NOPTS_VALUE;

  // Encoding.
  std::unique_ptr<AudioMixer> mixer;
  AVCodecContext* encoder = nullptr;
  int64_t encoded = 0;  // samples sent to the encoder

  ~State() {
    avcodec_free_context(&encoder);
    av_packet_free(&packet);
  }

  [[noreturn]] void fail(const std::string& what, int code = 0) const {
    throw std::runtime_error(path + ": cannot carry the audio: " + what +
                             (code ? " (" + avErrorText(code) + ")" : ""));
  }

  void write(AVPacket* out) {
    out->stream_index = target->index;
    const int result = av_interleaved_write_frame(output, out);
    if (result < 0) fail("writing a packet failed", result);
  }

  void openCopy(std::unique_ptr<AudioInput> input) {
    copied = std::move(input);
    if (avcodec_parameters_copy(target->codecpar, copied->parameters()) < 0) fail("codec data");
    target->codecpar->codec_tag = 0;
    target->time_base = copied->timeBase();
  }

  // The encoder for the clips' sound: the rate of the first, the channels of the one with most.
  void openEncode(std::vector<std::unique_ptr<AudioInput>> inputs, double length) {
    const AVCodec* encoding = soundEncoderFor(output->oformat);
    if (!encoding) fail(std::string("no sound encoder for a ") + output->oformat->name + " file");
    encoder = avcodec_alloc_context3(encoding);
    if (!encoder) fail("out of memory");
    const AVCodecContext* widest = inputs.front()->decoder();
    for (const auto& input : inputs)
      if (input->decoder()->ch_layout.nb_channels > widest->ch_layout.nb_channels)
        widest = input->decoder();
    encoder->sample_fmt = sampleFormatFor(encoding);
    encoder->sample_rate = nearestRate(encoding, inputs.front()->decoder()->sample_rate);
    if (av_channel_layout_copy(&encoder->ch_layout, &widest->ch_layout) < 0) fail("channel layout");
    encoder->bit_rate = 64000 * std::max(encoder->ch_layout.nb_channels, 2);
    encoder->time_base = AVRational{1, encoder->sample_rate};
    if (output->oformat->flags & AVFMT_GLOBALHEADER) encoder->flags |= AV_CODEC_FLAG_GLOBAL_HEADER;
    int result = avcodec_open2(encoder, encoding, nullptr);
    if (result < 0) fail(std::string("the ") + encoding->name + " encoder refused", result);
    if ((result = avcodec_parameters_from_context(target->codecpar, encoder)) < 0)
      fail("codec data", result);
    target->time_base = encoder->time_base;
    mixer = std::make_unique<AudioMixer>(std::move(inputs), encoder,
                                         std::llround(length * encoder->sample_rate));
  }

  void encode(AVFrame* frame) {
    int result = avcodec_send_frame(encoder, frame);
    if (result < 0) fail("encoding failed", result);
    while ((result = avcodec_receive_packet(encoder, packet)) == 0) {
      av_packet_rescale_ts(packet, encoder->time_base, target->time_base);
      write(packet);
    }
    if (result != AVERROR(EAGAIN) && result != AVERROR_EOF) fail("encoding failed", result);
  }

  void copy(AVPacket* input) {
    const AVRational base = copied->timeBase();
    const int64_t at = input->pts != AV_NOPTS_VALUE ? input->pts : input->dts;
    if (at == AV_NOPTS_VALUE) return;
    const double from = seconds(at, base);
    const double to = from + seconds(input->duration, base);
    if (to <= copied->start()) return;
    if (from >= copied->end()) {
      ended = true;
      return;
    }
    if (shift == AV_NOPTS_VALUE)
      shift = std::min(at, static_cast<int64_t>(std::llround(copied->start() / av_q2d(base))));
    if (input->pts != AV_NOPTS_VALUE) input->pts -= shift;
    if (input->dts != AV_NOPTS_VALUE) input->dts -= shift;
    written = seconds(at - shift, base);
    av_packet_rescale_ts(input, base, target->time_base);
    input->pos = -1;
    write(input);
  }

  // Writes the next packet or frame of sound; false at the end.
  bool step() {
    if (copied) {
      AVPacket* input = copied->nextPacket();
      if (!input) return false;
      copy(input);
      return true;
    }
    AVFrame* samples = mixer->next();
    if (!samples) return false;
    samples->pts = encoded;
    encoded += samples->nb_samples;
    written = static_cast<double>(encoded) / encoder->sample_rate;
    encode(samples);
    return true;
  }
};

AudioTrack::AudioTrack(std::unique_ptr<State> state) : state_(std::move(state)) {}
AudioTrack::~AudioTrack() = default;

std::unique_ptr<AudioTrack> AudioTrack::open(const std::vector<AudioClip>& clips,
                                             AVFormatContext* output) {
  std::vector<std::unique_ptr<AudioInput>> inputs;
  double length = 0;
  for (const AudioClip& clip : clips) {
    if (auto input = AudioInput::open(clip)) inputs.push_back(std::move(input));
    length = std::max(length, clip.seconds);
  }
  if (inputs.empty()) return nullptr;
  auto state = std::make_unique<State>();
  State& s = *state;
  s.path = inputs.front()->path();
  s.output = output;
  s.packet = av_packet_alloc();
  s.target = avformat_new_stream(output, nullptr);
  if (!s.packet || !s.target) s.fail("out of memory");
  const bool copies = inputs.size() == 1 && inputs.front()->coversClip() &&
                      avformat_query_codec(output->oformat, inputs.front()->parameters()->codec_id,
                                           FF_COMPLIANCE_NORMAL) == 1;
  if (copies) {
    s.openCopy(std::move(inputs.front()));
  } else {
    s.openEncode(std::move(inputs), length);
  }
  return std::unique_ptr<AudioTrack>(new AudioTrack(std::move(state)));
}

void AudioTrack::writeUntil(double seconds) {
  State& s = *state_;
  while (!s.ended && s.written < seconds) {
    if (!s.step()) s.ended = true;
  }
}

void AudioTrack::finish() {
  writeUntil(std::numeric_limits<double>::infinity());
  State& s = *state_;
  if (s.encoder) s.encode(nullptr);
}

}  // namespace refhost
