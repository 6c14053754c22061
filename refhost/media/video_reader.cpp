// FFmpeg demuxing, decoding and seeking for VideoReader: frames chosen by their presentation
// time, damaged ones counted and concealed, and handed to the conversion at the stream's
// colour, depth and display size.
#include "refhost/media/video_reader.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/imgutils.h>
#include <libavutil/pixdesc.h>
}

#include <algorithm>
#include <cmath>
#include <stdexcept>
#include <thread>
#include <vector>

#include "refhost/media/ffmpeg_utilities.h"
#include "refhost/media/frame_conversion.h"
#include "refhost/media/stream_colour.h"
#include "refhost/media/stream_orientation.h"

namespace refhost {
namespace {

// Asking for a frame at most this far ahead of the last one decodes on instead of seeking.
constexpr int32_t kDecodeAheadLimit = 48;

// What the decoder says of a picture it could not decode whole.
std::string damageOf(int flags) {
  std::string found;
  auto add = [&](const char* what) { found += (found.empty() ? "" : ", ") + std::string(what); };
  if (flags & FF_DECODE_ERROR_INVALID_BITSTREAM) add("invalid data");
  if (flags & FF_DECODE_ERROR_MISSING_REFERENCE) add("a missing reference frame");
  if (flags & FF_DECODE_ERROR_DECODE_SLICES) add("slices that did not decode");
  if (flags & FF_DECODE_ERROR_CONCEALMENT_ACTIVE) add("errors the decoder concealed");
  return found.empty() ? "damaged data" : found;
}

}  // namespace

struct VideoReader::Decoder {
  std::string path;
  std::shared_ptr<DamagedFrames> damage;
  AVFormatContext* format = nullptr;
  AVCodecContext* codec = nullptr;
  AVPacket* packet = nullptr;
  AVFrame* decoded = nullptr;  // scratch for avcodec_receive_frame
  AVFrame* current = nullptr;  // the frame shown
  AVFrame* next = nullptr;     // a frame decoded past the one asked for, held back for later
  int stream = -1;
  AVRational timeBase{1, 25};
  // Every frame's presentation time in the stream's time base, in presentation order.
  std::vector<int64_t> times;
  int32_t currentIndex = -1;    // index of `current`; -1 when none since the last seek
  int32_t nextIndex = -1;       // index of `next`; -1 when it holds none
  int32_t firstSinceSeek = -1;  // index of the first frame decoded since the last seek
  int32_t lastDecoded = -1;     // the latest frame decoded since the last seek
  Orientation orientation;
  std::unique_ptr<FrameConverter> converter;  // made once the stream's colour is known
  MediaInfo info;
  bool draining = false;  // the demuxer ran out and the decoder was told so
  bool ended = false;     // the decoder gave everything it had

  ~Decoder() {
    av_frame_free(&next);
    av_frame_free(&current);
    av_frame_free(&decoded);
    av_packet_free(&packet);
    avcodec_free_context(&codec);
    avformat_close_input(&format);
  }

  // The library's own words for what went wrong, after the code's text when there is one.
  static std::string reasonFor(int code) {
    std::string reason = code ? avErrorText(code) : "";
    const std::string detail = lastLibraryError();
    if (!detail.empty()) reason += (reason.empty() ? "" : ": ") + detail;
    return reason;
  }

  [[noreturn]] void fail(const std::string& what, int code = 0) const {
    const std::string reason = reasonFor(code);
    throw std::runtime_error(path + ": cannot decode video: " + what +
                             (reason.empty() ? "" : " (" + reason + ")"));
  }

  void damaged(int32_t frame, const std::string& reason) const {
    if (damage) damage->record(frame, reason);
  }

