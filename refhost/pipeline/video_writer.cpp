// FFmpeg muxing and encoding for VideoWriter: the encoder of the codec asked for, pictures
// converted to its YUV format with the matrix and range asked for, and the stream tagged with
// the whole colour description.
#include "refhost/pipeline/video_writer.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/opt.h>
#include <libavutil/pixdesc.h>
#include <libswscale/swscale.h>
}

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <stdexcept>

#include "refhost/media/audio_track.h"
#include "refhost/media/ffmpeg_utilities.h"

namespace refhost {
namespace {

// Half floats to 16 bits a channel, clamped to 0 to 1 and rounded, one lookup a sample.
const std::vector<uint16_t>& sixteenBitsOfHalf() {
  static const std::vector<uint16_t> table = [] {
    std::vector<uint16_t> values(65536);
    for (uint32_t half = 0; half < values.size(); ++half) {
      const float value = floatFromHalf(static_cast<uint16_t>(half));
      const float clamped = std::isnan(value) ? 0.0f : std::clamp(value, 0.0f, 1.0f);
      values[half] = static_cast<uint16_t>(std::lround(clamped * 65535.0f));
    }
    return values;
  }();
  return table;
}

// The matrices swscale converts with.
bool swscaleHasMatrix(int32_t matrix) {
  using C = ColourDescription;
  for (int32_t known : {C::kMatrixBt709, C::kMatrixFcc, C::kMatrixBt470bg, C::kMatrixSmpte170m,
                        C::kMatrixSmpte240m, C::kMatrixBt2020, C::kMatrixBt2020Constant})
    if (matrix == known) return true;
  return false;
}

}  // namespace

// FFmpeg's muxers are named as the containers' file extensions, but for Matroska's.
const char* muxerName(VideoContainer container) {
  return container == VideoContainer::Mkv ? "matroska" : containerExtension(container);
}

// Apple's players take HEVC in MP4 and QuickTime files only under this tag.
uint32_t videoCodecTag(const std::string& coding, VideoContainer container) {
  return coding == "hevc" && container != VideoContainer::Mkv ? MKTAG('h', 'v', 'c', '1') : 0;
}

bool containerHolds(VideoContainer container, const std::string& codec) {
  // The QuickTime muxer shares MP4's table of codecs, so it answers yes for VP9 and AV1, then
  // refuses them when the header is written.
  if (container == VideoContainer::Mov && (codec == "vp9" || codec == "av1")) return false;
  const VideoCodecInfo* info = findVideoCodec(codec);
  const AVOutputFormat* muxer = av_guess_format(muxerName(container), nullptr, nullptr);
  const AVCodecDescriptor* coding =
      info ? avcodec_descriptor_get_by_name(info->coding.c_str()) : nullptr;
  return muxer && coding && avformat_query_codec(muxer, coding->id, FF_COMPLIANCE_NORMAL) == 1;
}

struct VideoWriter::Encoder {
  std::string path;
  std::string shownName;
  int32_t width = 0, height = 0;  // the pictures written
  VideoEncoding settings;
  AVFormatContext* format = nullptr;
  AVCodecContext* codec = nullptr;
  AVStream* stream = nullptr;
  AVFrame* frame = nullptr;
  AVPacket* packet = nullptr;
  SwsContext* fromRgba8 = nullptr;  // made for the first 8-bit picture
  SwsContext* fromRgb16 = nullptr;  // made for the first half-float picture
  std::vector<uint8_t> padded;      // an 8-bit picture at the encoded size, when that differs
  std::vector<uint16_t> deep;       // a half-float picture's colour, 16 bits a sample
  int64_t nextPts = 0;
  bool headerWritten = false;
  bool finished = false;
  std::string codecName;
  std::string note;
  std::unique_ptr<AudioTrack> audio;  // reads its own input; never touches `format` when freed

