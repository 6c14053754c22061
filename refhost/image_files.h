// Still images on disk through OpenImageIO: reading any format it knows into RGBA8, writing
// 8-bit PNG and half-float EXR.
#pragma once

#include <string>

#include "refhost/rgba_image.h"

namespace refhost {

// Grey, grey + alpha, RGB and RGBA files; a missing alpha is opaque, extra channels are
// dropped. Throws std::runtime_error naming the path and the reason.
RgbaImage readImageFile(const std::string& path);

enum class ImageFormat { Png, Exr };

// Writes the picture (top row first, as it is held) to the path in the format, whatever the
// path's extension. EXR stores the 8-bit values as half floats from 0 to 1. Throws
// std::runtime_error naming the path and the reason.
void writeImageFile(const RgbaImage& image, const std::string& path, ImageFormat format);

}  // namespace refhost