  void open() {
    int result = avformat_open_input(&format, path.c_str(), nullptr, nullptr);
    if (result < 0) fail("cannot open the file", result);
    if ((result = avformat_find_stream_info(format, nullptr)) < 0) fail("no stream info", result);
    const AVCodec* decoderCodec = nullptr;
    stream = av_find_best_stream(format, AVMEDIA_TYPE_VIDEO, -1, -1, &decoderCodec, 0);
    if (stream < 0 || !decoderCodec) fail("no video stream with a decoder");
    AVStream* video = format->streams[stream];
    codec = avcodec_alloc_context3(decoderCodec);
    if (!codec || avcodec_parameters_to_context(codec, video->codecpar) < 0) fail("bad codec data");

    info.colour = colourOf(codec);
    const std::string refusal = colourRefusal(info.colour);
    if (!refusal.empty()) throw std::runtime_error(path + ": " + refusal);

    // Threads as the machine has cores, so that decoding keeps up with the render instead of
    // running on the caller's thread alone: slice threads (wavefronts in HEVC), which hold no
    // extra pictures. Frame threads would hand each picture out before its decoder knew whether
    // it had to conceal damage in it (the picture's error flags never reach the caller), and
    // damaged frames are counted by those flags.
    const int decodedBytes =
        av_image_get_buffer_size(codec->pix_fmt, codec->width, codec->height, 1);
    constexpr int kSmallPictureUpTo = 8 << 20;
    codec->thread_count =
        decodedBytes > 0 && decodedBytes <= kSmallPictureUpTo
            ? static_cast<int>(std::min(std::thread::hardware_concurrency() + 1, 5u))
            : 0;
    codec->thread_type = FF_THREAD_SLICE;
    if ((result = avcodec_open2(codec, decoderCodec, nullptr)) < 0) fail("decoder refused", result);
    packet = av_packet_alloc();
    decoded = av_frame_alloc();
    current = av_frame_alloc();
    next = av_frame_alloc();
    if (!packet || !decoded || !current || !next) fail("out of memory");
    timeBase = video->time_base;
    if (timeBase.num <= 0 || timeBase.den <= 0) fail("the stream has no time base");
    info.video = true;
    info.hasAudio = av_find_best_stream(format, AVMEDIA_TYPE_AUDIO, -1, -1, nullptr, 0) >= 0;
    const AVRational nominal = av_guess_frame_rate(format, video, nullptr);
    info.frameRate = snappedToCommonRate({nominal.num, nominal.den});
    // Only the picture is read from here on; the demuxer skips the rest of the file's streams.
    for (unsigned i = 0; i < format->nb_streams; ++i)
      if (static_cast<int>(i) != stream) format->streams[i]->discard = AVDISCARD_ALL;

    const AVPixFmtDescriptor* pixels = av_pix_fmt_desc_get(codec->pix_fmt);
    info.bitDepth = pixels ? pixels->comp[0].depth : 8;
    index(video);
    measure(video);
  }

  // Reads every packet's timestamp once, without decoding (the demuxer alone is quick), so that
  // a time maps to a frame for constant and variable rates alike, and the length is known.
  void index(const AVStream* video) {
    std::vector<std::pair<int64_t, int64_t>> frames;  // presentation time, duration
    while (av_read_frame(format, packet) >= 0) {
      // Packets the demuxer marks as discarded (before an edit list's start) give no picture.
      if (packet->stream_index == stream && !(packet->flags & AV_PKT_FLAG_DISCARD)) {
        int64_t time = packet->pts != AV_NOPTS_VALUE ? packet->pts : packet->dts;
        if (time == AV_NOPTS_VALUE) time = frames.empty() ? 0 : frames.back().first + 1;
        frames.emplace_back(time, packet->duration);
      }
      av_packet_unref(packet);
    }
    if (frames.empty()) fail("the video stream holds no frames");
    std::sort(frames.begin(), frames.end());
    times.reserve(frames.size());
    for (const auto& frame : frames) times.push_back(frame.first);
    // The last frame lasts as long as its packet says; without a duration, as long as the one
    // before it did, or a frame at the stream's rate when it is the only one.
    int64_t last = frames.back().second;
    if (last <= 0 && times.size() > 1) last = times.back() - times[times.size() - 2];
    if (last <= 0) {
      AVRational rate = video->avg_frame_rate.num > 0 ? video->avg_frame_rate : video->r_frame_rate;
      if (rate.num <= 0 || rate.den <= 0) rate = AVRational{25, 1};
      last = std::max<int64_t>(av_rescale_q(1, av_inv_q(rate), timeBase), 1);
    }
    info.duration =
        static_cast<double>(times.back() + last - times.front()) * timeBase.num / timeBase.den;
    if (!info.frameRate.valid() && info.duration > 0)
      info.frameRate = snappedToCommonRate(
          {std::llround(static_cast<double>(times.size()) * 1000 / info.duration), 1000});
  }