  ~Encoder() {
    if (headerWritten && !finished) av_write_trailer(format);
    if (format && format->pb) avio_closep(&format->pb);
    sws_freeContext(fromRgba8);
    sws_freeContext(fromRgb16);
    av_packet_free(&packet);
    av_frame_free(&frame);
    avcodec_free_context(&codec);
    avformat_free_context(format);
  }

  [[noreturn]] void fail(const std::string& what, int code = 0) const {
    throw std::runtime_error(shownName + ": cannot write video: " + what +
                             (code ? " (" + avErrorText(code) + ")" : ""));
  }

  void addNote(const std::string& text) { note += (note.empty() ? "" : "; ") + text; }

  // The first encoder of the codec that this FFmpeg has and that takes the frame's size.
  const EncoderChoice& chooseEncoder(const VideoCodecInfo& info, const AVCodec*& chosen) {
    std::string missing, tooSmall;
    for (const EncoderChoice& choice : info.encoders) {
      if (width < choice.minimumSize || height < choice.minimumSize) {
        tooSmall = choice.name + " takes no frame under " + std::to_string(choice.minimumSize) +
                   "x" + std::to_string(choice.minimumSize);
        continue;
      }
      chosen = avcodec_find_encoder_by_name(choice.name.c_str());
      if (chosen) {
        if (!tooSmall.empty()) addNote(tooSmall + "; encoded with " + choice.name);
        return choice;
      }
      missing += (missing.empty() ? "" : ", ") + choice.name;
    }
    fail("no " + info.name + " encoder for this frame (" +
         (missing.empty() ? tooSmall : missing + " missing from FFmpeg") + ")");
  }

  // The codec's settings as options of its encoder: the fixed ones, then quality and speed.
  AVDictionary* encoderOptions(const VideoCodecInfo& info, const EncoderChoice& choice) const {
    AVDictionary* options = nullptr;
    for (const auto& [key, value] : choice.options)
      av_dict_set(&options, key.c_str(), value.c_str(), 0);
    if (info.defaultCrf)
      av_dict_set_int(&options, "crf", settings.crf.value_or(*info.defaultCrf), 0);
    if (!info.presets.empty())
      av_dict_set(&options, "preset", settings.preset.value_or(info.defaultPreset).c_str(), 0);
    return options;
  }

  void tagColour() {
    const ColourDescription& colour = settings.colour;
    codec->colorspace = static_cast<AVColorSpace>(colour.matrix);
    codec->color_primaries = static_cast<AVColorPrimaries>(colour.primaries);
    codec->color_trc = static_cast<AVColorTransferCharacteristic>(colour.transfer);
    codec->color_range = colour.fullRange ? AVCOL_RANGE_JPEG : AVCOL_RANGE_MPEG;
  }

