// FFmpeg demuxing, decoding, seeking and conversion for VideoReader: frames chosen by their
// presentation time, converted to RGBA with the stream's own colour description and depth, and
// turned upright at display size.
#include "refhost/media/video_reader.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/display.h>
#include <libavutil/imgutils.h>
#include <libavutil/pixdesc.h>
#include <libswscale/swscale.h>
}

#include <algorithm>
#include <array>
#include <cmath>
#include <condition_variable>
#include <cstdarg>
#include <cstring>
#include <mutex>
#include <stdexcept>
#include <thread>
#include <vector>

namespace refhost {
namespace {

// Asking for a frame at most this far ahead of the last one decodes on instead of seeking.
constexpr int32_t kDecodeAheadLimit = 48;
// Times asked this little before a frame's presentation count as that frame: a composition's
// n / rate lands a rounding error short of the same instant in the stream's time base.
constexpr double kTimeSlack = 1e-6;

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

// The plain twin of each JPEG-style pixel format, whose name alone says "full range": the
// scaler is told the range explicitly instead.
AVPixelFormat withoutJpegRange(AVPixelFormat format) {
  switch (format) {
    case AV_PIX_FMT_YUVJ420P:
      return AV_PIX_FMT_YUV420P;
    case AV_PIX_FMT_YUVJ422P:
      return AV_PIX_FMT_YUV422P;
    case AV_PIX_FMT_YUVJ444P:
      return AV_PIX_FMT_YUV444P;
    case AV_PIX_FMT_YUVJ440P:
      return AV_PIX_FMT_YUV440P;
    case AV_PIX_FMT_YUVJ411P:
      return AV_PIX_FMT_YUV411P;
    default:
      return format;
  }
}

bool isRgb(AVPixelFormat format) {
  const AVPixFmtDescriptor* descriptor = av_pix_fmt_desc_get(format);
  return descriptor && (descriptor->flags & AV_PIX_FMT_FLAG_RGB);
}

// What the stream's pictures are, as tagged, with the usual guesses for what is not: the
// height's matrix, primaries and transfer, and limited range.
ColourDescription colourOf(const AVCodecContext* codec) {
  const AVPixelFormat format = codec->pix_fmt;
  ColourDescription colour =
      isRgb(format) ? ColourDescription::bt709() : ColourDescription::guessedFor(codec->height);
  if (codec->colorspace != AVCOL_SPC_UNSPECIFIED && codec->colorspace != AVCOL_SPC_RESERVED)
    colour.matrix = codec->colorspace;
  if (codec->color_primaries != AVCOL_PRI_UNSPECIFIED &&
      codec->color_primaries != AVCOL_PRI_RESERVED && codec->color_primaries != AVCOL_PRI_RESERVED0)
    colour.primaries = codec->color_primaries;
  if (codec->color_trc != AVCOL_TRC_UNSPECIFIED && codec->color_trc != AVCOL_TRC_RESERVED &&
      codec->color_trc != AVCOL_TRC_RESERVED0)
    colour.transfer = codec->color_trc;
  colour.fullRange = codec->color_range == AVCOL_RANGE_JPEG || withoutJpegRange(format) != format;
  // RGB pictures have no matrix and use every code value, whatever a tag says.
  if (isRgb(format)) {
    colour.matrix = AVCOL_SPC_RGB;
    colour.fullRange = true;
  }
  return colour;
}

// The scaler's table for a matrix; those it has no table for (YCgCo) get its default, BT.601.
int scalerMatrix(int32_t matrix) {
  switch (matrix) {
    case ColourDescription::kMatrixBt709:
      return SWS_CS_ITU709;
    case AVCOL_SPC_FCC:
      return SWS_CS_FCC;
    case AVCOL_SPC_SMPTE240M:
      return SWS_CS_SMPTE240M;
    case ColourDescription::kMatrixBt2020:
    case ColourDescription::kMatrixBt2020Constant:
      return SWS_CS_BT2020;
    default:
      return SWS_CS_ITU601;
  }
}

// The one line that refuses a stream the host would show with wrong colours: it renders SDR
// BT.709/BT.601 and has no tone or gamut mapping. Empty for a stream it shows.
std::string refusalOf(const ColourDescription& colour) {
  if (!colour.isHdr() && !colour.isWideGamut()) return "";
  std::string carried;
  auto add = [&](const std::string& what) { carried += (carried.empty() ? "" : ", ") + what; };
  if (colour.isHdr()) add("transfer " + transferName(colour.transfer));
  if (colour.primaries == ColourDescription::kPrimariesBt2020)
    add("primaries " + primariesName(colour.primaries));
  if (colour.matrix == ColourDescription::kMatrixBt2020 ||
      colour.matrix == ColourDescription::kMatrixBt2020Constant)
    add("matrix " + matrixName(colour.matrix));
  return (colour.isHdr() ? "HDR video (" : "wide-gamut video (") + carried +
         ") is not shown by this host: it renders in SDR BT.709/BT.601; convert it first (for "
         "example with ffmpeg's zscale" +
         (colour.isHdr() ? " and tonemap filters)" : " filter)");
}

// How the stored picture is turned to be shown: a displayed pixel (x', y') comes from the stored
// (x, y) with x' = a x + c y and y' = b x + d y, counted from the far edge where negative. The
// display matrix of the stream says so; only right angles and flips are honoured, as players do
// without a rotate filter.
struct Orientation {
  int a = 1, b = 0, c = 0, d = 1;

