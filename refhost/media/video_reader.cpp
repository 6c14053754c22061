// FFmpeg demuxing, decoding, seeking and conversion to RGBA for VideoReader.
#include "refhost/media/video_reader.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/imgutils.h>
#include <libswscale/swscale.h>
}

#include <algorithm>
#include <cmath>
#include <cstdarg>
#include <stdexcept>

namespace refhost {
namespace {

// Asking for a frame at most this far ahead of the last one decodes on instead of seeking.
constexpr int32_t kDecodeAheadLimit = 48;

std::string errorText(int code) {
  char buffer[AV_ERROR_MAX_STRING_SIZE] = {};
  av_strerror(code, buffer, sizeof buffer);
  return buffer;
}

// The libraries' last error message on this thread. They report details ("Invalid NAL unit
// size") only through their log, which would otherwise print several lines around the one
// line of a failure; kept here, the detail goes into that line instead.
thread_local std::string lastLibraryError;

void keepLibraryError(void* context, int level, const char* format, va_list arguments) {
  if (level > AV_LOG_ERROR) return;
  char line[512] = {};
  int prefix = 0;
  av_log_format_line2(context, level, format, arguments, line, sizeof line, &prefix);
  std::string text(line);
  while (!text.empty() && (text.back() == '\n' || text.back() == '.')) text.pop_back();
  // The prefix names the library object by address ("[h264 @ 0x...]"): noise to a user.
  std::string::size_type object = text.find("] ");
  if (text.rfind('[', 0) == 0 && object != std::string::npos) text.erase(0, object + 2);
  if (!text.empty()) lastLibraryError = text;
}

}  // namespace

struct VideoReader::Decoder {
  std::string path;
  AVFormatContext* format = nullptr;
  AVCodecContext* codec = nullptr;
  AVPacket* packet = nullptr;
  AVFrame* decoded = nullptr;  // scratch for avcodec_receive_frame
  AVFrame* current = nullptr;  // the last frame decoded
  SwsContext* scaler = nullptr;
  int stream = -1;
  AVRational rate{25, 1};
  AVRational timeBase{1, 25};
  int64_t startTime = 0;
  int32_t frameCount = 0;
  int32_t currentIndex = -1;  // index of `current`; -1 when none since the last seek
  MediaInfo info;
  bool draining = false;  // the demuxer ran out and the decoder was told so
  bool ended = false;     // the decoder gave everything it had

  ~Decoder() {
    sws_freeContext(scaler);
    av_frame_free(&current);
    av_frame_free(&decoded);
    av_packet_free(&packet);
    avcodec_free_context(&codec);
    avformat_close_input(&format);
  }

  [[noreturn]] void fail(const std::string& what, int code = 0) const {
    std::string reason = code ? errorText(code) : "";
    if (!lastLibraryError.empty()) reason += (reason.empty() ? "" : ": ") + lastLibraryError;
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
    // Frame and slice threads as the machine has cores: decoding keeps up with the render
    // instead of running on the caller's thread alone.
    codec->thread_count = 0;
    codec->thread_type = FF_THREAD_FRAME | FF_THREAD_SLICE;
    if ((result = avcodec_open2(codec, decoderCodec, nullptr)) < 0) fail("decoder refused", result);
    packet = av_packet_alloc();
    decoded = av_frame_alloc();
    current = av_frame_alloc();
    if (!packet || !decoded || !current) fail("out of memory");

    timeBase = video->time_base;
    rate = video->avg_frame_rate.num > 0 ? video->avg_frame_rate : video->r_frame_rate;
    if (rate.num <= 0 || rate.den <= 0) rate = AVRational{25, 1};
    startTime = video->start_time != AV_NOPTS_VALUE ? video->start_time : 0;
    if (video->nb_frames > 0) {
      frameCount = static_cast<int32_t>(std::min<int64_t>(video->nb_frames, INT32_MAX));
    } else if (video->duration != AV_NOPTS_VALUE && video->duration > 0) {
      frameCount = static_cast<int32_t>(av_rescale_q(video->duration, timeBase, av_inv_q(rate)));
    } else if (format->duration > 0) {
      frameCount =
          static_cast<int32_t>(av_rescale_q(format->duration, AV_TIME_BASE_Q, av_inv_q(rate)));
    }
  }