  void open(VideoContainer container, FrameRate frameRate, const std::vector<AudioClip>& sound) {
    if (auto refusal = refusalOf(settings, container))
      throw std::invalid_argument(shownName + ": cannot write video: " + refusal->reason);
    if (!swscaleHasMatrix(settings.colour.matrix))
      fail("no conversion to the YUV matrix " + matrixName(settings.colour.matrix));
    const VideoCodecInfo& info = *findVideoCodec(settings.codec);
    if (settings.colour.fullRange && !info.fullRange) {
      settings.colour.fullRange = false;
      addNote(info.name + " has no full range; written in limited range");
    }
    int result =
        avformat_alloc_output_context2(&format, nullptr, muxerName(container), path.c_str());
    if (result < 0 || !format) fail("no muxer", result);
    const AVCodec* encoder = nullptr;
    const EncoderChoice& choice = chooseEncoder(info, encoder);
    codecName = encoder->name;
    stream = avformat_new_stream(format, nullptr);
    codec = avcodec_alloc_context3(encoder);
    frame = av_frame_alloc();
    packet = av_packet_alloc();
    if (!stream || !codec || !frame || !packet) fail("out of memory");

    const std::string pixels = encodedPixelFormat(info, settings.bitDepth);
    codec->pix_fmt = av_get_pix_fmt(pixels.c_str());
    bool supported = false;
    for (const AVPixelFormat* f = encoder->pix_fmts; f && *f != AV_PIX_FMT_NONE; ++f)
      supported = supported || *f == codec->pix_fmt;
    if (!supported) fail(codecName + " cannot encode " + pixels);
    // Subsampled chroma covers pixels in pairs: only those directions need an even size.
    int chromaShiftX = 0, chromaShiftY = 0;
    av_pix_fmt_get_chroma_sub_sample(codec->pix_fmt, &chromaShiftX, &chromaShiftY);
    codec->width = chromaShiftX ? (width + 1) & ~1 : width;
    codec->height = chromaShiftY ? (height + 1) & ~1 : height;
    const FrameRate exact = reduced(frameRate.valid() ? frameRate : FrameRate{25, 1});
    const AVRational rate{static_cast<int>(exact.numerator), static_cast<int>(exact.denominator)};
    codec->time_base = av_inv_q(rate);
    codec->framerate = rate;
    // The encoder's own keyframe interval, and as many threads as it wants: the settings the
    // ffmpeg command line uses, so files and speed compare with its.
    codec->thread_count = 0;
    tagColour();
    codec->codec_tag = videoCodecTag(info.coding, container);
    if (settings.piece) makeJoinable(*settings.piece);
    if (format->oformat->flags & AVFMT_GLOBALHEADER) codec->flags |= AV_CODEC_FLAG_GLOBAL_HEADER;
    // SVT-AV1 prints its whole configuration to stderr unless its log level says otherwise.
    if (codecName == "libsvtav1") setenv("SVT_LOG", "1", 0);
    AVDictionary* options = encoderOptions(info, choice);
    result = avcodec_open2(codec, encoder, &options);
    av_dict_free(&options);
    if (result < 0) fail(codecName + " refused the settings", result);
    if ((result = avcodec_parameters_from_context(stream->codecpar, codec)) < 0)
      fail("codec data", result);
    stream->time_base = codec->time_base;
    stream->avg_frame_rate = rate;
    if (!sound.empty()) audio = AudioTrack::open(sound, format);

    if ((result = avio_open(&format->pb, path.c_str(), AVIO_FLAG_WRITE)) < 0)
      fail("cannot create the file", result);
    // QuickTime files keep tags of their own only when asked to.
    AVDictionary* headerOptions = nullptr;
    if (settings.piece) av_dict_set(&headerOptions, "movflags", "+use_metadata_tags", 0);
    result = avformat_write_header(format, &headerOptions);
    av_dict_free(&headerOptions);
    if (result < 0) fail("cannot write the header", result);
    headerWritten = true;

    frame->format = codec->pix_fmt;
    frame->width = codec->width;
    frame->height = codec->height;
    // Some encoders (ProRes) write the pictures' own tags into the stream, not the stream's.
    frame->colorspace = codec->colorspace;
    frame->color_primaries = codec->color_primaries;
    frame->color_trc = codec->color_trc;
    frame->color_range = codec->color_range;
    if ((result = av_frame_get_buffer(frame, 0)) < 0) fail("out of memory", result);
  }

  // A piece of a longer video (see JoinablePiece): GOPs of the same length in every piece and
  // closed, so that none refers to a frame of another piece, and timestamps that go on from
  // the pieces before it.
  void makeJoinable(const JoinablePiece& piece) {
    if (piece.gopLength > 0) codec->gop_size = piece.gopLength;
    codec->flags |= AV_CODEC_FLAG_CLOSED_GOP;
    nextPts = piece.firstFrame;
    for (const auto& [key, value] : piece.tags)
      av_dict_set(&format->metadata, key.c_str(), value.c_str(), 0);
  }