  bool transposes() const { return a == 0; }
  // Needs no pass of its own: the scaler writes rows in either order.
  bool rowOrderOnly() const { return a == 1 && b == 0 && c == 0; }
};

Orientation orientationOf(const AVStream* video) {
  Orientation orientation;
  const auto* matrix = reinterpret_cast<const int32_t*>(
      av_stream_get_side_data(video, AV_PKT_DATA_DISPLAYMATRIX, nullptr));
  if (!matrix) return orientation;
  const double rotation = av_display_rotation_get(matrix);
  if (std::isnan(rotation)) return orientation;
  const double quarter = rotation / 90.0;
  if (std::fabs(quarter - std::round(quarter)) > 1.0 / 90.0) return orientation;
  // Each of a, b, c, d in 16.16 fixed point is -1, 0 or 1 times the scale here.
  auto unit = [](int32_t value) { return value > 0x8000 ? 1 : value < -0x8000 ? -1 : 0; };
  Orientation turned{unit(matrix[0]), unit(matrix[1]), unit(matrix[3]), unit(matrix[4])};
  const bool straight = turned.b == 0 && turned.c == 0 && turned.a != 0 && turned.d != 0;
  const bool crossed = turned.a == 0 && turned.d == 0 && turned.b != 0 && turned.c != 0;
  return straight || crossed ? turned : orientation;
}

// Half floats of v / white for every 16-bit value v.
std::vector<uint16_t> halvesBelow(uint16_t white) {
  std::vector<uint16_t> values(65536);
  for (uint32_t v = 0; v < values.size(); ++v)
    values[v] = halfFromFloat(static_cast<float>(static_cast<double>(v) / white));
  return values;
}

// Calls shown(i, s) for every displayed pixel: i counts the `width` x `height` displayed pixels
// bottom row first, as GL keeps them; s is the index of the stored pixel it shows, of the
// stored picture (`storedWidth` wide, top row first) that the orientation turns upright.
template <typename Shown>
void forEachShown(const Orientation& orientation, int32_t storedWidth, int32_t storedHeight,
                  int32_t width, int32_t height, Shown shown) {
  // The stored pixel of the displayed top left, and the steps for a displayed step right and
  // down.
  std::ptrdiff_t origin, stepX, stepY;
  if (!orientation.transposes()) {
    origin = (orientation.a > 0 ? 0 : storedWidth - 1) +
             static_cast<std::ptrdiff_t>(orientation.d > 0 ? 0 : storedHeight - 1) * storedWidth;
    stepX = orientation.a;
    stepY = static_cast<std::ptrdiff_t>(orientation.d) * storedWidth;
  } else {
    origin = (orientation.b > 0 ? 0 : storedWidth - 1) +
             static_cast<std::ptrdiff_t>(orientation.c > 0 ? 0 : storedHeight - 1) * storedWidth;
    stepX = static_cast<std::ptrdiff_t>(orientation.c) * storedWidth;
    stepY = orientation.b;
  }
  auto row = [&](int32_t y) { return static_cast<std::size_t>(height - 1 - y) * width; };
  if (!orientation.transposes()) {
    for (int32_t y = 0; y < height; ++y) {
      const std::size_t first = row(y);
      const std::ptrdiff_t start = origin + y * stepY;
      for (int32_t x = 0; x < width; ++x) shown(first + x, start + x * stepX);
    }
    return;
  }
  // Displayed columns are stored rows: tiles of a few displayed rows read each stored row along
  // instead of across.
  constexpr int32_t kTile = 16;
  for (int32_t top = 0; top < height; top += kTile) {
    const int32_t bottom = std::min(top + kTile, height);
    for (int32_t x = 0; x < width; ++x)
      for (int32_t y = top; y < bottom; ++y) shown(row(y) + x, origin + x * stepX + y * stepY);
  }
}

uint16_t littleEndian16(const uint8_t* bytes) {
  return static_cast<uint16_t>(bytes[0] | bytes[1] << 8);
}

// A conversion from a decoded size and format to an output size and format. Pictures in YUV
// are converted with the stream's matrix and range to RGB that uses every code value.
SwsContext* scalerBetween(int32_t width, int32_t height, AVPixelFormat from, int32_t toWidth,
                          int32_t toHeight, AVPixelFormat to, const ColourDescription& colour) {
  SwsContext* context = sws_getContext(width, height, withoutJpegRange(from), toWidth, toHeight, to,
                                       SWS_BILINEAR, nullptr, nullptr, nullptr);
  if (!context) return nullptr;
  const int* matrix = sws_getCoefficients(scalerMatrix(colour.matrix));
  const int range = colour.fullRange ? 1 : 0;
  if (!isRgb(from))
    sws_setColorspaceDetails(context, matrix, range, matrix, 1, 0, 1 << 16, 1 << 16);
  return context;
}

// Where the scaler puts white in 16-bit RGB from the format: not always at 65535 but at 65280,
// 65283 or 65472 by the format and range (it scales some depths by shifting), which would
// leave deep pictures up to 0.4% darker than the same pictures in 8 bits. Measured by
// converting a white picture of the format through the same conversion; 65535 for formats that
// cannot be written component by component.
uint16_t whiteIn16Bits(int32_t width, int32_t height, AVPixelFormat from, int32_t toWidth,
                       int32_t toHeight, AVPixelFormat to, const ColourDescription& colour) {
  const AVPixFmtDescriptor* pixels = av_pix_fmt_desc_get(from);
  const uint64_t unwritable = AV_PIX_FMT_FLAG_PAL | AV_PIX_FMT_FLAG_FLOAT |
                              AV_PIX_FMT_FLAG_HWACCEL | AV_PIX_FMT_FLAG_BITSTREAM;
  if (!pixels || (pixels->flags & unwritable)) return 65535;
  uint8_t* picture[4] = {};
  int strides[4] = {};
  const int size = av_image_alloc(picture, strides, width, height, from, 64);
  if (size < 0) return 65535;
  std::memset(picture[0], 0, static_cast<std::size_t>(size));  // components are ORed in
  const bool rgb = isRgb(from);
  std::vector<uint16_t> line(static_cast<std::size_t>(width));
  for (int c = 0; c < pixels->nb_components; ++c) {
    const int depth = pixels->comp[c].depth, top = (1 << depth) - 1;
    const bool alpha = (pixels->flags & AV_PIX_FMT_FLAG_ALPHA) && c == pixels->nb_components - 1;
    const bool chroma = !rgb && !alpha && c > 0;
    int value = top;  // RGB, alpha and full-range luma
    if (chroma) value = 1 << (depth - 1);
    if (!rgb && !alpha && c == 0 && !colour.fullRange && depth >= 8) value = 235 << (depth - 8);
    std::fill(line.begin(), line.end(), static_cast<uint16_t>(value));
    const int lines = chroma ? AV_CEIL_RSHIFT(height, pixels->log2_chroma_h) : height;
    const int length = chroma ? AV_CEIL_RSHIFT(width, pixels->log2_chroma_w) : width;
    for (int y = 0; y < lines; ++y)
      av_write_image_line2(line.data(), picture, strides, pixels, 0, y, c, length, 2);
  }
  uint16_t white = 65535;
  uint8_t* back[4] = {};
  int backStrides[4] = {};
  SwsContext* scaler = scalerBetween(width, height, from, toWidth, toHeight, to, colour);
  if (scaler && av_image_alloc(back, backStrides, toWidth, toHeight, to, 64) >= 0) {
    sws_scale(scaler, picture, strides, 0, height, back, backStrides);
    uint16_t red = 0;  // component 0 is red in every RGB format
    av_read_image_line2(&red, const_cast<const uint8_t**>(back), backStrides,
                        av_pix_fmt_desc_get(to), toWidth / 2, toHeight / 2, 0, 1, 0, 2);
    if (red > 0xF000) white = red;  // anything else is no white: keep the nominal one
  }
  av_freep(&back[0]);
  sws_freeContext(scaler);
  av_freep(&picture[0]);
  return white;
}

// A conversion kept while the sizes and formats stay; for 16 bits, with the table from its
// output to half floats.
struct Scaler {
  SwsContext* context = nullptr;
  std::array<int, 6> key{};
  std::vector<uint16_t> halves;

