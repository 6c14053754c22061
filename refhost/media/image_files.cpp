// Still images through the image module. OpenImageIO as Debian builds it pulls in some 250
// shared libraries and a third of a second of start-up; loading it on first use spares every
// program (and every test process) that never reads or writes a picture.
#include "refhost/media/image_files.h"

#include <dlfcn.h>

#include <cstdlib>
#include <filesystem>
#include <mutex>
#include <stdexcept>

#include "refhost/media/image_module/image_module.h"
#include "refhost/media/orientation.h"
#include "refhost/platform/staged_file.h"

namespace refhost {
namespace {

struct ImageModule {
  RefhostReadPicture read = nullptr;
  RefhostEncodePicture encode = nullptr;
  std::string failure;  // why the module could not be loaded
};

// Beside the program (<dir>/../lib) first, so a moved build tree still finds its own; then
// where the build put it.
std::vector<std::string> candidatePaths() {
  std::vector<std::string> paths;
  std::error_code error;
  std::filesystem::path executable = std::filesystem::read_symlink("/proc/self/exe", error);
  if (!error) {
    paths.push_back(
        (executable.parent_path() / ".." / "lib" / REFHOST_IMAGE_MODULE_NAME).lexically_normal());
  }
  paths.push_back(REFHOST_IMAGE_MODULE_PATH);
  return paths;
}

const ImageModule& imageModule() {
  static ImageModule module;
  static std::once_flag loaded;
  std::call_once(loaded, [] {
    std::string reasons;
    for (const std::string& path : candidatePaths()) {
      void* handle = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
      if (!handle) {
        const char* reason = dlerror();
        reasons += std::string(reasons.empty() ? "" : "; ") + (reason ? reason : path);
        continue;
      }
      module.read = reinterpret_cast<RefhostReadPicture>(dlsym(handle, REFHOST_READ_IMAGE_SYMBOL));
      module.encode =
          reinterpret_cast<RefhostEncodePicture>(dlsym(handle, REFHOST_ENCODE_IMAGE_SYMBOL));
      if (module.read && module.encode) return;
      reasons += (reasons.empty() ? "" : "; ") + path + " lacks the image functions";
    }
    module.read = nullptr;
    module.encode = nullptr;
    module.failure = "the image module could not be loaded (" + reasons + ")";
  });
  return module;
}

const ImageModule& requireModule(const std::string& path, const char* what) {
  const ImageModule& module = imageModule();
  if (!module.read) throw std::runtime_error(path + ": cannot " + what + ": " + module.failure);
  return module;
}

}  // namespace

RgbaImage readImageFile(const std::string& path) {
  const ImageModule& module = requireModule(path, "read image");
  char error[512] = {};
  RefhostPicture read{};
  if (module.read(path.c_str(), &read, error, sizeof error) != 0)
    throw std::runtime_error(path + ": cannot read image: " + error);
  RgbaImage image;
  image.width = read.width;
  image.height = read.height;
  image.format = read.halfFloats ? PixelFormat::RgbaHalf : PixelFormat::Rgba8;
  const auto* first = static_cast<const uint8_t*>(read.pixels);
  image.pixels.assign(first, first + static_cast<std::size_t>(read.width) *
                                         static_cast<std::size_t>(read.height) *
                                         bytesPerPixel(image.format));
  std::free(read.pixels);
  return upright(image, orientationOfExif(read.orientation));
}

std::vector<uint8_t> encodeImage(const RgbaImage& image, ImageFormat format,
                                 const std::string& shownName, int32_t bitDepth) {
  const ImageModule& module = requireModule(shownName, "write image");
  if (format == ImageFormat::Png && bitDepth != 8 && bitDepth != 16)
    throw std::runtime_error(shownName + ": cannot write image: a PNG holds 8 or 16 bits, not " +
                             std::to_string(bitDepth));
  // Half floats go to 8 bits by the host's own rounding, the one every 8-bit picture gets.
  const bool toBytes =
      format == ImageFormat::Png && bitDepth == 8 && image.format == PixelFormat::RgbaHalf;
  const RgbaImage bytesOfHalf = toBytes ? converted(image, PixelFormat::Rgba8) : RgbaImage();
  const RgbaImage& source = toBytes ? bytesOfHalf : image;
  char error[512] = {};
  uint8_t* bytes = nullptr;
  std::size_t size = 0;
  if (module.encode(format == ImageFormat::Png ? 0 : 1, bitDepth, source.width, source.height,
                    source.format == PixelFormat::RgbaHalf ? 1 : 0, source.pixels.data(), &bytes,
                    &size, error, sizeof error) != 0)
    throw std::runtime_error(shownName + ": cannot write image: " + error);
  std::vector<uint8_t> encoded(bytes, bytes + size);
  std::free(bytes);
  return encoded;
}

void writeImageFile(const RgbaImage& image, const std::string& path, ImageFormat format,
                    int32_t bitDepth) {
  std::vector<uint8_t> bytes = encodeImage(image, format, path, bitDepth);
  writeFileContents(path, path, bytes.data(), bytes.size());
}

}  // namespace refhost
