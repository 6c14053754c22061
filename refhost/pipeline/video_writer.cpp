// FFmpeg muxing and encoding for VideoWriter.
#include "refhost/pipeline/video_writer.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/opt.h>
#include <libswscale/swscale.h>
}

#include <algorithm>
#include <cstring>
#include <stdexcept>

namespace refhost {
namespace {

std::string errorText(int code) {
  char buffer[AV_ERROR_MAX_STRING_SIZE] = {};
  av_strerror(code, buffer, sizeof buffer);
  return buffer;
}

const char* muxerName(VideoContainer container) {
  switch (container) {
    case VideoContainer::Mp4:
      return "mp4";
    case VideoContainer::Mov:
      return "mov";
    case VideoContainer::Mkv:
      return "matroska";
  }
  return "mp4";
}

}  // namespace

struct VideoWriter::Encoder {
  std::string path;
  std::string shownName;
  int32_t width = 0, height = 0;  // the pictures written
  AVFormatContext* format = nullptr;
  AVCodecContext* codec = nullptr;
  AVStream* stream = nullptr;
  AVFrame* frame = nullptr;
  AVPacket* packet = nullptr;
  SwsContext* scaler = nullptr;
  std::vector<uint8_t> padded;  // the picture at the encoded (even) size
  int64_t nextPts = 0;
  bool headerWritten = false;
  bool finished = false;
  std::string codecName;
  std::string note;
  std::unique_ptr<AudioTrack> audio;  // reads its own input; never touches `format` when freed

  ~Encoder() {
    if (headerWritten && !finished) av_write_trailer(format);
    if (format && format->pb) avio_closep(&format->pb);
    sws_freeContext(scaler);
    av_packet_free(&packet);
    av_frame_free(&frame);
    avcodec_free_context(&codec);
    avformat_free_context(format);
  }

  [[noreturn]] void fail(const std::string& what, int code = 0) const {
    throw std::runtime_error(shownName + ": cannot write video: " + what +
                             (code ? " (" + errorText(code) + ")" : ""));
  }

  const AVCodec* chooseCodec() {
    const AVCodec* chosen = avcodec_find_encoder_by_name("libx264");
    if (chosen) return chosen;
    chosen = avcodec_find_encoder(format->oformat->video_codec);
    if (!chosen) fail("no H.264 encoder (libx264) and no default encoder for the container");
    note = std::string("libx264 is not available; encoded with ") + chosen->name + " instead";
    return chosen;
  }

  void open(VideoContainer container, double frameRate, const AudioClip& audioClip) {
    int result =
        avformat_alloc_output_context2(&format, nullptr, muxerName(container), path.c_str());
    if (result < 0 || !format) fail("no muxer", result);
    const AVCodec* encoder = chooseCodec();
    codecName = encoder->name;
    stream = avformat_new_stream(format, nullptr);
    codec = avcodec_alloc_context3(encoder);
    frame = av_frame_alloc();
    packet = av_packet_alloc();
    if (!stream || !codec || !frame || !packet) fail("out of memory");

    AVRational rate = av_d2q(frameRate > 0 ? frameRate : 25.0, 1001000);
    codec->width = (width + 1) & ~1;
    codec->height = (height + 1) & ~1;
    codec->time_base = av_inv_q(rate);
    codec->framerate = rate;
    // The encoder's own keyframe interval, and as many threads as it wants: the settings the
    // ffmpeg command line uses, so files and speed compare with its.
    codec->thread_count = 0;
    codec->pix_fmt = encoder->pix_fmts ? encoder->pix_fmts[0] : AV_PIX_FMT_YUV420P;
    if (std::strcmp(encoder->name, "libx264") == 0) codec->pix_fmt = AV_PIX_FMT_YUV420P;
    // BT.601 with limited range is what the RGBA conversion below produces.
    codec->color_range = AVCOL_RANGE_MPEG;
    codec->colorspace = AVCOL_SPC_SMPTE170M;
    if (format->oformat->flags & AVFMT_GLOBALHEADER) codec->flags |= AV_CODEC_FLAG_GLOBAL_HEADER;
    AVDictionary* options = nullptr;
    if (codecName == "libx264") {
      av_dict_set(&options, "crf", "18", 0);
      av_dict_set(&options, "preset", "fast", 0);
    }
    result = avcodec_open2(codec, encoder, &options);
    av_dict_free(&options);
    if (result < 0) fail(codecName + " refused the settings", result);
    if ((result = avcodec_parameters_from_context(stream->codecpar, codec)) < 0)
      fail("codec data", result);
    stream->time_base = codec->time_base;
    stream->avg_frame_rate = rate;
    if (!audioClip.path.empty()) audio = AudioTrack::open(audioClip, format);

    if ((result = avio_open(&format->pb, path.c_str(), AVIO_FLAG_WRITE)) < 0)
      fail("cannot create the file", result);
    if ((result = avformat_write_header(format, nullptr)) < 0)
      fail("cannot write the header", result);
    headerWritten = true;

    frame->format = codec->pix_fmt;
    frame->width = codec->width;
    frame->height = codec->height;
    if ((result = av_frame_get_buffer(frame, 0)) < 0) fail("out of memory", result);
    scaler = sws_getContext(codec->width, codec->height, AV_PIX_FMT_RGBA, codec->width,
                            codec->height, codec->pix_fmt, SWS_BILINEAR, nullptr, nullptr, nullptr);
    if (!scaler) fail("no conversion from RGBA");
    if (codec->width != width || codec->height != height)
      padded.resize(static_cast<std::size_t>(codec->width) *
                    static_cast<std::size_t>(codec->height) * 4);
  }

