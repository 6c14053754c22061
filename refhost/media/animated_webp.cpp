// Reading animated WebP with libwebp's demuxer (frame times) and animation decoder (frames
// composed onto the canvas), decoding on in order and starting over for an earlier frame.
#include "refhost/media/animated_webp.h"

#include <webp/demux.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <fstream>
#include <iterator>
#include <map>
#include <stdexcept>

namespace refhost {
namespace {

std::vector<uint8_t> fileBytes(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return std::vector<uint8_t>(std::istreambuf_iterator<char>(in), {});
}

// Each frame's duration in milliseconds, or nothing when the bytes are no WebP libwebp reads.
std::vector<int> frameDurations(const std::vector<uint8_t>& bytes) {
  const WebPData data{bytes.data(), bytes.size()};
  WebPDemuxer* demuxer = WebPDemux(&data);
  std::vector<int> durations;
  if (!demuxer) return durations;
  WebPIterator frame;
  if (WebPDemuxGetFrame(demuxer, 1, &frame)) {
    do durations.push_back(std::max(frame.duration, 1));
    while (WebPDemuxNextFrame(&frame));
    WebPDemuxReleaseIterator(&frame);
  }
  WebPDemuxDelete(demuxer);
  return durations;
}

}  // namespace

bool isAnimatedWebp(const std::string& path) {
  // Only a file that starts as WebP does is read whole.
  char header[12] = {};
  std::ifstream(path, std::ios::binary).read(header, sizeof header);
  if (std::memcmp(header, "RIFF", 4) != 0 || std::memcmp(header + 8, "WEBP", 4) != 0) return false;
  return frameDurations(fileBytes(path)).size() > 1;
}

struct WebpAnimationSource::Decoder {
  std::vector<uint8_t> bytes;  // the decoder reads them in place
  WebPAnimDecoder* decoder = nullptr;
  int32_t decodedIndex = -1;  // the frame `canvas` holds
  RgbaImage canvas;

  ~Decoder() { WebPAnimDecoderDelete(decoder); }
};

WebpAnimationSource::WebpAnimationSource(const std::string& path, FrameRate compositionRate)
    : decoder_(std::make_unique<Decoder>()), rate_(compositionRate) {
  decoder_->bytes = fileBytes(path);
  const std::vector<int> durations = frameDurations(decoder_->bytes);
  WebPAnimDecoderOptions options;
  if (durations.empty() || !WebPAnimDecoderOptionsInit(&options))
    throw std::runtime_error(path + ": cannot read image: libwebp cannot read it as WebP");
  options.color_mode = MODE_RGBA;  // straight, not premultiplied, alpha
  options.use_threads = 0;
  const WebPData data{decoder_->bytes.data(), decoder_->bytes.size()};
  decoder_->decoder = WebPAnimDecoderNew(&data, &options);
  WebPAnimInfo animation;
  if (!decoder_->decoder || !WebPAnimDecoderGetInfo(decoder_->decoder, &animation))
    throw std::runtime_error(path + ": cannot read image: libwebp cannot decode its animation");
  decoder_->canvas = RgbaImage(static_cast<int32_t>(animation.canvas_width),
                               static_cast<int32_t>(animation.canvas_height));
  int64_t time = 0;
  std::map<int, int> uses;  // how many frames last each duration
  for (int duration : durations) {
    starts_.push_back(time);
    time += duration;
    ++uses[duration];
  }
  // Its rate is that of its most frequent frame duration, as a variable-rate video's is its
  // steady one.
  const int steady = std::max_element(uses.begin(), uses.end(), [](const auto& a, const auto& b) {
                       return a.second < b.second;
                     })->first;
  info_.width = decoder_->canvas.width;
  info_.height = decoder_->canvas.height;
  info_.video = true;
  info_.frameRate = snappedToCommonRate({1000, steady});
  info_.duration = static_cast<double>(time) / 1000;
  if (!rate_.valid()) rate_ = info_.frameRate;
}

WebpAnimationSource::~WebpAnimationSource() = default;

RgbaImage WebpAnimationSource::frame(int32_t index, int32_t width, int32_t height,
                                     PixelFormat format) {
  // Frame `index` of the composition starts at index * 1000 * denominator / numerator ms.
  const int64_t shownAt = std::max<int64_t>(index, 0) * 1000 * rate_.denominator;
  const auto after =
      std::upper_bound(starts_.begin(), starts_.end(), shownAt,
                       [&](int64_t time, int64_t start) { return time < start * rate_.numerator; });
  const auto wanted =
      static_cast<int32_t>(std::max<std::ptrdiff_t>(after - starts_.begin() - 1, 0));
  Decoder& d = *decoder_;
  if (wanted < d.decodedIndex) {
    WebPAnimDecoderReset(d.decoder);
    d.decodedIndex = -1;
  }
  while (d.decodedIndex < wanted) {
    uint8_t* pixels = nullptr;
    int timestamp = 0;
    if (!WebPAnimDecoderGetNext(d.decoder, &pixels, &timestamp)) break;  // keeps the last
    std::memcpy(d.canvas.pixels.data(), pixels, d.canvas.pixels.size());
    ++d.decodedIndex;
  }
  RgbaImage picture = resized(d.canvas, width, height);
  return picture.format == format ? picture : converted(picture, format);
}

int32_t WebpAnimationSource::frameCount() const {
  const double frames = std::ceil(info_.duration * rate_.perSecond() - 1e-6);
  return frames > 0 ? static_cast<int32_t>(std::min(frames, 1e9)) : 0;
}

}  // namespace refhost
