// The C interface of the image module: a small shared library around OpenImageIO that the
// host loads only when a picture is first read or written (see image_files.cpp for why).
#pragma once

#include <cstddef>
#include <cstdint>

extern "C" {

// Reads any image OpenImageIO knows as RGBA8, top row first, the stored values unchanged (no
// premultiplying). On success returns 0 and a buffer of width * height * 4 bytes from malloc,
// which the caller frees; otherwise non-zero with the reason in `error`.
typedef int (*RefhostReadImage)(const char* path, int32_t* width, int32_t* height, uint8_t** pixels,
                                char* error, std::size_t errorSize);

// Encodes RGBA8 pixels (top row first) as the bytes of an 8-bit PNG (format 0) or a half-float
// OpenEXR (format 1) file. On success returns 0 and `size` bytes from malloc, which the caller
// frees; otherwise non-zero with the reason in `error`.
typedef int (*RefhostEncodeImage)(int format, int32_t width, int32_t height, const uint8_t* pixels,
                                  uint8_t** bytes, std::size_t* size, char* error,
                                  std::size_t errorSize);

}  // extern "C"

#define REFHOST_READ_IMAGE_SYMBOL "refhostReadImage"
#define REFHOST_ENCODE_IMAGE_SYMBOL "refhostEncodeImage"
