// The C interface of the image module: a small shared library around OpenImageIO that the
// host loads only when a picture is first read or written (see image_files.cpp for why).
#pragma once

#include <cstddef>
#include <cstdint>

extern "C" {

// Reads any image OpenImageIO knows as RGBA, top row first, the stored values unchanged (no
// premultiplying): 8 bits a channel (*halfFloats set to 0), or half floats (*halfFloats set to
// 1) for a file of more than 8 bits a channel. On success returns 0 and a buffer of
// width * height * 4 samples from malloc, which the caller frees; otherwise non-zero with the
// reason in `error`.
typedef int (*RefhostReadPicture)(const char* path, int32_t* width, int32_t* height,
                                  int32_t* halfFloats, void** pixels, char* error,
                                  std::size_t errorSize);

// Encodes RGBA pixels (top row first), 8 bits a channel or half floats (`halfFloats` non-zero),
// as the bytes of a PNG of `bitDepth` 8 or 16 bits a channel (format 0) or a half-float OpenEXR
// (format 1, whatever the depth). On success returns 0 and `size` bytes from malloc, which the
// caller frees; otherwise non-zero with the reason in `error`.
typedef int (*RefhostEncodePicture)(int format, int32_t bitDepth, int32_t width, int32_t height,
                                    int32_t halfFloats, const void* pixels, uint8_t** bytes,
                                    std::size_t* size, char* error, std::size_t errorSize);

}  // extern "C"

// Named apart from the 8-bit-only functions of earlier modules, so that a stale module beside
// the program is refused as lacking them instead of called with the wrong arguments.
#define REFHOST_READ_IMAGE_SYMBOL "refhostReadPicture"
#define REFHOST_ENCODE_IMAGE_SYMBOL "refhostEncodePicture"
