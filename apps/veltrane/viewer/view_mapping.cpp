// Zoom, pan and the framebuffer <-> corner-space conversions of the viewer.
#include "viewer/view_mapping.h"

#include <algorithm>
#include <cmath>

namespace veltrane_viewer {

ViewMapping::ViewMapping(int32_t frameWidth, int32_t frameHeight)
    : frameWidth_(std::max(frameWidth, 1)), frameHeight_(std::max(frameHeight, 1)) {}

void ViewMapping::setArea(const PixelRect& area) {
  Point2 centre{area_.x + area_.width / 2, area_.y + area_.height / 2};
  Point2 held = toCorner(centre);
  area_ = area;
  if (fitted_) {
    fit();
    return;
  }
  Point2 newCentre{area_.x + area_.width / 2, area_.y + area_.height / 2};
  Point2 now = toPixel(held);
  panBy(newCentre.x - now.x, newCentre.y - now.y);
}

void ViewMapping::fit() {
  double zoom = std::min(area_.width / frameWidth_, area_.height / frameHeight_);
  zoom_ = std::clamp(zoom, kSmallestZoom, kLargestZoom);
  origin_ = {area_.x + (area_.width - frameWidth_ * zoom_) / 2,
             area_.y + (area_.height + frameHeight_ * zoom_) / 2};
  fitted_ = true;
}

void ViewMapping::showActualPixels() {
  zoom_ = 1;
  // Whole-pixel offsets, so that each frame pixel covers exactly one framebuffer pixel.
  origin_ = {std::floor(area_.x + (area_.width - frameWidth_) / 2),
             std::floor(area_.y + (area_.height + frameHeight_) / 2)};
  fitted_ = false;
}

void ViewMapping::zoomAbout(Point2 pivot, double factor) {
  if (!(factor > 0) || !std::isfinite(factor)) return;
  Point2 held = toCorner(pivot);
  zoom_ = std::clamp(zoom_ * factor, kSmallestZoom, kLargestZoom);
  Point2 now = toPixel(held);
  origin_.x += pivot.x - now.x;
  origin_.y += pivot.y - now.y;
  fitted_ = false;
}

void ViewMapping::panBy(double dx, double dy) {
  origin_.x += dx;
  origin_.y += dy;
  fitted_ = false;
}

Point2 ViewMapping::toCorner(Point2 pixel) const {
  return {(pixel.x - origin_.x) / zoom_, (origin_.y - pixel.y) / zoom_};
}

Point2 ViewMapping::toPixel(Point2 corner) const {
  return {origin_.x + corner.x * zoom_, origin_.y - corner.y * zoom_};
}

PixelRect ViewMapping::frameRect() const {
  return {origin_.x, origin_.y - frameHeight_ * zoom_, frameWidth_ * zoom_, frameHeight_ * zoom_};
}

refhost::Matrix4 ViewMapping::projection(int32_t framebufferWidth,
                                         int32_t framebufferHeight) const {
  double width = std::max(framebufferWidth, 1);
  double height = std::max(framebufferHeight, 1);
  // GL counts framebuffer rows from the bottom: corner y lands at row height - origin.y + y*zoom.
  refhost::Matrix4 m = refhost::identityMatrix();
  m[0] = static_cast<float>(2 * zoom_ / width);
  m[5] = static_cast<float>(2 * zoom_ / height);
  m[10] = -1.0f;
  m[12] = static_cast<float>(2 * origin_.x / width - 1);
  m[13] = static_cast<float>(2 * (height - origin_.y) / height - 1);
  return m;
}

double densityScale(double contentScale, double dotsPerInch) {
  constexpr double kDenseScreen = 100;  // dots per inch
  constexpr double kDenseScale = 1.5;
  return std::max(contentScale, dotsPerInch > kDenseScreen ? kDenseScale : 1.0);
}

double handleScale(double density, double viewScale) {
  if (!(viewScale > 0) || !std::isfinite(viewScale)) return density;
  const double band = 15.0 / (viewScale * viewScale);
  return std::max(density, (band + 4.0) / 10.0);
}

EventPosition eventPosition(Point2 corner) {
  auto whole = [](double value) {
    double clamped = std::clamp(std::round(value), -1.0e9, 1.0e9);
    return static_cast<int32_t>(std::isfinite(clamped) ? clamped : 0);
  };
  return {whole(corner.x), whole(corner.y)};
}

}  // namespace veltrane_viewer
