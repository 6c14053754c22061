// The viewer's window <-> frame mapping: the projection handed to the overlay must land corner
// points where pointer conversion says they are, under every zoom and pan.
#include "view_mapping.h"

#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <limits>

namespace veltrane_viewer {
namespace {

constexpr int kFbWidth = 1000;
constexpr int kFbHeight = 700;

struct ViewCase {
  const char* name;
  std::function<void(ViewMapping&)> arrange;
};

TEST(ViewMapping, ProjectionAndPointerConversionAgree) {
  const ViewCase cases[] = {
      {"fitted", [](ViewMapping&) {}},
      {"actual pixels", [](ViewMapping& v) { v.showActualPixels(); }},
      {"zoomed in about a point",
       [](ViewMapping& v) {
         v.zoomAbout({612.5, 233}, 3.7);
       }},
      {"zoomed out and panned",
       [](ViewMapping& v) {
         v.zoomAbout({10, 600}, 0.2);
         v.panBy(-41.5, 17);
       }},
  };
  for (const ViewCase& c : cases) {
    ViewMapping view(640, 360);
    view.setArea({0, 20, 600, 640});
    c.arrange(view);
    refhost::Matrix4 m = view.projection(kFbWidth, kFbHeight);
    for (Point2 corner : {Point2{0, 0}, Point2{640, 360}, Point2{211.25, 97.5}}) {
      Point2 pixel = view.toPixel(corner);
      Point2 back = view.toCorner(pixel);
      EXPECT_NEAR(back.x, corner.x, 1e-9) << c.name;
      EXPECT_NEAR(back.y, corner.y, 1e-9) << c.name;
      // Column-major: clip = m * (x, y, 0, 1); GL rows count from the bottom.
      double clipX = m[0] * corner.x + m[4] * corner.y + m[12];
      double clipY = m[1] * corner.x + m[5] * corner.y + m[13];
      EXPECT_NEAR((clipX + 1) / 2 * kFbWidth, pixel.x, 1e-3) << c.name;
      EXPECT_NEAR(kFbHeight - (clipY + 1) / 2 * kFbHeight, pixel.y, 1e-3) << c.name;
    }
    EXPECT_DOUBLE_EQ(view.viewScale(), 1 / view.zoom()) << c.name;
  }
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
    EXPECT_NEAR(frame.x + frame.width / 2, c.area.x + c.area.width / 2, 1e-9);
    EXPECT_NEAR(frame.y + frame.height / 2, c.area.y + c.area.height / 2, 1e-9);
    // The corner-space origin is the frame's bottom-left corner, y up.
    Point2 bottomLeft = view.toCorner({frame.x, frame.y + frame.height});
    EXPECT_NEAR(bottomLeft.x, 0, 1e-9);
    EXPECT_NEAR(bottomLeft.y, 0, 1e-9);
  }
  ViewMapping view(640, 360);
  view.setArea({0, 0, 640, 360});
  view.setArea({0, 0, 1280, 720});
  EXPECT_TRUE(view.fitted());
  EXPECT_DOUBLE_EQ(view.zoom(), 2);
}

TEST(ViewMapping, ZoomKeepsThePivotAndItsLimitsAndResizingKeepsTheCentre) {
  ViewMapping view(320, 180);
  view.setArea({0, 0, 800, 600});
  Point2 pivot{123, 456};
  Point2 under = view.toCorner(pivot);
  view.zoomAbout(pivot, 1e6);
  EXPECT_DOUBLE_EQ(view.zoom(), ViewMapping::kLargestZoom);
  Point2 after = view.toCorner(pivot);
  EXPECT_NEAR(after.x, under.x, 1e-9);
  EXPECT_NEAR(after.y, under.y, 1e-9);
  view.zoomAbout(pivot, std::numeric_limits<double>::quiet_NaN());
  view.zoomAbout(pivot, 1e-9);
  EXPECT_DOUBLE_EQ(view.zoom(), ViewMapping::kSmallestZoom);
  EXPECT_FALSE(view.fitted());

  Point2 centre = view.toCorner({400, 300});
  view.setArea({100, 50, 400, 200});
  Point2 moved = view.toCorner({300, 150});
  EXPECT_NEAR(moved.x, centre.x, 1e-9);
  EXPECT_NEAR(moved.y, centre.y, 1e-9);
}

TEST(ViewMapping, ActualPixelsSitOnWholePixelsAndEventsRoundToFramePixels) {
  ViewMapping view(321, 181);
  view.setArea({0, 19, 881, 733});
  view.showActualPixels();
  PixelRect frame = view.frameRect();
  EXPECT_EQ(view.zoom(), 1);
  EXPECT_EQ(frame.x, std::floor(frame.x));
  EXPECT_EQ(frame.y, std::floor(frame.y));

  struct Case {
    Point2 corner;
    int32_t x, y;
  } cases[] = {{{10.4, -3.6}, 10, -4},
               {{0.5, -0.5}, 1, -1},
               {{1e30, -1e30}, 1000000000, -1000000000},
               {{std::nan(""), 7}, 0, 7}};
  for (const Case& c : cases) {
    EventPosition p = eventPosition(c.corner);
    EXPECT_EQ(p.x, c.x);
    EXPECT_EQ(p.y, c.y);
  }
}

}  // namespace
}  // namespace veltrane_viewer