  ~Scaler() { sws_freeContext(context); }
};

// Large pictures are converted at most as many at a time as the machine has cores: more could
// not run faster, and each holds its picture and a scratch copy (100 MB and more for 4K in
// half floats) while it runs.
class ConversionSlots {
 public:
  ConversionSlots() : free_(std::max(1u, std::thread::hardware_concurrency())) {}
  void take() {
    std::unique_lock<std::mutex> lock(mutex_);
    freed_.wait(lock, [this] { return free_ > 0; });
    --free_;
  }
  void giveBack() {
    {
      std::lock_guard<std::mutex> lock(mutex_);
      ++free_;
    }
    freed_.notify_one();
  }

 private:
  std::mutex mutex_;
  std::condition_variable freed_;
  unsigned free_;
};

ConversionSlots& largeConversions() {
  static ConversionSlots slots;
  return slots;
}

}  // namespace

struct VideoReader::Decoder {
  std::string path;
  AVFormatContext* format = nullptr;
  AVCodecContext* codec = nullptr;
  AVPacket* packet = nullptr;
  AVFrame* decoded = nullptr;  // scratch for avcodec_receive_frame
  AVFrame* current = nullptr;  // the last frame decoded
  Scaler eightBits, sixteenBits;
  // The converted picture before it is turned upright. Kept for the next frame up to about a
  // 1080p picture; a larger one is given back after each frame, since many large media may be
  // open at once and allocating it again costs little next to converting it.
  std::vector<uint8_t> stored;
  static constexpr std::size_t kStoredKeptUpTo = std::size_t{16} << 20;
  int stream = -1;
  AVRational timeBase{1, 25};
  // Every frame's presentation time in the stream's time base, in presentation order.
  std::vector<int64_t> times;
  int32_t currentIndex = -1;    // index of `current`; -1 when none since the last seek
  int32_t firstSinceSeek = -1;  // index of the first frame decoded since the last seek
  Orientation orientation;
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

