// The render context of one frame, as the host hands it with the frame-request and render
// messages, together with the textures it names; and the viewer context of the overlay and
// pointer messages.
#pragma once

#include <cstdint>
#include <string>

#include "refhost/core/host.h"

namespace refhost {

// Orthographic projection of pixel coordinates (0..W, 0..H) onto clip space, column-major as
// GL takes it.
Matrix4 pixelProjection(int32_t width, int32_t height);

// The composition time of a frame: trunc(frame * 1000 / rate + 0.49999), a rate of 0 or less
// counting as 25.
int32_t frameToMilliseconds(int32_t frame, double frameRate);

struct FrameSettings {
  int32_t width = 0;
  int32_t height = 0;
  double frameRate = 25.0;
  float pixelAspect = 1.0f;
  int32_t sourceFrameCount = 1;
  std::string ownLayerGuid;
  // How the frames are stored: half floats when a source or the output holds more than 8 bits.
  // The output texture (and with it the effect's own targets) is GL_RGBA16F then.
  PixelFormat format = PixelFormat::Rgba8;
};

// One frame's render context. Parameter time, frame number and source frame index are all the
// frame number; the layer-space matrix and both view matrices are the identity (the lens term
// of a 50 mm camera in element 5). Its textures are host textures, not counted as the
// plug-in's: the ones this object made (the own source's frame from the host's frame source,
// the output, a second texture of the frame's size) are deleted with it; a caller's are only
// borrowed.
class RenderFrame {
 public:
  // Makes all three textures.
  RenderFrame(Host& host, const FrameSettings& settings, int32_t frame);
  // Borrows the caller's source and output and makes the second texture.
  RenderFrame(Host& host, const FrameSettings& settings, int32_t frame, const TextureRecord& source,
              const TextureRecord& output);
  ~RenderFrame();
  RenderFrame(const RenderFrame&) = delete;
  RenderFrame& operator=(const RenderFrame&) = delete;

  WispRenderContext& context() { return context_; }
  const WispRenderContext& context() const { return context_; }
  int32_t frame() const { return static_cast<int32_t>(context_.frameNumber); }

 private:
  void fill(const FrameSettings& settings, int32_t frame);

  Host& host_;
  std::string ownLayerGuid_;
  WispRenderContext context_{};
  bool ownsSourceAndOutput_ = true;
};

// The viewer context of the overlay and pointer messages: no name, the frame size, the scales,
// the time and the same pixel projection as the render.
WispViewerContext makeViewerContext(int32_t width, int32_t height, double viewScaleX,
                                    double viewScaleY, double uiScale, int32_t time);

}  // namespace refhost
