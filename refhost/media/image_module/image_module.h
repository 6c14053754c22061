// The C interface of the image module: a small shared library around OpenImageIO that the
// host loads only when a picture is first read or written (see image_files.cpp for why).
#pragma once

#include <cstddef>
#include <cstdint>

extern "C" {

// A picture read: RGBA, top row first, as stored (the EXIF orientation not applied).
struct RefhostPicture {
  int32_t width;
  int32_t height;
  int32_t halfFloats;   // 1: half floats; 0: 8 bits a channel
  int32_t orientation;  // the EXIF orientation, 1 (as stored) to 8
  void* pixels;         // width * height * 4 samples from malloc, which the caller frees
};

// Reads any image OpenImageIO knows as RGBA, top row first, the stored values unchanged (no
// premultiplying): 8 bits a channel, or half floats for a file of more than 8 bits a channel.
// On success returns 0 and fills `picture`; otherwise non-zero with the reason in `error`, on
// one line.
typedef int (*RefhostReadPicture)(const char* path, RefhostPicture* picture, char* error,
                                  std::size_t errorSize);

// Encodes RGBA pixels (top row first), 8 bits a channel or half floats (`halfFloats` non-zero),
// as the bytes of a PNG of `bitDepth` 8 or 16 bits a channel (format 0) or a half-float OpenEXR
// (format 1, whatever the depth). On success returns 0 and `size` bytes from malloc, which the
// caller frees; otherwise non-zero with the reason in `error`.
typedef int (*RefhostEncodePicture)(int format, int32_t bitDepth, int32_t width, int32_t height,
                                    int32_t halfFloats, const void* pixels, uint8_t** bytes,
                                    std::size_t* size, char* error, std::size_t errorSize);

}  // extern "C"

// Named apart from the functions of earlier modules (8 bits only, no orientation), so that a
// stale module beside the program is refused as lacking them instead of called with the wrong
// arguments.
#define REFHOST_READ_IMAGE_SYMBOL "refhostReadOrientedPicture"
#define REFHOST_ENCODE_IMAGE_SYMBOL "refhostEncodePicture"
