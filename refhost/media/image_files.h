// Still images on disk through OpenImageIO: reading any format it knows into RGBA, 8 bits a
// channel or half floats as deep as the file is; writing 8- or 16-bit PNG and half-float EXR.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "refhost/media/rgba_image.h"

namespace refhost {

// Grey, grey + alpha, RGB and RGBA files; a missing alpha is opaque, extra channels are
// dropped. A file of more than 8 bits a channel (16-bit PNG or TIFF, EXR) gives an RgbaHalf
// picture, any other an Rgba8 one with the stored bytes. The picture is turned upright as its
// EXIF orientation says, as image viewers show photos. Throws std::runtime_error naming the
// path and the reason, in one line.
RgbaImage readImageFile(const std::string& path);

enum class ImageFormat { Png, Exr };

// The picture (top row first, as it is held, in either pixel format) as the bytes of a file in
// the format: a PNG of `bitDepth` 8 or 16 bits a channel, or an EXR of half floats whatever the
// depth (8-bit values stored as v / 255). Half floats are rounded to the PNG's depth and
// clamped to 0 to 1. Throws std::runtime_error naming `shownName`.
std::vector<uint8_t> encodeImage(const RgbaImage& image, ImageFormat format,
                                 const std::string& shownName, int32_t bitDepth = 8);

// Writes the picture to the path in the format, whatever the path's extension, checking every
// write and the final flush. Throws std::runtime_error naming the path and the reason.
void writeImageFile(const RgbaImage& image, const std::string& path, ImageFormat format,
                    int32_t bitDepth = 8);

}  // namespace refhost
