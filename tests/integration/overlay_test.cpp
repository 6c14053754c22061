// The overlay through the real module: handles appear where the controls are, nothing is
// drawn for a named viewer, and resources come back after every message.
#include "render_fixture.h"
#include "viewer_events.h"

namespace {

using refhost::ParamValue;

constexpr int kW = 160;
constexpr int kH = 90;

class Viewer : public ViewerEvents {
 public:
  explicit Viewer(RenderFixture& fixture)
      : ViewerEvents(fixture.host(), kW, kH), host_(fixture.host()) {}
  ~Viewer() {
    if (target_.id) host_.deleteTexture(target_.id);
  }

  int32_t pointer(int32_t message, int x, int y, double button) {
    WispPointerEvent event{x, y, button};
    return send(message, &event);
  }

  // Draws the overlay into a cleared viewer image and reads it back (rows from the bottom).
  std::vector<uint8_t> draw(const char* name = nullptr) {
    context().name = name;
    // A fresh transparent viewer picture, which the host attaches before the overlay draws.
    if (target_.id) host_.deleteTexture(target_.id);
    const std::vector<uint8_t> transparent(static_cast<size_t>(kW) * kH * 4, 0);
    target_ = host_.createTexture(kW, kH, transparent.data());
    host_.setDrawTarget(target_.id, kW, kH);
    glClearColor(0.25f, 0.5f, 0.75f, 1.0f);
    EXPECT_EQ(send(1003, nullptr), 1);
    expectGlStateLeftForTheHost({0.25f, 0.5f, 0.75f, 1.0f});
    context().name = nullptr;
    EXPECT_EQ(host_.outstandingTextures(), 0);
    EXPECT_EQ(host_.outstandingBuffers(), 0);
    for (const auto& error : host_.gl()->errors()) ADD_FAILURE() << "GL error: " << error.text;
    host_.gl()->clearErrors();
    return host_.readTexture(target_.id, kW, kH);
  }

  static int alphaAt(const std::vector<uint8_t>& image, int x, int y) {
    return image[(static_cast<size_t>(y) * kW + static_cast<size_t>(x)) * 4 + 3];
  }
  // Largest alpha inside a box of corner pixels.
  static int maxAlpha(const std::vector<uint8_t>& image, int x0, int y0, int x1, int y1) {
    int best = 0;
    for (int y = std::max(0, y0); y <= std::min(kH - 1, y1); ++y)
      for (int x = std::max(0, x0); x <= std::min(kW - 1, x1); ++x)
        best = std::max(best, alphaAt(image, x, y));
    return best;
  }

