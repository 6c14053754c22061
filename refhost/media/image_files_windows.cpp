// Still images for the Windows host through the header-only stb readers and writer: OpenImageIO
// is not built for Windows. Reading takes what stb_image decodes (PNG, JPEG, BMP, TGA, GIF, PSD,
// HDR, PIC, PNM) as 8 bits a channel; writing is 8-bit PNG only, half-float pictures rounded to
// bytes.
#include <cstdlib>
#include <stdexcept>

#include "refhost/media/image_files.h"
#include "refhost/platform/staged_file.h"

// Paths are UTF-8 here, as everywhere in the host; stb converts them for Windows' wide calls.
#define STBI_WINDOWS_UTF8
#define STBIW_WINDOWS_UTF8
#define STB_IMAGE_IMPLEMENTATION
#define STB_IMAGE_WRITE_IMPLEMENTATION
#include <stb/stb_image.h>
#include <stb/stb_image_write.h>

namespace refhost {

RgbaImage readImageFile(const std::string& path) {
  int width = 0, height = 0, channels = 0;
  // Asking for four channels expands grey to RGB and adds an opaque alpha where there is none.
  stbi_uc* pixels = stbi_load(path.c_str(), &width, &height, &channels, 4);
  if (!pixels) {
    const char* reason = stbi_failure_reason();
    throw std::runtime_error(path + ": cannot read image: " + (reason ? reason : "unknown error") +
                             " (the Windows build reads still images only: FFmpeg, which reads "
                             "video, is left out of it)");
  }
  RgbaImage image;
  image.width = width;
  image.height = height;
  image.pixels.assign(
      pixels, pixels + static_cast<std::size_t>(width) * static_cast<std::size_t>(height) * 4);
  stbi_image_free(pixels);
  return image;
}

std::vector<uint8_t> encodeImage(const RgbaImage& picture, ImageFormat format,
                                 const std::string& shownName, int32_t bitDepth) {
  if (format != ImageFormat::Png || bitDepth != 8)
    throw std::runtime_error(shownName +
                             ": cannot write image: the Windows build writes 8-bit PNG only");
  const RgbaImage image = converted(picture, PixelFormat::Rgba8);
  std::vector<uint8_t> bytes;
  const auto append = [](void* into, void* data, int size) {
    const auto* first = static_cast<const uint8_t*>(data);
    static_cast<std::vector<uint8_t>*>(into)->insert(
        static_cast<std::vector<uint8_t>*>(into)->end(), first, first + size);
  };
  if (!stbi_write_png_to_func(append, &bytes, image.width, image.height, 4, image.pixels.data(),
                              image.width * 4))
    throw std::runtime_error(shownName + ": cannot write image: the picture could not be encoded");
  return bytes;
}

void writeImageFile(const RgbaImage& image, const std::string& path, ImageFormat format,
                    int32_t bitDepth) {
  const std::vector<uint8_t> bytes = encodeImage(image, format, path, bitDepth);
  writeFileContents(path, path, bytes.data(), bytes.size());
}

}  // namespace refhost
