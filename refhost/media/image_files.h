// Still images on disk through OpenImageIO: reading any format it knows into RGBA8, writing
// 8-bit PNG and half-float EXR.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "refhost/media/rgba_image.h"

namespace refhost {

// Grey, grey + alpha, RGB and RGBA files; a missing alpha is opaque, extra channels are
// dropped. Throws std::runtime_error naming the path and the reason.
RgbaImage readImageFile(const std::string& path);

enum class ImageFormat { Png, Exr };

// The picture (top row first, as it is held) as the bytes of a file in the format. EXR stores
// the 8-bit values as half floats from 0 to 1. Throws std::runtime_error naming `shownName`.
std::vector<uint8_t> encodeImage(const RgbaImage& image, ImageFormat format,
                                 const std::string& shownName);

// Writes the picture to the path in the format, whatever the path's extension, checking every
// write and the final flush. Throws std::runtime_error naming the path and the reason.
void writeImageFile(const RgbaImage& image, const std::string& path, ImageFormat format);

}  // namespace refhost
