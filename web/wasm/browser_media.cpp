// The page's side of the host's media files: the clips and photos a person dropped were decoded
// by the browser (web/src/media.js), which answers here, synchronously, by the names a scene
// gives them. Pictures arrive upright (EXIF orientation and a clip's display rotation applied
// by the browser) in RGB at 8 bits a channel.
#include <emscripten.h>

#include <stdexcept>
#include <string>

#include "refhost/media/image_files.h"
#include "refhost/media/video_reader.h"

namespace {

// What the page knows of a file: its kind (1 a video, 2 a still image), size, rate, length in
// seconds and whether it has sound, or an error text in `problem`.
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
// The picture shown `seconds` into the clip at the size, bottom row first.
EM_JS(void, pageVideoRows, (const char* path, double seconds, int width, int height,
                            unsigned char* rows), {
  HEAPU8.set(Module.veltraneMedia.videoRows(UTF8ToString(path), seconds, width, height), rows);
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
  out.info.frameRate = facts[2];
  out.info.duration = facts[3];
  out.info.hasAudio = facts[4] != 0;
  return out;
}

}  // namespace

namespace refhost {

struct VideoReader::Decoder {
  std::string path;
  MediaInfo info;
};

VideoReader::VideoReader(const std::string& path) : decoder_(std::make_unique<Decoder>()) {
  PageFacts facts = describe(path);
  if (facts.kind != kVideo) throw std::runtime_error(path + ": not a video");
  decoder_->path = path;
  decoder_->info = facts.info;
}

VideoReader::~VideoReader() = default;

const MediaInfo& VideoReader::info() const { return decoder_->info; }

std::vector<uint8_t> VideoReader::glRowsAt(double seconds, int32_t width, int32_t height,
                                           PixelFormat format) {
  RgbaImage picture(width, height, PixelFormat::Rgba8);
  pageVideoRows(decoder_->path.c_str(), seconds, width, height, picture.pixels.data());
  if (format == PixelFormat::Rgba8) return std::move(picture.pixels);
  return converted(picture, format).pixels;
}

RgbaImage VideoReader::frameAt(double seconds, int32_t width, int32_t height, PixelFormat format) {
  RgbaImage picture(width, height, format);
  picture.pixels = flipRows(glRowsAt(seconds, width, height, format), width, height);
  return picture;
}

RgbaImage readImageFile(const std::string& path) {
  PageFacts facts = describe(path);
  if (facts.kind != kStill) throw std::runtime_error(path + ": not a still image");
  RgbaImage picture(facts.info.width, facts.info.height, PixelFormat::Rgba8);
  pageImagePixels(path.c_str(), picture.pixels.data());
  return picture;
}

}  // namespace refhost
