// The viewer's window <-> frame mapping: the projection handed to the overlay must land corner
// points where pointer conversion says they are, under every zoom and pan.
#include "viewer/view_mapping.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

namespace veltrane_viewer {
namespace {

constexpr int kFbWidth = 1000;
constexpr int kFbHeight = 700;

void expectSame(Point2 a, Point2 b, double tolerance, const char* what) {
  EXPECT_NEAR(a.x, b.x, tolerance) << what;
  EXPECT_NEAR(a.y, b.y, tolerance) << what;
}

// Pointer conversion goes both ways, and the projection agrees with it, in the view as it is.
void expectProjectionAgrees(const ViewMapping& view, const char* state) {
  refhost::Matrix4 m = view.projection(kFbWidth, kFbHeight);
  for (Point2 corner : {Point2{0, 0}, Point2{640, 360}, Point2{211.25, 97.5}}) {
    Point2 pixel = view.toPixel(corner);
    expectSame(view.toCorner(pixel), corner, 1e-9, state);
    // Column-major: clip = m * (x, y, 0, 1); GL rows count from the bottom.
    Point2 clip{m[0] * corner.x + m[4] * corner.y + m[12],
                m[1] * corner.x + m[5] * corner.y + m[13]};
    expectSame({(clip.x + 1) / 2 * kFbWidth, kFbHeight - (clip.y + 1) / 2 * kFbHeight}, pixel, 1e-3,
               state);
  }
  EXPECT_DOUBLE_EQ(view.viewScale(), 1 / view.zoom()) << state;
}

TEST(ViewMapping, FitShowsTheWholeFrameCentredAndRefitsWithTheArea) {
  struct Case {
    PixelRect area;
    double zoom;
  } cases[] = {{{0, 0, 1280, 720}, 2}, {{10, 30, 320, 900}, 0.5}, {{0, 0, 6400, 50}, 50.0 / 360}};
  for (const Case& c : cases) {
    ViewMapping view(640, 360);
    view.setArea(c.area);
    PixelRect frame = view.frameRect();
    EXPECT_DOUBLE_EQ(view.zoom(), c.zoom);
    expectSame({frame.x + frame.width / 2, frame.y + frame.height / 2},
               {c.area.x + c.area.width / 2, c.area.y + c.area.height / 2}, 1e-9, "centred");
    // The corner-space origin is the frame's bottom-left corner, y up.
    expectSame(view.toCorner({frame.x, frame.y + frame.height}), {0, 0}, 1e-9, "origin");
    expectProjectionAgrees(view, "fitted");
  }
  ViewMapping view(640, 360);
  view.setArea({0, 0, 640, 360});
  view.setArea({0, 0, 1280, 720});
  EXPECT_DOUBLE_EQ(view.zoom(), 2);
  view.showActualPixels();
  EXPECT_EQ(view.frameRect().x, 320);  // whole pixels, one frame pixel each
  EXPECT_EQ(view.frameRect().y, 180);
  expectProjectionAgrees(view, "actual pixels");
}

TEST(ViewMapping, ZoomKeepsThePivotPanMovesResizingKeepsTheCentreEventsRound) {
  ViewMapping view(320, 180);
  view.setArea({0, 20, 800, 600});
  Point2 pivot{612.5, 233};
  Point2 under = view.toCorner(pivot);
  view.zoomAbout(pivot, 3.7);
  expectSame(view.toCorner(pivot), under, 1e-9, "pivot");
  expectProjectionAgrees(view, "zoomed in about a point");
  view.zoomAbout(pivot, 1e6);
  EXPECT_DOUBLE_EQ(view.zoom(), ViewMapping::kLargestZoom);
  expectSame(view.toCorner(pivot), under, 1e-9, "pivot");
  view.zoomAbout(pivot, std::numeric_limits<double>::quiet_NaN());
  view.zoomAbout(pivot, 1e-9);
  EXPECT_DOUBLE_EQ(view.zoom(), ViewMapping::kSmallestZoom);
  view.panBy(-41.5, 17);
  expectSame(view.toCorner({pivot.x - 41.5, pivot.y + 17}), under, 1e-9, "panned");
  expectProjectionAgrees(view, "zoomed out and panned");
  Point2 centre = view.toCorner({400, 320});
  view.setArea({100, 50, 400, 200});
  expectSame(view.toCorner({300, 150}), centre, 1e-9, "centre");
  expectProjectionAgrees(view, "resized");
  // Events carry the nearest whole frame pixel, whatever the pointer's position.
  EventPosition near = eventPosition({10.5, -3.6}), far = eventPosition({1e30, std::nan("")});
  EXPECT_EQ(std::make_pair(near.x, near.y), std::make_pair(11, -4));
  EXPECT_EQ(std::make_pair(far.x, far.y), std::make_pair(1000000000, 0));
}

// Handles grow on dense screens: the desktop's scale, and at least 1.5 above 100 dpi.
TEST(ViewMapping, DenseScreensDrawLargerHandles) {
  const double cases[][3] = {{1, 0, 1},     {1, 96, 1},  {1, 100, 1},     {1, 101, 1.5},
                             {1, 220, 1.5}, {2, 220, 2}, {1.25, 96, 1.25}};
  for (const auto& [content, dpi, scale] : cases)
    EXPECT_DOUBLE_EQ(densityScale(content, dpi), scale) << content << " at " << dpi << " dpi";
}

}  // namespace
}  // namespace veltrane_viewer