  // Sends a frame (or, with null, the end) and writes every packet the encoder has ready.
  void encode(AVFrame* input) {
    int result = avcodec_send_frame(codec, input);
    if (result < 0) fail("encoding failed", result);
    while ((result = avcodec_receive_packet(codec, packet)) == 0) {
      const double end =
          static_cast<double>(packet->pts + packet->duration) * av_q2d(codec->time_base);
      av_packet_rescale_ts(packet, codec->time_base, stream->time_base);
      packet->stream_index = stream->index;
      result = av_interleaved_write_frame(format, packet);
      av_packet_unref(packet);
      if (result < 0) fail("writing a packet failed", result);
      // The sound goes along with the pictures, so the muxer interleaves without piling up.
      if (audio) audio->writeUntil(end);
    }
    if (result != AVERROR(EAGAIN) && result != AVERROR_EOF) fail("encoding failed", result);
  }

  void padPicture(const RgbaImage& image) {
    std::size_t inRow = static_cast<std::size_t>(width) * 4;
    std::size_t outRow = static_cast<std::size_t>(codec->width) * 4;
    for (int32_t y = 0; y < codec->height; ++y) {
      const uint8_t* from =
          &image.pixels[static_cast<std::size_t>(std::min(y, height - 1)) * inRow];
      uint8_t* to = &padded[static_cast<std::size_t>(y) * outRow];
      std::memcpy(to, from, inRow);
      if (codec->width > width) std::memcpy(to + inRow, from + inRow - 4, 4);
    }
  }
};

VideoWriter::VideoWriter(const std::string& path, VideoContainer container, int32_t width,
                         int32_t height, double frameRate, const std::string& shownName,
                         const AudioClip& audio)
    : encoder_(std::make_unique<Encoder>()) {
  encoder_->path = path;
  encoder_->shownName = shownName.empty() ? path : shownName;
  // The libraries' progress chatter would bury the command line's own output.
  av_log_set_level(AV_LOG_ERROR);
  encoder_->width = width;
  encoder_->height = height;
  if (width <= 0 || height <= 0) encoder_->fail("a video needs a frame of at least 1x1");
  encoder_->open(container, frameRate, audio);
}

VideoWriter::~VideoWriter() = default;

void VideoWriter::write(const RgbaImage& picture) {
  Encoder& e = *encoder_;
  if (picture.width != e.width || picture.height != e.height)
    e.fail("a frame of " + std::to_string(picture.width) + "x" + std::to_string(picture.height) +
           " in a video of " + std::to_string(e.width) + "x" + std::to_string(e.height));
  // An even-sized picture is converted as it is; only an odd one is padded first.
  const bool even = e.codec->width == e.width && e.codec->height == e.height;
  if (!even) e.padPicture(picture);
  int result = av_frame_make_writable(e.frame);
  if (result < 0) e.fail("out of memory", result);
  const uint8_t* planes[4] = {even ? picture.pixels.data() : e.padded.data(), nullptr, nullptr,
                              nullptr};
  int strides[4] = {e.codec->width * 4, 0, 0, 0};
  sws_scale(e.scaler, planes, strides, 0, e.codec->height, e.frame->data, e.frame->linesize);
  e.frame->pts = e.nextPts++;
  e.encode(e.frame);
}

void VideoWriter::finish() {
  Encoder& e = *encoder_;
  if (e.finished) return;
  e.encode(nullptr);
  if (e.audio) e.audio->finish();
  int result = av_write_trailer(e.format);
  e.finished = true;
  if (result < 0) e.fail("cannot complete the file", result);
  if ((result = avio_closep(&e.format->pb)) < 0) e.fail("cannot close the file", result);
}

const std::string& VideoWriter::codecName() const { return encoder_->codecName; }
const std::string& VideoWriter::note() const { return encoder_->note; }

}  // namespace refhost
