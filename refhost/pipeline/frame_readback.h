// Reading rendered frames back without waiting for them: each read goes into a pixel buffer
// object and is collected later, by when GL has usually drawn the frame, so the render of the
// next frame overlaps the read-back of this one.
#pragma once

#include <cstdint>
#include <deque>
#include <vector>

#include "refhost/media/rgba_image.h"

namespace refhost {

class FrameReadback {
 public:
  // Reads of textures of the size into pictures of the format (8-bit, or half floats read as
  // GL holds them), at most `depth` (at least 1) in flight. Needs the GL context current here
  // and in every call, the destructor included.
  FrameReadback(int32_t width, int32_t height, int32_t depth,
                PixelFormat format = PixelFormat::Rgba8);
  ~FrameReadback();
  FrameReadback(const FrameReadback&) = delete;
  FrameReadback& operator=(const FrameReadback&) = delete;

  // Starts reading the texture into the next free buffer; false when `depth` reads are in
  // flight already (collect one first).
  bool start(uint32_t texture);
  int32_t width() const { return width_; }
  int32_t height() const { return height_; }
  int32_t inFlight() const { return static_cast<int32_t>(pending_.size()); }
  bool full() const { return inFlight() >= static_cast<int32_t>(buffers_.size()); }
  // The oldest read as a picture, top row first; waits for GL where it has not finished.
  // Throws std::logic_error when nothing is in flight.
  RgbaImage collect();
  // The same into the caller's memory (width x height pixels of the format), for a caller
  // that keeps its own buffer from frame to frame.
  void collectInto(uint8_t* to);

 private:
  struct Pending {
    uint32_t buffer;
    void* fence;  // GLsync
  };

  int32_t width_, height_;
  PixelFormat format_;
  uint32_t framebuffer_ = 0;
  std::vector<uint32_t> buffers_;
  std::vector<uint32_t> free_;
  std::deque<Pending> pending_;
};

// One texture read back at once through a FrameReadback of depth 1, top row first: for a
// picture wanted now (a test, a still the viewer saves), on the same path a render's frames
// take. Needs the GL context current.
RgbaImage readBack(uint32_t texture, int32_t width, int32_t height,
                   PixelFormat format = PixelFormat::Rgba8);

}  // namespace refhost