  // The display size: upright, and at square pixels as players size their window.
  void measure(AVStream* video) {
    orientation = orientationOf(video);
    const AVRational sar = av_guess_sample_aspect_ratio(format, video, nullptr);
    const std::array<int32_t, 2> size =
        displaySize(codec->width, codec->height, orientation, sar.num, sar.den);
    info.width = size[0];
    info.height = size[1];
  }

  // The frame shown at composition frame `frame` of a composition at `rate`, counted exactly in
  // the stream's time base from its first frame.
  int32_t frameShownAt(int64_t frame, FrameRate rate) const {
    if (frame <= 0 || !rate.valid()) return 0;
    const int64_t ticks = av_rescale_rnd(frame * rate.denominator, timeBase.den,
                                         rate.numerator * timeBase.num, AV_ROUND_DOWN);
    if (ticks >= times.back() - times.front()) return lastFrame();
    const int64_t time = times.front() + ticks;
    return std::max<int32_t>(
        static_cast<int32_t>(std::upper_bound(times.begin(), times.end(), time) - times.begin()) -
            1,
        0);
  }

  int32_t lastFrame() const { return static_cast<int32_t>(times.size()) - 1; }

  // The index of the frame presented at the time, or -1 for a picture presented before the
  // first frame (the lead-in an edit list cuts, should the decoder hand it out).
  int32_t indexAt(int64_t timestamp) const {
    const auto after = std::upper_bound(times.begin(), times.end(), timestamp);
    return static_cast<int32_t>(after - times.begin()) - 1;
  }

  int32_t indexOf(const AVFrame* frame) const {
    int64_t timestamp = frame->best_effort_timestamp;
    if (timestamp == AV_NOPTS_VALUE) timestamp = frame->pts;
    if (timestamp == AV_NOPTS_VALUE) return lastDecoded + 1;
    return indexAt(timestamp);
  }

  // Seeks to frame `from`, or with `fileStart` to the first byte of the file.
  void seek(int32_t from, int32_t index, bool fileStart = false) {
    const int result = fileStart ? av_seek_frame(format, stream, 0, AVSEEK_FLAG_BYTE)
                                 : av_seek_frame(format, stream, times[from], AVSEEK_FLAG_BACKWARD);
    if (result < 0) fail("frame " + std::to_string(index) + ": the seek failed", result);
    avcodec_flush_buffers(codec);
    av_frame_unref(next);
    currentIndex = -1;
    nextIndex = -1;
    firstSinceSeek = -1;
    lastDecoded = -1;
    draining = false;
    ended = false;
  }

  // Feeds the decoder one packet of the stream, or tells it the stream has ended. A packet the
  // decoder refuses is a damaged frame: the decoder goes on with the next.
  void feed() {
    while (!draining) {
      int result = av_read_frame(format, packet);
      if (result < 0) {
        draining = true;
        avcodec_send_packet(codec, nullptr);
        return;
      }
      const bool ours = packet->stream_index == stream;
      if (ours) {
        const int64_t time = packet->pts != AV_NOPTS_VALUE ? packet->pts : packet->dts;
        if (packet->flags & AV_PKT_FLAG_CORRUPT)
          damaged(indexAt(time), "the file says its data is corrupt");
        result = avcodec_send_packet(codec, packet);
        if (result == AVERROR(ENOMEM)) fail("out of memory", result);
        if (result < 0 && result != AVERROR(EAGAIN))
          damaged(std::max(indexAt(time), 0), reasonFor(result));
      }
      av_packet_unref(packet);
      if (ours) return;
    }
  }