  int32_t indexOf(const AVFrame* frame) const {
    int64_t timestamp = frame->best_effort_timestamp;
    if (timestamp == AV_NOPTS_VALUE) timestamp = frame->pts;
    if (timestamp == AV_NOPTS_VALUE) return currentIndex + 1;
    return static_cast<int32_t>(
        av_rescale_q_rnd(timestamp - startTime, timeBase, av_inv_q(rate), AV_ROUND_NEAR_INF));
  }

  void seek(int32_t index) {
    int64_t target = startTime + av_rescale_q(index, av_inv_q(rate), timeBase);
    int result = av_seek_frame(format, stream, target, AVSEEK_FLAG_BACKWARD);
    if (result < 0) fail("frame " + std::to_string(index) + ": the seek failed", result);
    avcodec_flush_buffers(codec);
    currentIndex = -1;
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

  // Decodes until the frame at `index` (or the first after it) is current; at the end of the
  // stream the last frame stays current.
  void decodeTo(int32_t index) {
    bool ahead = currentIndex >= 0 && index > currentIndex &&
                 index - currentIndex <= kDecodeAheadLimit && !ended;
    if (!ahead) seek(index);
    while (!ended) {
      int result = avcodec_receive_frame(codec, decoded);
      if (result == 0) {
        av_frame_unref(current);
        av_frame_move_ref(current, decoded);
        currentIndex = indexOf(current);
        if (currentIndex >= index) return;
      } else if (result == AVERROR(EAGAIN)) {
        feed(index);
      } else if (result == AVERROR_EOF) {
        ended = true;
      } else {
        fail("frame " + std::to_string(index) + ": decoding failed", result);
      }
    }
    if (currentIndex < 0) fail("frame " + std::to_string(index) + ": no picture decodes");
  }

  // Scales the current frame into RGBA rows `stride` bytes apart starting at `first` (a
  // negative stride with the last row's address writes the picture bottom row first).
  void convert(int32_t width, int32_t height, uint8_t* first, int stride) {
    if (width == 0 || height == 0) return;
    scaler = sws_getCachedContext(scaler, current->width, current->height,
                                  static_cast<AVPixelFormat>(current->format), width, height,
                                  AV_PIX_FMT_RGBA, SWS_BILINEAR, nullptr, nullptr, nullptr);
    if (!scaler) fail("no conversion to RGBA");
    uint8_t* planes[4] = {first, nullptr, nullptr, nullptr};
    int strides[4] = {stride, 0, 0, 0};
    sws_scale(scaler, current->data, current->linesize, 0, current->height, planes, strides);
  }

  void seekTo(int32_t index) {
    index = std::max(index, 0);
    if (frameCount > 0) index = std::min(index, frameCount - 1);
    if (index != currentIndex) decodeTo(index);
  }
};

VideoReader::VideoReader(const std::string& path) : decoder_(std::make_unique<Decoder>()) {
  decoder_->path = path;
  // The libraries' messages would bury the command line's own output; errors are kept for the
  // one line a failure gives.
  av_log_set_callback(keepLibraryError);
  lastLibraryError.clear();
  decoder_->open();
  MediaInfo& info = decoder_->info;
  info.width = decoder_->codec->width;
  info.height = decoder_->codec->height;
  info.frameRate = av_q2d(decoder_->rate);
  info.duration = decoder_->frameCount / info.frameRate;
}

VideoReader::~VideoReader() = default;

const MediaInfo& VideoReader::info() const { return decoder_->info; }

std::vector<uint8_t> VideoReader::glRowsAt(double seconds, int32_t width, int32_t height,
                                           PixelFormat format) {
  lastLibraryError.clear();
  decoder_->seekTo(static_cast<int32_t>(std::floor(seconds * decoder_->info.frameRate + 1e-6)));
  width = std::max(width, 0);
  height = std::max(height, 0);
  const std::size_t row = static_cast<std::size_t>(width) * 4;
  std::vector<uint8_t> rows(row * static_cast<std::size_t>(height));
  if (!rows.empty()) decoder_->convert(width, height, &rows[row * (height - 1)], -width * 4);
  if (format == PixelFormat::Rgba8) return rows;
  RgbaImage picture(width, height);
  picture.pixels = std::move(rows);
  return converted(picture, format).pixels;
}

RgbaImage VideoReader::frameAt(double seconds, int32_t width, int32_t height, PixelFormat format) {
  RgbaImage picture(width, height, format);
  picture.pixels = flipRows(glRowsAt(seconds, width, height, format), width, height);
  return picture;
}

}  // namespace refhost
