// Where the frame sits in the viewer: zoom and pan over the picture area, and the conversions
// between the window's framebuffer pixels and the frame's corner space that pointer events and
// the overlay's projection need.
#pragma once

#include <cstdint>

#include "refhost/core/host.h"

namespace veltrane_viewer {

struct Point2 {
  double x = 0;
  double y = 0;
};

// A rectangle in framebuffer pixels, origin at the top-left corner, y downwards (as the
// window system reports the pointer).
struct PixelRect {
  double x = 0;
  double y = 0;
  double width = 0;
  double height = 0;
  bool contains(Point2 p) const {
    return p.x >= x && p.y >= y && p.x < x + width && p.y < y + height;
  }
};

class ViewMapping {
 public:
  static constexpr double kSmallestZoom = 1.0 / 64;
  static constexpr double kLargestZoom = 64;

  ViewMapping(int32_t frameWidth, int32_t frameHeight);

  // The part of the window the picture is shown in. A fitted view is fitted again; otherwise
  // the frame keeps its zoom and the point at the area's centre stays there.
  void setArea(const PixelRect& area);
  const PixelRect& area() const { return area_; }

  // The largest zoom that shows the whole frame, centred.
  void fit();
  // One frame pixel per framebuffer pixel, centred on whole pixels.
  void showActualPixels();
  // Multiplies the zoom (clamped to its limits) keeping the frame point under `pivot` in place.
  void zoomAbout(Point2 pivot, double factor);
  void panBy(double dx, double dy);

  double zoom() const { return zoom_; }
  bool fitted() const { return fitted_; }
  // Frame pixels per framebuffer pixel, what the overlay measures its handles with.
  double viewScale() const { return 1.0 / zoom_; }

  // Framebuffer pixel <-> corner space (origin at the frame's bottom-left corner, y up).
  Point2 toCorner(Point2 pixel) const;
  Point2 toPixel(Point2 corner) const;
  // The frame's rectangle in framebuffer pixels.
  PixelRect frameRect() const;
  // Column-major matrix taking corner space to the clip space of a framebuffer of the given
  // size, so that the overlay lands on the picture where toPixel says.
  refhost::Matrix4 projection(int32_t framebufferWidth, int32_t framebufferHeight) const;

 private:
  double frameWidth_;
  double frameHeight_;
  PixelRect area_;
  double zoom_ = 1;
  // Framebuffer position of the frame's bottom-left corner (corner-space origin).
  Point2 origin_;
  bool fitted_ = true;
};

// The UI scale a screen asks for: the desktop's content scale, and at least 1.5 on a screen
// above 100 dots per inch, where handles drawn one pixel a unit are small and thin.
// `dotsPerInch` is 0 when the screen does not say.
double densityScale(double contentScale, double dotsPerInch);

// The UI scale handed to the plug-in with the view scale `viewScale` (frame pixels per screen
// pixel): the screen's density, raised where needed so that every handle the overlay draws can
// be grabbed. The plug-in asks a cut's position control first, within a band of
// 15 / viewScale^2 screen pixels of the cut; a Local cut's direction handle sits 10 x uiScale
// screen pixels from the cut, grabbable 3 x uiScale either side. Below about 100 % zoom the
// band is narrow and the density decides; closer in it widens with the square of the zoom and
// the handles are drawn further out, clear of it by 4 screen pixels.
double handleScale(double density, double viewScale);

// The pointer position a viewer event carries: corner space in whole frame pixels.
struct EventPosition {
  int32_t x = 0;
  int32_t y = 0;
};
EventPosition eventPosition(Point2 corner);

}  // namespace veltrane_viewer