  // A conversion from the RGB format to the encoder's format, with the matrix and range asked
  // for (RGB counts as full range).
  SwsContext* makeScaler(AVPixelFormat from, int flags) {
    SwsContext* scaler =
        sws_getContext(codec->width, codec->height, from, codec->width, codec->height,
                       codec->pix_fmt, flags, nullptr, nullptr, nullptr);
    if (!scaler) fail(std::string("no conversion from ") + av_get_pix_fmt_name(from));
    sws_setColorspaceDetails(scaler, sws_getCoefficients(SWS_CS_DEFAULT), 1,
                             sws_getCoefficients(settings.colour.matrix),
                             settings.colour.fullRange ? 1 : 0, 0, 1 << 16, 1 << 16);
    return scaler;
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
    padded.resize(static_cast<std::size_t>(codec->width) * static_cast<std::size_t>(codec->height) *
                  4);
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

  // The half-float picture's colour as planes of 16-bit green, blue and red at the encoded
  // size, padded as padPicture pads. Planar is the layout swscale converts fastest from 16 bits
  // (several times faster than packed RGBA64), and video keeps no alpha.
  void deepenPicture(const RgbaImage& image) {
    const std::vector<uint16_t>& table = sixteenBitsOfHalf();
    const std::size_t rowLength = static_cast<std::size_t>(codec->width);
    const std::size_t plane = rowLength * static_cast<std::size_t>(codec->height);
    deep.resize(plane * 3);
    uint16_t* green = deep.data();
    uint16_t* blue = green + plane;
    uint16_t* red = blue + plane;
    const auto* halves = reinterpret_cast<const uint16_t*>(image.pixels.data());
    for (int32_t y = 0; y < codec->height; ++y) {
      const uint16_t* row = halves + static_cast<std::size_t>(std::min(y, height - 1)) * width * 4;
      std::size_t at = static_cast<std::size_t>(y) * rowLength;
      for (int32_t x = 0; x < codec->width; ++x, ++at) {
        const uint16_t* pixel = row + static_cast<std::size_t>(std::min(x, width - 1)) * 4;
        red[at] = table[pixel[0]];
        green[at] = table[pixel[1]];
        blue[at] = table[pixel[2]];
      }
    }
  }
};

VideoWriter::VideoWriter(const std::string& path, VideoContainer container, int32_t width,
                         int32_t height, FrameRate frameRate, const VideoEncoding& encoding,
                         const std::string& shownName, const std::vector<AudioClip>& audio)
    : encoder_(std::make_unique<Encoder>()) {
  encoder_->path = path;
  encoder_->shownName = shownName.empty() ? path : shownName;
  encoder_->settings = encoding;
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
  int result = av_frame_make_writable(e.frame);
  if (result < 0) e.fail("out of memory", result);
  const uint8_t* planes[4] = {nullptr, nullptr, nullptr, nullptr};
  int strides[4] = {0, 0, 0, 0};
  SwsContext* scaler = nullptr;
  if (picture.format == PixelFormat::Rgba8) {
    // An even-sized picture is converted as it is; only an odd one is padded first.
    const bool even = e.codec->width == e.width && e.codec->height == e.height;
    if (!even) e.padPicture(picture);
    if (!e.fromRgba8) e.fromRgba8 = e.makeScaler(AV_PIX_FMT_RGBA, SWS_BILINEAR);
    scaler = e.fromRgba8;
    planes[0] = even ? picture.pixels.data() : e.padded.data();
    strides[0] = e.codec->width * 4;
  } else {
    e.deepenPicture(picture);
    // Exact rounding keeps the precision the deeper samples were converted for.
    if (!e.fromRgb16)
      e.fromRgb16 = e.makeScaler(AV_PIX_FMT_GBRP16, SWS_BILINEAR | SWS_ACCURATE_RND);
    scaler = e.fromRgb16;
    const std::size_t plane =
        static_cast<std::size_t>(e.codec->width) * static_cast<std::size_t>(e.codec->height);
    for (int p = 0; p < 3; ++p) {
      planes[p] = reinterpret_cast<const uint8_t*>(e.deep.data() + plane * p);
      strides[p] = e.codec->width * 2;
    }
  }
  sws_scale(scaler, planes, strides, 0, e.codec->height, e.frame->data, e.frame->linesize);
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
