// The page's side of the host's media files: the clips and photos a person dropped were decoded
// by the browser (web/src/media.js), which answers here, synchronously, by the names a scene
// gives them. What a file is (moving pictures or a still) is what the browser's decoders made
// of its content. Pictures arrive in RGB at 8 bits a channel: photos upright (the browser
// applies their EXIF orientation), clip frames as stored with the turn that shows them.
#include "browser_media.h"

#include <emscripten.h>

#include <algorithm>
#include <cmath>
#include <stdexcept>
#include <string>

#include "refhost/media/image_files.h"
#include "refhost/media/moving_pictures.h"
#include "refhost/media/orientation.h"
#include "refhost/media/video_reader.h"
#include "refhost/media/video_source.h"

namespace {

// What the page knows of a file: its kind (1 a video, 2 a still image), size, frames a second,
// length in seconds and whether it has sound, or an error text in `problem`.
// clang-format off
EM_JS(int, pageMediaDescribe, (const char* path, double* facts, char* problem, int problemBytes), {
  const found = Module.veltraneMedia.describe(UTF8ToString(path));
  if (found.problem) {
    stringToUTF8(found.problem, problem, problemBytes);
    return 0;
  }
  HEAPF64.set([found.width, found.height, found.frameRate, found.duration,
               found.hasAudio ? 1 : 0], facts >> 3);
  return found.kind;
});
// The decoded frame shown `seconds` into the clip: its stored size and how it is turned to be
// shown (clockwise degrees, then a mirror), or 0 while none is decoded. The next call copies it.
EM_JS(int, pageVideoFrame, (const char* path, double seconds, int* shape), {
  const picture = Module.veltraneMedia.videoFrame(UTF8ToString(path), seconds);
  Module.veltraneFrame = picture;
  if (!picture) return 0;
  HEAP32.set([picture.width, picture.height, picture.rotation, picture.flip ? 1 : 0], shape >> 2);
  return 1;
});
// The frame pageVideoFrame found, RGBA, top row first.
EM_JS(void, pageCopyVideoFrame, (unsigned char* pixels), {
  HEAPU8.set(Module.veltraneFrame.pixels, pixels);
  Module.veltraneFrame = null;
});
// The still image at its own size, top row first.
EM_JS(void, pageImagePixels, (const char* path, unsigned char* pixels), {
  HEAPU8.set(Module.veltraneMedia.imagePixels(UTF8ToString(path)), pixels);
});
// clang-format on

constexpr int kVideo = 1;
constexpr int kStill = 2;

struct PageFacts {
  int kind = 0;
  refhost::MediaInfo info;
};

PageFacts describe(const std::string& path) {
  double facts[5] = {0, 0, 0, 0, 0};
  char problem[256] = {0};
  PageFacts out;
  out.kind = pageMediaDescribe(path.c_str(), facts, problem, sizeof problem);
  if (out.kind == 0) throw std::runtime_error(path + ": " + problem);
  out.info.width = static_cast<int32_t>(facts[0]);
  out.info.height = static_cast<int32_t>(facts[1]);
  out.info.video = out.kind == kVideo;
  if (out.info.video) out.info.frameRate = veltrane_web::clipRate(facts[2]);
  out.info.duration = facts[3];
  out.info.hasAudio = facts[4] != 0;
  return out;
}

// The EXIF orientation that shows a frame turned `degrees` clockwise, then mirrored left to
// right when `mirrored`, as the browser's decoders describe a clip's display matrix.
refhost::Orientation orientationOfTurn(int degrees, bool mirrored) {
  switch (degrees) {
    case 90:
      return refhost::orientationOfExif(mirrored ? 5 : 6);
    case 180:
      return refhost::orientationOfExif(mirrored ? 4 : 3);
    case 270:
      return refhost::orientationOfExif(mirrored ? 7 : 8);
    default:
      return refhost::orientationOfExif(mirrored ? 2 : 1);
  }
}

// The picture stretched to the size. Each halving step averages two pixels into one, so a
// picture more than twice the size loses no detail to the final bilinear step's sampling, as a
// mipmapped draw would show it.
refhost::RgbaImage stretched(refhost::RgbaImage picture, int32_t width, int32_t height) {
  while (picture.width > 2 * width || picture.height > 2 * height)
    picture = refhost::resized(picture, std::max(width, picture.width / 2),
                               std::max(height, picture.height / 2));
  return refhost::resized(picture, width, height);
}

}  // namespace

namespace veltrane_web {

refhost::FrameRate clipRate(double perSecond) {
  if (!(perSecond > 0) || perSecond > 1e6) return {};
  return refhost::snappedToCommonRate({std::llround(perSecond * 1001000), 1001000});
}

}  // namespace veltrane_web

namespace refhost {

// The browser's decoders conceal damaged frames without saying which: nothing is recorded.
struct VideoReader::Decoder {
  std::string path;
  MediaInfo info;
};

VideoReader::VideoReader(const std::string& path, std::shared_ptr<DamagedFrames>)
    : decoder_(std::make_unique<Decoder>()) {
  PageFacts facts = describe(path);
  if (facts.kind != kVideo) throw std::runtime_error(path + ": not a video");
  decoder_->path = path;
  decoder_->info = facts.info;
}

VideoReader::~VideoReader() = default;

const MediaInfo& VideoReader::info() const { return decoder_->info; }

std::vector<uint8_t> VideoReader::glRowsAt(int64_t frame, FrameRate rate, int32_t width,
                                           int32_t height, PixelFormat format) {
  const double seconds =
      rate.valid() ? static_cast<double>(frame) * rate.denominator / rate.numerator : 0;
  int32_t shape[4] = {0, 0, 0, 0};
  // Until the page has decoded a frame of the clip, the picture is transparent.
  if (!pageVideoFrame(decoder_->path.c_str(), seconds, shape))
    return RgbaImage(width, height, format).pixels;
  RgbaImage picture(shape[0], shape[1], PixelFormat::Rgba8);
  pageCopyVideoFrame(picture.pixels.data());
  const Orientation turn = orientationOfTurn(shape[2], shape[3] != 0);
  if (!turn.rowOrderOnly() || turn.d < 0) picture = upright(picture, turn);
  if (picture.width != width || picture.height != height)
    picture = stretched(std::move(picture), width, height);
  if (format != PixelFormat::Rgba8) picture = converted(picture, format);
  return flipRows(picture.pixels, width, height);
}

RgbaImage VideoReader::frameAt(int64_t frame, FrameRate rate, int32_t width, int32_t height,
                               PixelFormat format) {
  RgbaImage picture(width, height, format);
  picture.pixels = flipRows(glRowsAt(frame, rate, width, height, format), width, height);
  return picture;
}

std::shared_ptr<MediaSource> openMovingPictures(const MediaSpec& spec, FrameRate compositionRate) {
  const bool video = spec.info ? spec.info->video : describe(spec.path).kind == kVideo;
  if (!video) return nullptr;
  return openVideoSource(spec.path, compositionRate, spec.damage);
}

RgbaImage readImageFile(const std::string& path) {
  PageFacts facts = describe(path);
  if (facts.kind != kStill) throw std::runtime_error(path + ": not a still image");
  RgbaImage picture(facts.info.width, facts.info.height, PixelFormat::Rgba8);
  pageImagePixels(path.c_str(), picture.pixels.data());
  return picture;
}

}  // namespace refhost
