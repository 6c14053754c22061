// The overlay through the real module: handles where the controls are, the hovered one
// highlighted, nothing for a named viewer, resources and GL state given back.
#include "render_fixture.h"
#include "support/instrumented_host.h"
#include "viewer_events.h"

namespace {

using refhost::ParamValue;

constexpr int kW = 160;
constexpr int kH = 90;

// A 160 x 90 viewer over the render fixture, one Local cut at frame x (vertical).
class Viewer : public ViewerEvents {
 public:
  Viewer(RenderFixture& fixture, float cutX)
      : ViewerEvents(fixture.host(), kW, kH), host_(fixture.host()) {
    setCut(host_, 0, cutX, 0.0f, 0.0f);
  }
  ~Viewer() {
    if (target_.id) host_.deleteTexture(target_.id);
  }

  // Draws the overlay into a fresh transparent viewer picture, which the host attaches before
  // the overlay draws, and reads it back (rows from the bottom).
  std::vector<uint8_t> draw(const char* name = nullptr) {
    context().name = name;
    if (target_.id) host_.deleteTexture(target_.id);
    const std::vector<uint8_t> transparent(static_cast<size_t>(kW) * kH * 4, 0);
    target_ = host_.createTexture(kW, kH, transparent.data());
    host_.setDrawTarget(target_.id, kW, kH);
    glClearColor(0.25f, 0.5f, 0.75f, 1.0f);
    EXPECT_EQ(send(kMessageDrawOverlay, nullptr), 1);
    expectGlStateLeftForTheHost({0.25f, 0.5f, 0.75f, 1.0f});
    context().name = nullptr;
    EXPECT_EQ(host_.outstandingTextures() + host_.outstandingBuffers(), 0);
    for (const auto& error : host_.gl()->errors()) ADD_FAILURE() << "GL error: " << error.text;
    host_.gl()->clearErrors();
    // In GL's row order, so that row 0 is the frame's bottom as in corner space.
    return refhost::flipRows(refhost::readBack(target_.id, kW, kH).pixels, kW, kH);
  }

  // Largest alpha inside a box of corner pixels.
  static int maxAlpha(const std::vector<uint8_t>& image, int x0, int y0, int x1, int y1) {
    int best = 0;
    for (int y = std::max(0, y0); y <= std::min(kH - 1, y1); ++y)
      for (int x = std::max(0, x0); x <= std::min(kW - 1, x1); ++x)
        best = std::max<int>(best, image[(static_cast<size_t>(y) * kW + x) * 4 + 3]);
    return best;
  }

