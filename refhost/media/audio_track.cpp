// Demuxing a file's audio over the rendered frames' time and muxing it into the output: packets
// as they are when the container takes the codec, else decoded, cut to the sample and encoded
// with the first of AAC, Opus and Vorbis the container takes.
#include "refhost/media/audio_track.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/audio_fifo.h>
#include <libavutil/samplefmt.h>
#include <libswresample/swresample.h>
}

#include <algorithm>
#include <cmath>
#include <limits>
#include <stdexcept>
#include <vector>

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
  std::string path;
  AVFormatContext* input = nullptr;
  AVFormatContext* output = nullptr;  // the video writer's
  AVStream* source = nullptr;
  AVStream* target = nullptr;
  AVPacket* packet = nullptr;
  double start = 0, end = 0;  // the clip in the source's seconds
  double written = 0;         // seconds of output audio handed to the muxer
  bool ended = false;

  // Stream copy: the shift that puts the clip's first packet at or just after 0.
  int64_t shift = AV_NOPTS_VALUE;

  // Encoding.
  AVCodecContext* decoder = nullptr;
  AVCodecContext* encoder = nullptr;
  SwrContext* resampler = nullptr;
  AVAudioFifo* fifo = nullptr;
  AVFrame* decoded = nullptr;
  AVFrame* chunk = nullptr;
  int64_t cursor = std::numeric_limits<int64_t>::min();  // next sample from the clip's start
  int64_t total = 0;                                     // samples the clip lasts
  int64_t encoded = 0;                                   // samples sent to the encoder

  ~State() {
    av_frame_free(&chunk);
    av_frame_free(&decoded);
    if (fifo) av_audio_fifo_free(fifo);
    swr_free(&resampler);
    avcodec_free_context(&encoder);
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

  void write(AVPacket* out) {
    out->stream_index = target->index;
    check(av_interleaved_write_frame(output, out), "writing a packet failed");
  }

  void openCopy() {
    check(avcodec_parameters_copy(target->codecpar, source->codecpar), "codec data");
    target->codecpar->codec_tag = 0;
    target->time_base = source->time_base;
  }

  void openEncode() {
    const AVCodec* decoding = avcodec_find_decoder(source->codecpar->codec_id);
    const AVCodec* encoding = soundEncoderFor(output->oformat);
    if (!decoding)
      fail(std::string("no decoder for ") + avcodec_get_name(source->codecpar->codec_id));
    if (!encoding) fail(std::string("no sound encoder for a ") + output->oformat->name + " file");
    decoder = avcodec_alloc_context3(decoding);
    encoder = avcodec_alloc_context3(encoding);
    decoded = av_frame_alloc();
    chunk = av_frame_alloc();
    if (!decoder || !encoder || !decoded || !chunk) fail("out of memory");
    check(avcodec_parameters_to_context(decoder, source->codecpar), "codec data");
    decoder->pkt_timebase = source->time_base;
    check(avcodec_open2(decoder, decoding, nullptr), "the decoder refused");

    encoder->sample_fmt = sampleFormatFor(encoding);
    encoder->sample_rate = nearestRate(encoding, decoder->sample_rate);
    if (decoder->ch_layout.order == AV_CHANNEL_ORDER_UNSPEC) {
      av_channel_layout_default(&encoder->ch_layout, decoder->ch_layout.nb_channels);
    } else {
      check(av_channel_layout_copy(&encoder->ch_layout, &decoder->ch_layout), "channel layout");
    }
    encoder->bit_rate = 64000 * std::max(encoder->ch_layout.nb_channels, 2);
    encoder->time_base = AVRational{1, encoder->sample_rate};
    if (output->oformat->flags & AVFMT_GLOBALHEADER) encoder->flags |= AV_CODEC_FLAG_GLOBAL_HEADER;
    check(avcodec_open2(encoder, encoding, nullptr),
          (std::string("the ") + encoding->name + " encoder refused").c_str());
    check(avcodec_parameters_from_context(target->codecpar, encoder), "codec data");
    target->time_base = encoder->time_base;

    AVChannelLayout* in = decoder->ch_layout.order == AV_CHANNEL_ORDER_UNSPEC ? &encoder->ch_layout
                                                                              : &decoder->ch_layout;
    check(swr_alloc_set_opts2(&resampler, &encoder->ch_layout, encoder->sample_fmt,
                              encoder->sample_rate, in, decoder->sample_fmt, decoder->sample_rate,
                              0, nullptr),
          "no conversion for the encoder");
    check(swr_init(resampler), "no conversion for the encoder");
    fifo = av_audio_fifo_alloc(encoder->sample_fmt, encoder->ch_layout.nb_channels, 4096);
    if (!fifo) fail("out of memory");
    total = std::llround((end - start) * encoder->sample_rate);
  }

  // Sends the samples waiting, whole encoder frames only unless `all`.
  void encodeWaiting(bool all) {
    const int size = encoder->frame_size > 0 ? encoder->frame_size : 1024;
    while (av_audio_fifo_size(fifo) >= size || (all && av_audio_fifo_size(fifo) > 0)) {
      av_frame_unref(chunk);
      chunk->nb_samples = std::min(size, av_audio_fifo_size(fifo));
      chunk->format = encoder->sample_fmt;
      chunk->sample_rate = encoder->sample_rate;
      check(av_channel_layout_copy(&chunk->ch_layout, &encoder->ch_layout), "channel layout");
      check(av_frame_get_buffer(chunk, 0), "out of memory");
      av_audio_fifo_read(fifo, reinterpret_cast<void**>(chunk->data), chunk->nb_samples);
      chunk->pts = encoded;
      encoded += chunk->nb_samples;
      encode(chunk);
    }
  }

  void encode(AVFrame* frame) {
    check(avcodec_send_frame(encoder, frame), "encoding failed");
    int result;
    while ((result = avcodec_receive_packet(encoder, packet)) == 0) {
      av_packet_rescale_ts(packet, encoder->time_base, target->time_base);
      write(packet);
    }
    if (result != AVERROR(EAGAIN) && result != AVERROR_EOF) fail("encoding failed", result);
  }

  void padSilence(int64_t samples) {
    const int channels = encoder->ch_layout.nb_channels;
    uint8_t** data = nullptr;
    check(av_samples_alloc_array_and_samples(&data, nullptr, channels, static_cast<int>(samples),
                                             encoder->sample_fmt, 0),
          "out of memory");
    av_samples_set_silence(data, 0, static_cast<int>(samples), channels, encoder->sample_fmt);
    av_audio_fifo_write(fifo, reinterpret_cast<void**>(data), static_cast<int>(samples));
    av_freep(&data[0]);
    av_freep(&data);
  }

  // Converts a decoded frame and keeps the part of it inside the clip.
  void keep(AVFrame* frame) {
    if (cursor == std::numeric_limits<int64_t>::min()) {
      int64_t pts = frame->best_effort_timestamp != AV_NOPTS_VALUE ? frame->best_effort_timestamp
                                                                   : frame->pts;
      cursor = pts == AV_NOPTS_VALUE
                   ? 0
                   : std::llround((seconds(pts, source->time_base) - start) * encoder->sample_rate);
      // A track that starts after the clip does begins with silence, so it stays in sync.
      if (cursor > 0) padSilence(std::min(cursor, total));
    }
    const int room = swr_get_out_samples(resampler, frame->nb_samples);
    AVFrame* converted = av_frame_alloc();
    converted->format = encoder->sample_fmt;
    converted->sample_rate = encoder->sample_rate;
    converted->nb_samples = room;
    av_channel_layout_copy(&converted->ch_layout, &encoder->ch_layout);
    int result = av_frame_get_buffer(converted, 0);
    if (result >= 0)
      result = swr_convert(resampler, converted->data, room,
                           const_cast<const uint8_t**>(frame->extended_data), frame->nb_samples);
    if (result < 0) {
      av_frame_free(&converted);
      fail("converting the samples failed", result);
    }
    const int64_t first = std::max<int64_t>(0, -cursor);
    const int64_t last = std::min<int64_t>(result, total - cursor);
    if (last > first) {
      // A plane a channel, or one plane of every channel's samples in turn.
      const bool planar = av_sample_fmt_is_planar(encoder->sample_fmt);
      const int channels = encoder->ch_layout.nb_channels;
      std::vector<void*> planes(static_cast<std::size_t>(planar ? channels : 1));
      const int64_t bytes = av_get_bytes_per_sample(encoder->sample_fmt) *
                            static_cast<int64_t>(planar ? 1 : channels);
      for (std::size_t c = 0; c < planes.size(); ++c)
        planes[c] = converted->extended_data[c] + first * bytes;
      av_audio_fifo_write(fifo, planes.data(), static_cast<int>(last - first));
    }
    cursor += result;
    av_frame_free(&converted);
    written = static_cast<double>(std::max<int64_t>(cursor, 0)) / encoder->sample_rate;
    if (cursor >= total) ended = true;
    encodeWaiting(false);
  }

  void decode(AVPacket* input) {
    if (ended) return;
    check(avcodec_send_packet(decoder, input), "decoding failed");
    int result;
    while (!ended && (result = avcodec_receive_frame(decoder, decoded)) == 0) {
      keep(decoded);
      av_frame_unref(decoded);
    }
    if (!ended && result != AVERROR(EAGAIN) && result != AVERROR_EOF)
      fail("decoding failed", result);
  }

  void copy(AVPacket* input) {
    const int64_t at = input->pts != AV_NOPTS_VALUE ? input->pts : input->dts;
    if (at == AV_NOPTS_VALUE) return;
    const double from = seconds(at, source->time_base);
    const double to = from + seconds(input->duration, source->time_base);
    if (to <= start) return;
    if (from >= end) {
      ended = true;
      return;
    }
    if (shift == AV_NOPTS_VALUE) {
      shift = std::min(at, static_cast<int64_t>(std::llround(start / av_q2d(source->time_base))));
    }
    if (input->pts != AV_NOPTS_VALUE) input->pts -= shift;
    if (input->dts != AV_NOPTS_VALUE) input->dts -= shift;
    written = seconds(at - shift, source->time_base);
    av_packet_rescale_ts(input, source->time_base, target->time_base);
    input->pos = -1;
    write(input);
  }

  // Handles the next packet of the audio stream; false at the end of the file.
  bool step() {
    int result = av_read_frame(input, packet);
    if (result == AVERROR_EOF) {
      if (decoder) decode(nullptr);
      return false;
    }
    check(result, "reading the file failed");
    if (packet->stream_index == source->index) {
      if (decoder) {
        decode(packet);
      } else {
        copy(packet);
      }
    }
    av_packet_unref(packet);
    return true;
  }
};