  // Takes in a frame the decoder gave, towards frame `index`: counts it when the decoder found
  // it damaged, and makes it current unless it lies past the frame asked for while an earlier
  // one is at hand (a frame between them did not decode): then it waits in `next`.
  void accept(int32_t index) {
    const int32_t decodedIndex = indexOf(decoded);
    if (decodedIndex < 0) {
      av_frame_unref(decoded);
      return;
    }
    if (decoded->decode_error_flags || (decoded->flags & AV_FRAME_FLAG_CORRUPT))
      damaged(decodedIndex, damageOf(decoded->decode_error_flags));
    lastDecoded = std::max(lastDecoded, decodedIndex);
    AVFrame* into = currentIndex >= 0 && decodedIndex > index ? next : current;
    av_frame_unref(into);
    av_frame_move_ref(into, decoded);
    (into == next ? nextIndex : currentIndex) = decodedIndex;
    if (firstSinceSeek < 0) firstSinceSeek = decodedIndex;
  }

  // Decodes on until the frame at `index` is current, or the latest before it when the frame
  // at `index` never comes; at the end of the stream the last frame stays current.
  void decodeOnTo(int32_t index) {
    for (;;) {
      if (nextIndex >= 0) {
        if (nextIndex > index) return;
        av_frame_unref(current);
        av_frame_move_ref(current, next);
        currentIndex = nextIndex;
        nextIndex = -1;
      }
      if (currentIndex >= index || ended) return;
      const int result = avcodec_receive_frame(codec, decoded);
      if (result == 0) {
        accept(index);
      } else if (result == AVERROR(EAGAIN)) {
        feed();
      } else if (result == AVERROR_EOF) {
        ended = true;
      } else if (result == AVERROR(ENOMEM)) {
        fail("out of memory", result);
      } else {
        damaged(lastDecoded + 1, reasonFor(result));
        feed();
      }
    }
  }

  void show(int32_t index) {
    index = std::clamp(index, 0, lastFrame());
    if (index == currentIndex) return;
    if (currentIndex >= 0 && index > currentIndex && index - currentIndex <= kDecodeAheadLimit &&
        (!ended || nextIndex >= 0)) {
      decodeOnTo(index);
    } else {
      // A seek lands on a key frame at or before the time as the demuxer counts it, which with
      // reordered frames can still be after the frame asked, or past the key frame the frames
      // after it need (nothing decodes): then it starts further back.
      auto landed = [&] { return firstSinceSeek >= 0 && firstSinceSeek <= index; };
      for (int64_t back = 0;; back = back ? back * 4 : 16) {
        const auto from = static_cast<int32_t>(std::max<int64_t>(index - back, 0));
        seek(from, index);
        decodeOnTo(index);
        if (landed() || from == 0) break;
      }
      // Demuxers that search by decoding time (MPEG-TS) land past the first key frame when
      // asked for its presentation time: the file's start is the way back to it.
      if (!landed() && !(format->iformat->flags & AVFMT_NO_BYTE_SEEK)) {
        seek(0, index, true);
        decodeOnTo(index);
      }
    }
    if (currentIndex < 0) fail("frame " + std::to_string(index) + ": no picture decodes");
  }
};

VideoReader::VideoReader(const std::string& path, std::shared_ptr<DamagedFrames> damage)
    : decoder_(std::make_unique<Decoder>()) {
  decoder_->path = path;
  decoder_->damage = std::move(damage);
  clearLibraryError();
  decoder_->open();
  decoder_->converter =
      std::make_unique<FrameConverter>(decoder_->info.colour, decoder_->orientation);
}

VideoReader::~VideoReader() = default;

const MediaInfo& VideoReader::info() const { return decoder_->info; }

std::vector<uint8_t> VideoReader::glRowsAt(int64_t frame, FrameRate rate, int32_t width,
                                           int32_t height, PixelFormat format) {
  clearLibraryError();
  decoder_->show(decoder_->frameShownAt(frame, rate));
  try {
    return decoder_->converter->glRows(decoder_->current, width, height, format);
  } catch (const std::bad_alloc&) {
    throw;
  } catch (const std::runtime_error& error) {
    decoder_->fail(error.what());
  }
}

RgbaImage VideoReader::frameAt(int64_t frame, FrameRate rate, int32_t width, int32_t height,
                               PixelFormat format) {
  RgbaImage picture(width, height, format);
  picture.pixels = flipRows(glRowsAt(frame, rate, width, height, format), width, height);
  return picture;
}

}  // namespace refhost
