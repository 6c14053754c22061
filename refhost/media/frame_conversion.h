// Decoded video frames as the host's pictures: converted to RGBA of 8 bits or half floats at
// any size with the stream's colour description, turned upright, in GL's row order.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

#include "refhost/gl/pixel_format.h"
#include "refhost/media/colour.h"
#include "refhost/media/orientation.h"

struct AVFrame;
struct SwsContext;

namespace refhost {

class FrameConverter {
 public:
  // For the frames of one stream: YUV pictures are converted with the colour's matrix and
  // range to RGB that uses every code value; every picture is turned by the orientation.
  FrameConverter(const ColourDescription& colour, const Orientation& orientation);
  ~FrameConverter();
  FrameConverter(const FrameConverter&) = delete;
  FrameConverter& operator=(const FrameConverter&) = delete;

  // The frame upright at width x height (the display size scales to any size), in the format,
  // bottom row first. Large pictures wait for one of a few conversion slots shared by every
  // converter of the process (see frame_conversion.cpp).
  std::vector<uint8_t> glRows(const AVFrame* frame, int32_t width, int32_t height,
                              PixelFormat format);

 private:
  // A conversion kept while the sizes and formats stay; for 16 bits, with the table from its
  // output to half floats.
  struct Scaler {
    SwsContext* context = nullptr;
    std::array<int, 6> key{};
    std::vector<uint16_t> halves;
  };

  SwsContext* scalerFor(Scaler& scaler, const AVFrame* frame, int32_t width, int32_t height,
                        int to);
  void convert(const AVFrame* frame, int32_t width, int32_t height, PixelFormat format,
               uint8_t* to);

  ColourDescription colour_;
  Orientation orientation_;
  Scaler eightBits_, sixteenBits_;
  // The converted picture before it is turned upright. Kept for the next frame up to about a
  // 1080p picture; a larger one is given back after each frame, since many large media may be
  // open at once and allocating it again costs little next to converting it.
  std::vector<uint8_t> stored_;
};

}  // namespace refhost
