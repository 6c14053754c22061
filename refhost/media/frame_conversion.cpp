// Converting decoded frames with the scaler: its matrix and range set from the stream's colour,
// white measured where the scaler puts it in 16 bits, and the rows placed upright in GL's order.
#include "refhost/media/frame_conversion.h"

extern "C" {
#include <libavutil/frame.h>
#include <libavutil/imgutils.h>
#include <libavutil/pixdesc.h>
#include <libswscale/swscale.h>
}

#include <algorithm>
#include <condition_variable>
#include <cstring>
#include <mutex>
#include <stdexcept>
#include <thread>

#include "refhost/media/stream_colour.h"

namespace refhost {
namespace {

// Pictures above this many bytes are large: their scratch copy is given back after each frame,
// and they are converted in one of the slots below.
constexpr std::size_t kStoredKeptUpTo = std::size_t{16} << 20;
// The scaler's vector code writes whole registers, up to this many bytes past the end of a row
// whose width is no multiple of theirs; the buffers it writes end with that much room.
constexpr std::size_t kScalerOverrun = 256;

// Half floats of v / white for every 16-bit value v.
std::vector<uint16_t> halvesBelow(uint16_t white) {
  std::vector<uint16_t> values(65536);
  for (uint32_t v = 0; v < values.size(); ++v)
    values[v] = halfFromFloat(static_cast<float>(static_cast<double>(v) / white));
  return values;
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

FrameConverter::FrameConverter(const ColourDescription& colour, const Orientation& orientation)
    : colour_(colour), orientation_(orientation) {}

FrameConverter::~FrameConverter() {
  sws_freeContext(eightBits_.context);
  sws_freeContext(sixteenBits_.context);
}

std::vector<uint8_t> FrameConverter::glRows(const AVFrame* frame, int32_t width, int32_t height,
                                            PixelFormat format) {
  width = std::max(width, 0);
  height = std::max(height, 0);
  const std::size_t bytes = bytesPerPixel(format) * width * height;
  const bool large = bytes > kStoredKeptUpTo;
  if (large) largeConversions().take();
  std::vector<uint8_t> rows;
  try {
    rows.resize(bytes + kScalerOverrun);
    if (bytes > 0) convert(frame, width, height, format, rows.data());
    rows.resize(bytes);
  } catch (...) {
    if (large) largeConversions().giveBack();
    throw;
  }
  if (stored_.capacity() > kStoredKeptUpTo) std::vector<uint8_t>().swap(stored_);
  if (large) largeConversions().giveBack();
  return rows;
}

SwsContext* FrameConverter::scalerFor(Scaler& scaler, const AVFrame* frame, int32_t width,
                                      int32_t height, int to) {
  const AVPixelFormat from = static_cast<AVPixelFormat>(frame->format);
  const AVPixelFormat output = static_cast<AVPixelFormat>(to);
  const std::array<int, 6> key{frame->width, frame->height, from, width, height, to};
  if (scaler.context && scaler.key == key) return scaler.context;
  sws_freeContext(scaler.context);
  scaler.key = key;
  scaler.context = scalerBetween(frame->width, frame->height, from, width, height, output, colour_);
  if (!scaler.context) throw std::runtime_error("no conversion to RGBA");
  if (output != AV_PIX_FMT_RGBA)
    scaler.halves = halvesBelow(
        whiteIn16Bits(frame->width, frame->height, from, width, height, output, colour_));
  return scaler.context;
}

void FrameConverter::convert(const AVFrame* frame, int32_t width, int32_t height,
                             PixelFormat format, uint8_t* to) {
  // Pictures shown sideways are converted at the size they have before turning.
  const int32_t storedWidth = orientation_.transposes() ? height : width;
  const int32_t storedHeight = orientation_.transposes() ? width : height;
  const std::size_t pixels = static_cast<std::size_t>(storedWidth) * storedHeight;
  if (format == PixelFormat::Rgba8) {
    SwsContext* scaler = scalerFor(eightBits_, frame, storedWidth, storedHeight, AV_PIX_FMT_RGBA);
    if (orientation_.rowOrderOnly()) {
      // Straight into place: the scaler writes each stored row where GL's order puts the row it
      // shows, a picture shown upside down being the stored rows in their own order.
      const bool flipped = orientation_.d < 0;
      const int row = 4 * width;
      const int32_t top = flipped ? glRowOf(height - 1, height) : glRowOf(0, height);
      uint8_t* planes[4] = {to + static_cast<std::size_t>(row) * top};
      int strides[4] = {flipped ? row : -row};
      sws_scale(scaler, frame->data, frame->linesize, 0, frame->height, planes, strides);
      return;
    }
    stored_.resize(4 * pixels + kScalerOverrun);
    uint8_t* planes[4] = {stored_.data()};
    int strides[4] = {4 * storedWidth};
    sws_scale(scaler, frame->data, frame->linesize, 0, frame->height, planes, strides);
    forEachShown(orientation_, storedWidth, storedHeight, width, height,
                 [&](std::size_t shown, std::ptrdiff_t source) {
                   std::memcpy(to + 4 * shown, stored_.data() + 4 * source, 4);
                 });
    return;
  }
  // Deep pictures go through planar 16-bit RGB, which the scaler writes several times faster
  // than packed, and on to half floats through the table, turned upright on the way.
  const AVPixFmtDescriptor* decodedPixels =
      av_pix_fmt_desc_get(static_cast<AVPixelFormat>(frame->format));
  const bool alpha = decodedPixels && (decodedPixels->flags & AV_PIX_FMT_FLAG_ALPHA);
  SwsContext* scaler = scalerFor(sixteenBits_, frame, storedWidth, storedHeight,
                                 alpha ? AV_PIX_FMT_GBRAP16LE : AV_PIX_FMT_GBRP16LE);
  // Each plane followed by room for the scaler's overrun, which would land in the next.
  const std::size_t plane = 2 * pixels + kScalerOverrun;
  stored_.resize(plane * (alpha ? 4 : 3));
  uint8_t* planes[4] = {stored_.data(), stored_.data() + plane, stored_.data() + 2 * plane,
                        alpha ? stored_.data() + 3 * plane : nullptr};
  const int stride = 2 * storedWidth;
  int strides[4] = {stride, stride, stride, alpha ? stride : 0};
  sws_scale(scaler, frame->data, frame->linesize, 0, frame->height, planes, strides);
  static const std::vector<uint16_t> opacities = halvesBelow(65535);
  constexpr uint16_t kOpaque = 0x3C00;  // 1 as a half float
  const uint16_t* halves = sixteenBits_.halves.data();
  const uint8_t *green = planes[0], *blue = planes[1], *red = planes[2], *opacity = planes[3];
  forEachShown(orientation_, storedWidth, storedHeight, width, height,
               [&](std::size_t shown, std::ptrdiff_t source) {
                 const uint16_t pixel[4] = {
                     halves[littleEndian16(red + 2 * source)],
                     halves[littleEndian16(green + 2 * source)],
                     halves[littleEndian16(blue + 2 * source)],
                     opacity ? opacities[littleEndian16(opacity + 2 * source)] : kOpaque};
                 std::memcpy(to + 8 * shown, pixel, 8);
               });
}

}  // namespace refhost
