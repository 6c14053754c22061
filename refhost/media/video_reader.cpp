// FFmpeg demuxing, decoding and seeking for VideoReader: frames chosen by their presentation
// time and handed to the conversion at the stream's colour, depth and display size.
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
#include "refhost/media/orientation.h"
#include "refhost/media/stream_colour.h"

namespace refhost {
namespace {

// Asking for a frame at most this far ahead of the last one decodes on instead of seeking.
constexpr int32_t kDecodeAheadLimit = 48;
// Times asked this little before a frame's presentation count as that frame: a composition's
// n / rate lands a rounding error short of the same instant in the stream's time base.
constexpr double kTimeSlack = 1e-6;

}  // namespace

struct VideoReader::Decoder {
  std::string path;
  AVFormatContext* format = nullptr;
  AVCodecContext* codec = nullptr;
  AVPacket* packet = nullptr;
  AVFrame* decoded = nullptr;  // scratch for avcodec_receive_frame
  AVFrame* current = nullptr;  // the last frame decoded
  int stream = -1;
  AVRational timeBase{1, 25};
  // Every frame's presentation time in the stream's time base, in presentation order.
  std::vector<int64_t> times;
  int32_t currentIndex = -1;    // index of `current`; -1 when none since the last seek
  int32_t firstSinceSeek = -1;  // index of the first frame decoded since the last seek
  Orientation orientation;
  std::unique_ptr<FrameConverter> converter;  // made once the stream's colour is known
  MediaInfo info;
  bool draining = false;  // the demuxer ran out and the decoder was told so
  bool ended = false;     // the decoder gave everything it had

  ~Decoder() {
    av_frame_free(&current);
    av_frame_free(&decoded);
    av_packet_free(&packet);
    avcodec_free_context(&codec);
    avformat_close_input(&format);
  }

  [[noreturn]] void fail(const std::string& what, int code = 0) const {
    std::string reason = code ? avErrorText(code) : "";
    const std::string detail = lastLibraryError();
    if (!detail.empty()) reason += (reason.empty() ? "" : ": ") + detail;
    throw std::runtime_error(path + ": cannot decode video: " + what +
                             (reason.empty() ? "" : " (" + reason + ")"));
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
    // running on the caller's thread alone. Each frame thread holds pictures of its own besides
    // the reference pictures, so frame threads (at most four) are for pictures up to about
    // 1080p 4:2:2 at 10 bits; larger ones, nine of which may be open for one render, decode with
    // slice threads (wavefronts in HEVC), which hold no extra pictures.
    const int decodedBytes =
        av_image_get_buffer_size(codec->pix_fmt, codec->width, codec->height, 1);
    constexpr int kFrameThreadsUpTo = 8 << 20;
    if (decodedBytes > 0 && decodedBytes <= kFrameThreadsUpTo) {
      codec->thread_count = static_cast<int>(std::min(std::thread::hardware_concurrency() + 1, 5u));
      codec->thread_type = FF_THREAD_FRAME | FF_THREAD_SLICE;
    } else {
      codec->thread_count = 0;
      codec->thread_type = FF_THREAD_SLICE;
    }
    if ((result = avcodec_open2(codec, decoderCodec, nullptr)) < 0) fail("decoder refused", result);
    packet = av_packet_alloc();
    decoded = av_frame_alloc();
    current = av_frame_alloc();
    if (!packet || !decoded || !current) fail("out of memory");
    timeBase = video->time_base;
    if (timeBase.num <= 0 || timeBase.den <= 0) fail("the stream has no time base");
    info.hasAudio = av_find_best_stream(format, AVMEDIA_TYPE_AUDIO, -1, -1, nullptr, 0) >= 0;
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
  }

  // The display size: upright, and at square pixels as players size their window.
  void measure(AVStream* video) {
    orientation = orientationOf(video);
    const AVRational sar = av_guess_sample_aspect_ratio(format, video, nullptr);
    const std::array<int32_t, 2> size =
        displaySize(codec->width, codec->height, orientation, sar.num, sar.den);
    info.width = size[0];
    info.height = size[1];
    if (video->avg_frame_rate.num > 0 && video->avg_frame_rate.den > 0)
      info.frameRate = av_q2d(video->avg_frame_rate);
    else if (info.duration > 0)
      info.frameRate = static_cast<double>(times.size()) / info.duration;
    else if (video->r_frame_rate.num > 0 && video->r_frame_rate.den > 0)
      info.frameRate = av_q2d(video->r_frame_rate);
  }

  // The frame shown at `seconds` from the first frame's presentation.
  int32_t frameShownAt(double seconds) const {
    if (!(seconds > 0)) return 0;
    const double ticks = std::floor((seconds + kTimeSlack) * timeBase.den / timeBase.num);
    if (ticks >= static_cast<double>(times.back() - times.front())) return lastFrame();
    const int64_t time = times.front() + static_cast<int64_t>(ticks);
    return std::max<int32_t>(
        static_cast<int32_t>(std::upper_bound(times.begin(), times.end(), time) - times.begin()) -
            1,
        0);
  }