 private:
  testsupport::InstrumentedHost& host_;
  TextureRecord target_{};
};

TEST(OverlayDrawing, HoveredCutShowsItsArrowAndDirectionHandle) {
  RenderFixture fixture(refhost::GlProfile::Core, kW, kH);
  Viewer viewer(fixture, 0.0f);  // the line at corner x = 80

  // Away from every handle, over a region: cut 1's direction handle (a quarter turn off the
  // line, at (90, 45)) and the move marker beside the pointer.
  EXPECT_EQ(viewer.move(20, 70, false), 1);
  std::vector<uint8_t> image = viewer.draw();
  EXPECT_GT(Viewer::maxAlpha(image, 84, 39, 96, 51), 0);
  EXPECT_GT(Viewer::maxAlpha(image, 20, 70, 32, 82), 0);
  EXPECT_EQ(Viewer::maxAlpha(image, 0, 0, 40, 20), 0);   // far corner
  EXPECT_EQ(Viewer::maxAlpha(image, 0, 70, 12, 89), 0);  // the marker sits right of the pointer

  // On the line, above the direction handle: the move arrow appears at the pointer.
  EXPECT_EQ(viewer.move(81, 75, false), 1);
  image = viewer.draw();
  EXPECT_GT(Viewer::maxAlpha(image, 70, 70, 92, 80), 0);
  EXPECT_EQ(Viewer::maxAlpha(image, 0, 0, 40, 20), 0);

  // A named viewer gets nothing at all.
  image = viewer.draw("thumbnail");
  EXPECT_EQ(Viewer::maxAlpha(image, 0, 0, kW - 1, kH - 1), 0);
}

// The first hot handle in draw order takes the one highlight: here the cut's move arrow, drawn
// before its direction handle, which keeps a stale hot flag from the previous event.
TEST(OverlayDrawing, AtMostOneHandleIsHighlighted) {
  RenderFixture fixture(refhost::GlProfile::Core, kW, kH);
  Viewer viewer(fixture, 0.0f);
  viewer.context().viewScaleX = viewer.context().viewScaleY = 2.0;  // handle circle of 20 px
  // Full line coverage over its halo: a + (a / 2) x (1 - a) for the colour's alpha a.
  const int normal = 159, highlight = 215;  // a = 0.5 and a = 0.75

  EXPECT_EQ(viewer.move(100, 45, false), 1);  // on the direction handle only
  std::vector<uint8_t> image = viewer.draw();
  EXPECT_NEAR(Viewer::maxAlpha(image, 90, 35, 110, 55), highlight, 2);

  EXPECT_EQ(viewer.move(81, 75, false), 1);  // onto the line, away from the handle
  image = viewer.draw();
  EXPECT_NEAR(Viewer::maxAlpha(image, 66, 70, 96, 80), highlight, 2);  // the move arrow
  EXPECT_NEAR(Viewer::maxAlpha(image, 95, 35, 110, 55), normal, 2);    // no longer highlighted
}

TEST(OverlayDrawing, SelectedInputShowsItsRectangleAndHighlightsTheHoveredEdgeAlone) {
  RenderFixture fixture(refhost::GlProfile::Core, kW, kH);
  fixture.host().setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  Viewer viewer(fixture, -60.0f);  // input 0 shows right of corner x = 20

  // Pressing inside input 0's region selects it (and starts moving it); release ends the move.
  EXPECT_EQ(viewer.press(100, 60), 1);
  EXPECT_EQ(viewer.release(100, 60), 1);
  const std::vector<uint8_t> idle = viewer.draw();
  // Half-size rectangle centred on the frame: x 40 to 120, y 22.5 to 67.5.
  EXPECT_GT(Viewer::maxAlpha(idle, 38, 40, 42, 50), 0);    // left edge
  EXPECT_GT(Viewer::maxAlpha(idle, 118, 40, 122, 50), 0);  // right edge
  EXPECT_EQ(Viewer::maxAlpha(idle, 60, 35, 70, 40), 0);    // inside, away from every line
  // The pointer rests over a region: the move marker sits just beside it.
  EXPECT_GT(Viewer::maxAlpha(idle, 100, 60, 112, 72), 0);

  // Where each edge is hovered, and a stretch of it away from the resize arrow drawn there.
  const struct {
    int x, y, box[4];
  } edges[] = {{40, 45, {38, 25, 42, 31}},
               {120, 45, {118, 25, 122, 31}},
               {80, 22, {45, 20, 55, 24}},
               {80, 67, {45, 66, 55, 69}}};
  for (const auto& hovered : edges) {
    EXPECT_EQ(viewer.move(hovered.x, hovered.y, false), 1);
    const std::vector<uint8_t> image = viewer.draw();
    for (const auto& edge : edges) {
      const int now = Viewer::maxAlpha(image, edge.box[0], edge.box[1], edge.box[2], edge.box[3]);
      const int before = Viewer::maxAlpha(idle, edge.box[0], edge.box[1], edge.box[2], edge.box[3]);
      if (&edge == &hovered) {
        EXPECT_GT(now, before) << hovered.x << "," << hovered.y;
      } else {
        EXPECT_EQ(now, before) << hovered.x << "," << hovered.y;
      }
    }
  }
}

}  // namespace
