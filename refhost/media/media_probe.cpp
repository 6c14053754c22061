// Probing a file with FFmpeg: its streams, whether it has more than one picture, and for a
// single picture, whether it decodes whole.
#include "refhost/media/media_probe.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
}

#include <cstring>
#include <memory>
#include <stdexcept>

#include "refhost/media/animated_webp.h"
#include "refhost/media/ffmpeg_utilities.h"

namespace refhost {
namespace {

// FFmpeg's demuxers of one picture a file: image2 and its pipes (png_pipe, jpeg_pipe, ...), and
// the formats that animate or not (a GIF or APNG of one frame is a still).
bool holdsPictures(const AVInputFormat* demuxer) {
  const std::string name = demuxer->name;
  const std::string pipe = "_pipe";
  return name == "image2" || name == "image2pipe" || name == "gif" || name == "apng" ||
         (name.size() > pipe.size() &&
          name.compare(name.size() - pipe.size(), pipe.size(), pipe) == 0);
}

// The picture codecs whose decoders are complete, so that a failure is the file's: the formats
// whose libraries (libpng, libjpeg) would otherwise print their own lines when the image
// reader meets damage.
bool decodesWhole(AVCodecID codec) {
  return codec == AV_CODEC_ID_PNG || codec == AV_CODEC_ID_MJPEG || codec == AV_CODEC_ID_GIF ||
         codec == AV_CODEC_ID_BMP || codec == AV_CODEC_ID_WEBP;
}

struct Input {
  AVFormatContext* format = nullptr;
  AVPacket* packet = av_packet_alloc();
  ~Input() {
    av_packet_free(&packet);
    avformat_close_input(&format);
  }
};

// Decodes the one picture; with `strictly`, any deviation the decoder detects is a failure
// (AV_EF_EXPLODE), which is how a picture it would otherwise patch up shows. The reason of the
// failure, or empty when it decodes.
std::string pictureFailure(const AVStream* stream, const AVCodec* decoder, const AVPacket* packet,
                           bool strictly) {
  std::unique_ptr<AVCodecContext, void (*)(AVCodecContext*)> codec(
      avcodec_alloc_context3(decoder), [](AVCodecContext* c) { avcodec_free_context(&c); });
  std::unique_ptr<AVFrame, void (*)(AVFrame*)> frame(av_frame_alloc(),
                                                     [](AVFrame* f) { av_frame_free(&f); });
  if (!codec || !frame) throw std::bad_alloc();
  if (strictly) codec->err_recognition |= AV_EF_EXPLODE;
  clearLibraryError();
  int result = avcodec_parameters_to_context(codec.get(), stream->codecpar);
  if (result >= 0) result = avcodec_open2(codec.get(), decoder, nullptr);
  if (result >= 0) result = avcodec_send_packet(codec.get(), packet);
  if (result >= 0) avcodec_send_packet(codec.get(), nullptr);
  if (result >= 0) result = avcodec_receive_frame(codec.get(), frame.get());
  if (result >= 0) return "";
  std::string reason = avErrorText(result);
  const std::string detail = lastLibraryError();
  if (!detail.empty()) reason += ": " + detail;
  return reason;
}

}  // namespace

FileContent probeFile(const std::string& path, DamagedFrames* damage) {
  Input input;
  if (!input.packet) throw std::bad_alloc();
  // What FFmpeg cannot open or finds no picture in is left to the image reader, which says why
  // it cannot read it either.
  if (avformat_open_input(&input.format, path.c_str(), nullptr, nullptr) < 0 ||
      avformat_find_stream_info(input.format, nullptr) < 0)
    return FileContent::Still;
  const AVCodec* decoder = nullptr;
  const int stream = av_find_best_stream(input.format, AVMEDIA_TYPE_VIDEO, -1, -1, &decoder, 0);
  if (stream < 0) {
    if (av_find_best_stream(input.format, AVMEDIA_TYPE_AUDIO, -1, -1, nullptr, 0) >= 0)
      throw std::runtime_error(path + ": it holds sound but no picture");
    return FileContent::Still;
  }
  const AVStream* video = input.format->streams[stream];
  if (video->codecpar->codec_id == AV_CODEC_ID_WEBP && isAnimatedWebp(path))
    return FileContent::WebpAnimation;
  AVPacket* first = av_packet_alloc();
  std::unique_ptr<AVPacket, void (*)(AVPacket*)> kept(first,
                                                      [](AVPacket* p) { av_packet_free(&p); });
  if (!first) throw std::bad_alloc();
  int pictures = 0;
  while (pictures < 2 && av_read_frame(input.format, input.packet) >= 0) {
    if (input.packet->stream_index == stream && pictures++ == 0) av_packet_ref(first, input.packet);
    av_packet_unref(input.packet);
  }
  if (pictures > 1 || !holdsPictures(input.format->iformat)) return FileContent::Video;
  if (!decoder || pictures == 0 || !decodesWhole(video->codecpar->codec_id))
    return FileContent::Still;
  const std::string failure = pictureFailure(video, decoder, first, false);
  if (!failure.empty())
    throw std::runtime_error(path + ": cannot read image: its data is damaged (" + failure + ")");
  const std::string partial = pictureFailure(video, decoder, first, true);
  if (!partial.empty() && damage) damage->record(0, partial);
  return FileContent::Still;
}

}  // namespace refhost
