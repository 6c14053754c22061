// The viewer's canvas: a texture the size of the window's framebuffer holding the picture at
// its zoom and pan, over which the plug-in draws its overlay, then copied to the window. The
// overlay can thus be redrawn over the same picture without rendering the frame again.
#pragma once

#include <cstdint>

#include "viewer/view_mapping.h"

namespace veltrane_viewer {

class ViewCanvas {
 public:
  ViewCanvas();  // needs the window's context current
  ~ViewCanvas();
  ViewCanvas(const ViewCanvas&) = delete;
  ViewCanvas& operator=(const ViewCanvas&) = delete;

  // Matches the canvas to the window's framebuffer.
  void resize(int32_t width, int32_t height);
  uint32_t texture() const { return texture_; }
  int32_t width() const { return width_; }
  int32_t height() const { return height_; }

  // Clears the canvas and copies the picture (a texture of the size; 0 for none) onto `where`
  // (framebuffer pixels, y down): pixel for pixel when magnified, smoothed when reduced.
  void showPicture(uint32_t picture, int32_t pictureWidth, int32_t pictureHeight,
                   const PixelRect& where);
  // Clears everything outside `area` (framebuffer pixels, y down): a zoomed picture and the
  // handles over it stay within the picture area, clear of the chrome around it.
  void clearOutside(const PixelRect& area);
  // Copies the canvas onto the window's framebuffer.
  void present();

 private:
  uint32_t texture_ = 0;
  uint32_t canvasFramebuffer_ = 0;
  uint32_t pictureFramebuffer_ = 0;
  int32_t width_ = 0;
  int32_t height_ = 0;
};

}  // namespace veltrane_viewer