 private:
  refhost::Host& host_;
  TextureRecord target_{};
};

TEST(OverlayDrawing, HoveredCutShowsItsArrowAndDirectionHandle) {
  RenderFixture fixture(refhost::GlProfile::Core, kW, kH);
  refhost::Host& host = fixture.host();
  host.setValue("cutPosition_0", ParamValue::ofPoint(0.0f, 0.0f));
  host.setValue("cutDirection_0", ParamValue::ofFloat(0.0f));  // vertical line x = 80 corner
  Viewer viewer(fixture);

  // Away from every handle, over a region: cut 1's direction handle (a quarter turn off the
  // line, at (90, 45)) and the move marker beside the pointer.
  EXPECT_EQ(viewer.pointer(1004, 20, 70, 0.0), 1);
  std::vector<uint8_t> image = viewer.draw();
  EXPECT_GT(Viewer::maxAlpha(image, 84, 39, 96, 51), 0);
  EXPECT_GT(Viewer::maxAlpha(image, 20, 70, 32, 82), 0);
  EXPECT_EQ(Viewer::maxAlpha(image, 0, 0, 40, 20), 0);   // far corner
  EXPECT_EQ(Viewer::maxAlpha(image, 0, 70, 12, 89), 0);  // the marker sits right of the pointer

  // On the line, above the direction handle: the move arrow appears at the pointer.
  EXPECT_EQ(viewer.pointer(1004, 81, 75, 0.0), 1);
  image = viewer.draw();
  EXPECT_GT(Viewer::maxAlpha(image, 70, 70, 92, 80), 0);
  EXPECT_EQ(Viewer::maxAlpha(image, 0, 0, 40, 20), 0);

  // A named viewer gets nothing at all.
  image = viewer.draw("thumbnail");
  EXPECT_EQ(Viewer::maxAlpha(image, 0, 0, kW - 1, kH - 1), 0);
}

TEST(OverlayDrawing, SelectedInputShowsItsRectangleAndMarkers) {
  RenderFixture fixture(refhost::GlProfile::Core, kW, kH);
  refhost::Host& host = fixture.host();
  host.setValue("cutPosition_0", ParamValue::ofPoint(-60.0f, 0.0f));
  host.setValue("cutDirection_0", ParamValue::ofFloat(0.0f));
  host.setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  Viewer viewer(fixture);

  // Pressing inside input 0's region selects it (and starts moving it); release ends the move.
  EXPECT_EQ(viewer.pointer(1005, 120, 20, 1.0), 1);
  EXPECT_EQ(viewer.pointer(1006, 120, 20, 0.0), 1);
  EXPECT_EQ(host.undoStepNames(), (std::vector<std::string>{"Moved Split Screen Input 0"}));
  const std::vector<uint8_t> image = viewer.draw();
  // Half-size rectangle centred on the frame: x 40 to 120, y 22.5 to 67.5.
  EXPECT_GT(Viewer::maxAlpha(image, 38, 40, 42, 50), 0);    // left edge
  EXPECT_GT(Viewer::maxAlpha(image, 118, 40, 122, 50), 0);  // right edge
  EXPECT_EQ(Viewer::maxAlpha(image, 60, 35, 70, 40), 0);    // inside, away from every line
  // The pointer rests over a region: the move marker sits just beside it.
  EXPECT_GT(Viewer::maxAlpha(image, 120, 20, 132, 32), 0);
}

// The first hot handle in draw order takes the one highlight: here the cut's move arrow, drawn
// before its direction handle, which keeps a stale hot flag from the previous event.
TEST(OverlayDrawing, AtMostOneHandleIsHighlighted) {
  RenderFixture fixture(refhost::GlProfile::Core, kW, kH);
  refhost::Host& host = fixture.host();
  host.setValue("cutPosition_0", ParamValue::ofPoint(0.0f, 0.0f));
  host.setValue("cutDirection_0", ParamValue::ofFloat(0.0f));
  Viewer viewer(fixture);
  viewer.context().viewScaleX = viewer.context().viewScaleY = 2.0;  // handle circle of 20 px
  // Full line coverage over its halo: a + (a / 2) x (1 - a) for the colour's alpha a.
  const int normal = 159, highlight = 215;  // a = 0.5 and a = 0.75

  EXPECT_EQ(viewer.pointer(1004, 100, 45, 0.0), 1);  // on the direction handle only
  std::vector<uint8_t> image = viewer.draw();
  EXPECT_NEAR(Viewer::maxAlpha(image, 90, 35, 110, 55), highlight, 2);

  EXPECT_EQ(viewer.pointer(1004, 81, 75, 0.0), 1);  // onto the line, away from the handle
  image = viewer.draw();
  EXPECT_NEAR(Viewer::maxAlpha(image, 66, 70, 96, 80), highlight, 2);  // the move arrow
  EXPECT_NEAR(Viewer::maxAlpha(image, 95, 35, 110, 55), normal, 2);    // no longer highlighted
}

// Hovering one edge of the selected input's rectangle highlights that edge alone.
TEST(OverlayDrawing, HoveredEdgeOfTheSelectedInputIsHighlighted) {
  RenderFixture fixture(refhost::GlProfile::Core, kW, kH);
  refhost::Host& host = fixture.host();
  host.setValue("cutPosition_0", ParamValue::ofPoint(-60.0f, 0.0f));
  host.setValue("cutDirection_0", ParamValue::ofFloat(0.0f));
  host.setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  Viewer viewer(fixture);
  viewer.pointer(1005, 100, 60, 1.0);  // select input 0; its rectangle is x 40..120, y 22.5..67.5
  viewer.pointer(1006, 100, 60, 0.0);
  const std::vector<uint8_t> idle = viewer.draw();
  // Where each edge is hovered, and a stretch of it away from the resize arrow drawn there.
  const struct {
    int x, y, box[4];
  } edges[] = {{40, 45, {38, 25, 42, 31}},
               {120, 45, {118, 25, 122, 31}},
               {80, 22, {45, 20, 55, 24}},
               {80, 67, {45, 66, 55, 69}}};
  for (const auto& hovered : edges) {
    EXPECT_EQ(viewer.pointer(1004, hovered.x, hovered.y, 0.0), 1);
    const std::vector<uint8_t> image = viewer.draw();
    for (const auto& edge : edges) {
      const auto alpha = [&edge](const std::vector<uint8_t>& picture) {
        return Viewer::maxAlpha(picture, edge.box[0], edge.box[1], edge.box[2], edge.box[3]);
      };
      if (&edge == &hovered) {
        EXPECT_GT(alpha(image), alpha(idle)) << hovered.x << "," << hovered.y;
      } else {
        EXPECT_EQ(alpha(image), alpha(idle)) << hovered.x << "," << hovered.y;
      }
    }
  }
}

}  // namespace