  int32_t lastFrame() const { return static_cast<int32_t>(times.size()) - 1; }

  // The frame's index, or -1 for a picture presented before the first frame (the lead-in an
  // edit list cuts, should the decoder hand it out).
  int32_t indexOf(const AVFrame* frame) const {
    int64_t timestamp = frame->best_effort_timestamp;
    if (timestamp == AV_NOPTS_VALUE) timestamp = frame->pts;
    if (timestamp == AV_NOPTS_VALUE) return currentIndex + 1;
    const auto after = std::upper_bound(times.begin(), times.end(), timestamp);
    return static_cast<int32_t>(after - times.begin()) - 1;
  }

  void seek(int32_t from, int32_t index) {
    int result = av_seek_frame(format, stream, times[from], AVSEEK_FLAG_BACKWARD);
    if (result < 0) fail("frame " + std::to_string(index) + ": the seek failed", result);
    avcodec_flush_buffers(codec);
    currentIndex = -1;
    firstSinceSeek = -1;
    draining = false;
    ended = false;
  }

  // Feeds the decoder one packet of the stream, or tells it the stream has ended. `index` is
  // the frame being decoded towards, for messages.
  void feed(int32_t index) {
    while (!draining) {
      int result = av_read_frame(format, packet);
      if (result < 0) {
        draining = true;
        avcodec_send_packet(codec, nullptr);
        return;
      }
      bool ours = packet->stream_index == stream;
      if (ours) result = avcodec_send_packet(codec, packet);
      av_packet_unref(packet);
      if (ours) {
        if (result < 0 && result != AVERROR(EAGAIN))
          fail("frame " + std::to_string(index) + ": its data is damaged or cut short", result);
        return;
      }
    }
  }

  // Decodes on until the frame at `index` (or the first after it) is current; at the end of
  // the stream the last frame stays current.
  void decodeOnTo(int32_t index) {
    while (!ended) {
      int result = avcodec_receive_frame(codec, decoded);
      if (result == 0) {
        const int32_t decodedIndex = indexOf(decoded);
        if (decodedIndex < 0) {
          av_frame_unref(decoded);
          continue;
        }
        av_frame_unref(current);
        av_frame_move_ref(current, decoded);
        currentIndex = decodedIndex;
        if (firstSinceSeek < 0) firstSinceSeek = currentIndex;
        if (currentIndex >= index) return;
      } else if (result == AVERROR(EAGAIN)) {
        feed(index);
      } else if (result == AVERROR_EOF) {
        ended = true;
      } else {
        fail("frame " + std::to_string(index) + ": decoding failed", result);
      }
    }
  }

  void show(int32_t index) {
    index = std::clamp(index, 0, lastFrame());
    if (index == currentIndex) return;
    if (currentIndex >= 0 && index > currentIndex && index - currentIndex <= kDecodeAheadLimit &&
        !ended) {
      decodeOnTo(index);
    } else {
      // A seek lands on a key frame at or before the time as the demuxer counts it, which with
      // reordered frames can still be after the frame asked: then it starts further back.
      for (int64_t back = 0;; back = back ? back * 4 : 16) {
        const auto from = static_cast<int32_t>(std::max<int64_t>(index - back, 0));
        seek(from, index);
        decodeOnTo(index);
        if (firstSinceSeek <= index || from == 0) break;
      }
    }
    if (currentIndex < 0) fail("frame " + std::to_string(index) + ": no picture decodes");
  }
};

VideoReader::VideoReader(const std::string& path) : decoder_(std::make_unique<Decoder>()) {
  decoder_->path = path;
  clearLibraryError();
  decoder_->open();
  decoder_->converter =
      std::make_unique<FrameConverter>(decoder_->info.colour, decoder_->orientation);
}

VideoReader::~VideoReader() = default;

const MediaInfo& VideoReader::info() const { return decoder_->info; }

std::vector<uint8_t> VideoReader::glRowsAt(double seconds, int32_t width, int32_t height,
                                           PixelFormat format) {
  clearLibraryError();
  decoder_->show(decoder_->frameShownAt(seconds));
  try {
    return decoder_->converter->glRows(decoder_->current, width, height, format);
  } catch (const std::bad_alloc&) {
    throw;
  } catch (const std::runtime_error& error) {
    decoder_->fail(error.what());
  }
}

RgbaImage VideoReader::frameAt(double seconds, int32_t width, int32_t height, PixelFormat format) {
  RgbaImage picture(width, height, format);
  picture.pixels = flipRows(glRowsAt(seconds, width, height, format), width, height);
  return picture;
}

}  // namespace refhost