    info.colour = colourOf(codec);
    const std::string refusal = refusalOf(info.colour);
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

  // The display size: the sample aspect ratio widens or narrows the picture at its height, as
  // players size their window, after the display matrix has turned it upright.
  void measure(AVStream* video) {
    orientation = orientationOf(video);
    int32_t width = codec->width, height = codec->height;
    AVRational sar = av_guess_sample_aspect_ratio(format, video, nullptr);
    if (orientation.transposes()) {
      std::swap(width, height);
      sar = av_inv_q(sar);
    }
    if (sar.num > 0 && sar.den > 0 && av_cmp_q(sar, AVRational{1, 1}) != 0)
      width = static_cast<int32_t>(std::max<int64_t>(1, av_rescale(width, sar.num, sar.den)));
    info.width = width;
    info.height = height;
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

  SwsContext* scalerFor(Scaler& scaler, int32_t width, int32_t height, AVPixelFormat to) {
    const AVPixelFormat from = static_cast<AVPixelFormat>(current->format);
    const std::array<int, 6> key{current->width, current->height, from, width, height, to};
    if (scaler.context && scaler.key == key) return scaler.context;
    sws_freeContext(scaler.context);
    scaler.key = key;
    scaler.context =
        scalerBetween(current->width, current->height, from, width, height, to, info.colour);
    if (!scaler.context) fail("no conversion to RGBA");
    if (to != AV_PIX_FMT_RGBA)
      scaler.halves = halvesBelow(
          whiteIn16Bits(current->width, current->height, from, width, height, to, info.colour));
    return scaler.context;
  }

  // Converts the current frame to the size and format upright, into `to`, bottom row first.
  void convert(int32_t width, int32_t height, PixelFormat format, uint8_t* to) {
    // Pictures shown sideways are converted at the size they have before turning.
    const int32_t storedWidth = orientation.transposes() ? height : width;
    const int32_t storedHeight = orientation.transposes() ? width : height;
    const std::size_t pixels = static_cast<std::size_t>(storedWidth) * storedHeight;
    if (format == PixelFormat::Rgba8) {
      SwsContext* scaler = scalerFor(eightBits, storedWidth, storedHeight, AV_PIX_FMT_RGBA);
      if (orientation.rowOrderOnly()) {
        // Straight into place: upright rows bottom first are the stored rows in reverse, or in
        // order for a picture shown upside down.
        const bool flipped = orientation.d < 0;
        const int row = 4 * width;
        uint8_t* planes[4] = {flipped ? to : to + static_cast<std::size_t>(row) * (height - 1)};
        int strides[4] = {flipped ? row : -row};
        sws_scale(scaler, current->data, current->linesize, 0, current->height, planes, strides);
        return;
      }
      stored.resize(4 * pixels);
      uint8_t* planes[4] = {stored.data()};
      int strides[4] = {4 * storedWidth};
      sws_scale(scaler, current->data, current->linesize, 0, current->height, planes, strides);
      forEachShown(orientation, storedWidth, storedHeight, width, height,
                   [&](std::size_t shown, std::ptrdiff_t source) {
                     std::memcpy(to + 4 * shown, stored.data() + 4 * source, 4);
                   });
      return;
    }
    // Deep pictures go through planar 16-bit RGB, which the scaler writes several times faster
    // than packed, and on to half floats through the table, turned upright on the way.
    const AVPixFmtDescriptor* decodedPixels =
        av_pix_fmt_desc_get(static_cast<AVPixelFormat>(current->format));
    const bool alpha = decodedPixels && (decodedPixels->flags & AV_PIX_FMT_FLAG_ALPHA);
    SwsContext* scaler = scalerFor(sixteenBits, storedWidth, storedHeight,
                                   alpha ? AV_PIX_FMT_GBRAP16LE : AV_PIX_FMT_GBRP16LE);
    stored.resize(2 * pixels * (alpha ? 4 : 3));
    uint8_t* planes[4] = {stored.data(), stored.data() + 2 * pixels, stored.data() + 4 * pixels,
                          alpha ? stored.data() + 6 * pixels : nullptr};
    const int stride = 2 * storedWidth;
    int strides[4] = {stride, stride, stride, alpha ? stride : 0};
    sws_scale(scaler, current->data, current->linesize, 0, current->height, planes, strides);
    static const std::vector<uint16_t> opacities = halvesBelow(65535);
    constexpr uint16_t kOpaque = 0x3C00;  // 1 as a half float
    const uint16_t* halves = sixteenBits.halves.data();
    const uint8_t *green = planes[0], *blue = planes[1], *red = planes[2], *opacity = planes[3];
    forEachShown(orientation, storedWidth, storedHeight, width, height,
                 [&](std::size_t shown, std::ptrdiff_t source) {
                   const uint16_t pixel[4] = {
                       halves[littleEndian16(red + 2 * source)],
                       halves[littleEndian16(green + 2 * source)],
                       halves[littleEndian16(blue + 2 * source)],
                       opacity ? opacities[littleEndian16(opacity + 2 * source)] : kOpaque};
                   std::memcpy(to + 8 * shown, pixel, 8);
                 });
  }
};

VideoReader::VideoReader(const std::string& path) : decoder_(std::make_unique<Decoder>()) {
  decoder_->path = path;
  // The libraries' messages would bury the command line's own output; errors are kept for the
  // one line a failure gives.
  av_log_set_callback(keepLibraryError);
  lastLibraryError.clear();
  decoder_->open();
}

VideoReader::~VideoReader() = default;

const MediaInfo& VideoReader::info() const { return decoder_->info; }

std::vector<uint8_t> VideoReader::glRowsAt(double seconds, int32_t width, int32_t height,
                                           PixelFormat format) {
  lastLibraryError.clear();
  decoder_->show(decoder_->frameShownAt(seconds));
  width = std::max(width, 0);
  height = std::max(height, 0);
  const std::size_t bytes = bytesPerPixel(format) * width * height;
  const bool large = bytes > Decoder::kStoredKeptUpTo;
  if (large) largeConversions().take();
  std::vector<uint8_t> rows;
  try {
    rows.resize(bytes);
    if (!rows.empty()) decoder_->convert(width, height, format, rows.data());
  } catch (...) {
    if (large) largeConversions().giveBack();
    throw;
  }
  if (decoder_->stored.capacity() > Decoder::kStoredKeptUpTo)
    std::vector<uint8_t>().swap(decoder_->stored);
  if (large) largeConversions().giveBack();
  return rows;
}

RgbaImage VideoReader::frameAt(double seconds, int32_t width, int32_t height, PixelFormat format) {
  RgbaImage picture(width, height, format);
  picture.pixels = flipRows(glRowsAt(seconds, width, height, format), width, height);
  return picture;
}

}  // namespace refhost
