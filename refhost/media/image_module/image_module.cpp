// The image module: OpenImageIO reading and writing behind a C interface.
#include "image_module.h"

#include <OpenImageIO/filesystem.h>
#include <OpenImageIO/imageio.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

namespace {

// The reason on one line: OpenImageIO gathers each error of a read on a line of its own ("PNG
// read error: ...", "PNG library error"), which go into one, repeated lines once.
int fail(char* error, std::size_t size, const std::string& reason) {
  std::string line;
  std::size_t start = 0;
  while (start <= reason.size()) {
    std::size_t end = std::min(reason.find('\n', start), reason.size());
    const std::string part = reason.substr(start, end - start);
    if (!part.empty() && line.find(part) == std::string::npos)
      line += (line.empty() ? "" : "; ") + part;
    start = end + 1;
  }
  if (error && size > 0) {
    std::size_t length = std::min(line.size(), size - 1);
    std::memcpy(error, line.data(), length);
    error[length] = '\0';
  }
  return 1;
}

std::string orDefault(const std::string& reason, const char* fallback) {
  return reason.empty() ? fallback : reason;
}

// Grey, grey + alpha, RGB or RGBA samples as RGBA; `opaque` is a full alpha in the sample type.
template <typename Sample>
void expandToRgba(const Sample* data, Sample* rgba, std::size_t count, int channels,
                  Sample opaque) {
  const bool colour = channels >= 3;
  for (std::size_t i = 0; i < count; ++i) {
    const Sample* from = &data[i * static_cast<std::size_t>(channels)];
    Sample* to = &rgba[i * 4];
    to[0] = from[0];
    to[1] = colour ? from[1] : from[0];
    to[2] = colour ? from[2] : from[0];
    // Grey + alpha keeps alpha in its second channel, RGBA in its fourth.
    to[3] = channels == 2 ? from[1] : channels == 4 ? from[3] : opaque;
  }
}

template <typename Sample>
int readAs(OIIO::ImageInput& input, OIIO::TypeDesc type, Sample opaque, std::size_t count,
           int channels, void** pixels, char* error, std::size_t errorSize) {
  std::vector<Sample> data(count * static_cast<std::size_t>(channels));
  if (!input.read_image(0, 0, 0, channels, type, data.data()))
    return fail(error, errorSize, orDefault(input.geterror(), "read failed"));
  input.close();
  auto* rgba = static_cast<Sample*>(std::malloc(count * 4 * sizeof(Sample)));
  if (!rgba) return fail(error, errorSize, "out of memory");
  expandToRgba(data.data(), rgba, count, channels, opaque);
  *pixels = rgba;
  return 0;
}

}  // namespace

extern "C" __attribute__((visibility("default"))) int refhostReadOrientedPicture(
    const char* path, RefhostPicture* picture, char* error, std::size_t errorSize) {
  // The stored values are wanted as they are: no premultiplying of files with alpha.
  OIIO::ImageSpec config;
  config.attribute("oiio:UnassociatedAlpha", 1);
  auto input = OIIO::ImageInput::open(path, &config);
  if (!input) return fail(error, errorSize, orDefault(OIIO::geterror(), "unknown format"));
  const OIIO::ImageSpec& spec = input->spec();
  if (spec.width <= 0 || spec.height <= 0 || spec.nchannels <= 0)
    return fail(error, errorSize, "it holds no pixels");
  const int channels = std::min(spec.nchannels, 4);
  const std::size_t count =
      static_cast<std::size_t>(spec.width) * static_cast<std::size_t>(spec.height);
  // Anything deeper than 8 bits (16-bit integers, half or full floats) keeps its precision as
  // half floats; 8-bit files stay bytes, exactly as stored.
  const bool deep =
      spec.format.basetype != OIIO::TypeDesc::UINT8 && spec.format.basetype != OIIO::TypeDesc::INT8;
  const int orientation = spec.get_int_attribute("Orientation", 1);
  const int32_t width = spec.width, height = spec.height;
  const int result = deep ? readAs<uint16_t>(*input, OIIO::TypeDesc::HALF, uint16_t{0x3C00}, count,
                                             channels, &picture->pixels, error, errorSize)
                          : readAs<uint8_t>(*input, OIIO::TypeDesc::UINT8, uint8_t{255}, count,
                                            channels, &picture->pixels, error, errorSize);
  if (result != 0) return result;
  picture->width = width;
  picture->height = height;
  picture->halfFloats = deep ? 1 : 0;
  picture->orientation = orientation >= 1 && orientation <= 8 ? orientation : 1;
  return 0;
}

extern "C" __attribute__((visibility("default"))) int refhostEncodePicture(
    int format, int32_t bitDepth, int32_t width, int32_t height, int32_t halfFloats,
    const void* pixels, uint8_t** bytes, std::size_t* size, char* error, std::size_t errorSize) {
  auto output = OIIO::ImageOutput::create(format == 0 ? "png" : "openexr");
  if (!output) return fail(error, errorSize, orDefault(OIIO::geterror(), "no writer"));
  const OIIO::TypeDesc stored = format != 0      ? OIIO::TypeDesc::HALF
                                : bitDepth == 16 ? OIIO::TypeDesc::UINT16
                                                 : OIIO::TypeDesc::UINT8;
  OIIO::ImageSpec spec(width, height, 4, stored);
  spec.alpha_channel = 3;
  // The values go out as they are held; the writer must not divide colour by alpha.
  spec.attribute("oiio:UnassociatedAlpha", 1);
  // Encoded into memory: the host writes the file itself, where every write and the final
  // flush are checked (the writers here can lose a failure at close). OpenImageIO converts
  // between the held and the stored sample types.
  std::vector<unsigned char> encoded;
  OIIO::Filesystem::IOVecOutput memory(encoded);
  if (!output->set_ioproxy(&memory) ||
      !output->open(format == 0 ? "image.png" : "image.exr", spec) ||
      !output->write_image(halfFloats ? OIIO::TypeDesc::HALF : OIIO::TypeDesc::UINT8, pixels) ||
      !output->close())
    return fail(error, errorSize, orDefault(output->geterror(), "encoding failed"));
  *bytes = static_cast<uint8_t*>(std::malloc(std::max<std::size_t>(encoded.size(), 1)));
  if (!*bytes) return fail(error, errorSize, "out of memory");
  std::memcpy(*bytes, encoded.data(), encoded.size());
  *size = encoded.size();
  return 0;
}