AudioTrack::AudioTrack(std::unique_ptr<State> state) : state_(std::move(state)) {}
AudioTrack::~AudioTrack() = default;

std::unique_ptr<AudioTrack> AudioTrack::open(const AudioClip& clip, AVFormatContext* output) {
  auto state = std::make_unique<State>();
  State& s = *state;
  s.path = clip.path;
  s.output = output;
  s.check(avformat_open_input(&s.input, clip.path.c_str(), nullptr, nullptr),
          "cannot open the file");
  s.check(avformat_find_stream_info(s.input, nullptr), "no stream info");
  const int index = av_find_best_stream(s.input, AVMEDIA_TYPE_AUDIO, -1, -1, nullptr, 0);
  if (index < 0 && clip.required) s.fail("it has no sound");
  if (index < 0) return nullptr;
  s.source = s.input->streams[index];
  s.findClip(clip);
  s.packet = av_packet_alloc();
  s.target = avformat_new_stream(output, nullptr);
  if (!s.packet || !s.target) s.fail("out of memory");
  const bool copies = avformat_query_codec(output->oformat, s.source->codecpar->codec_id,
                                           FF_COMPLIANCE_NORMAL) == 1;
  if (copies) {
    s.openCopy();
  } else {
    s.openEncode();
  }
  const int64_t target = std::llround(s.start / av_q2d(s.source->time_base));
  if (s.start > 0)
    s.check(av_seek_frame(s.input, index, target, AVSEEK_FLAG_BACKWARD), "seeking failed");
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
  if (!s.encoder) return;
  s.encodeWaiting(true);
  s.encode(nullptr);
}

}  // namespace refhost
