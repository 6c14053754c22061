// Input rectangle: which part the pointer grabs and its cursor, and how a dragged edge or
// corner becomes the input's translation and uniform scale.
#include "controls/aa_quad_control.h"

#include <gtest/gtest.h>

#include "controls/parameter_accessors.h"
#include "refhost/core/host.h"

namespace {

using plugin_glsl_types::genVec2;
using plugin_glsl_types::genVec4;
using veltrane::AAQuadControl;
using veltrane::ControlPart;

constexpr float kQuarterTurn = 1.5707964f;
const genVec2 kFrame{1920.0f, 1080.0f};

struct RectParam {
  genVec4 rect;
  genVec4 written;
  char mask = 0;
  int writes = 0;
};

AAQuadControl controlFor(RectParam& param, uint8_t allowMove = 0) {
  return AAQuadControl(
      [&param](WispHost*, tagWispAPI*, genVec4, genVec4 rect, char mask, int, genVec2) {
        param.written = rect;
        param.mask = mask;
        ++param.writes;
      },
      [&param](WispHost*, tagWispAPI*, int, genVec2) { return param.rect; }, allowMove);
}

TEST(AAQuadControl, PartAndCursorUnderThePointer) {
  const genVec4 upright{100.0f, 100.0f, 300.0f, 200.0f};
  const genVec4 mirrored{300.0f, 100.0f, 100.0f, 200.0f};  // x0 > x1
  const struct {
    genVec4 rect;
    float rotation;
    uint8_t allowMove;
    genVec2 pointer;
    ControlPart part;
    int cursor;
  } cases[] = {
      {upright, 0.0f, 0, {100, 100}, ControlPart::CornerX0Y0, 7},
      {upright, 0.0f, 0, {300, 100}, ControlPart::CornerX1Y0, 9},
      {upright, 0.0f, 0, {102, 198}, ControlPart::CornerX0Y1, 9},
      {upright, 0.0f, 0, {302, 202}, ControlPart::CornerX1Y1, 7},
      {upright, 0.0f, 0, {200, 100}, ControlPart::EdgeY0, 6},
      {upright, 0.0f, 0, {200, 196}, ControlPart::EdgeY1, 6},
      {upright, 0.0f, 0, {97, 150}, ControlPart::EdgeX0, 8},
      {upright, 0.0f, 0, {300, 150}, ControlPart::EdgeX1, 8},
      {upright, 0.0f, 0, {200, 105}, ControlPart::None, 0},
      {upright, 0.0f, 0, {200, 150}, ControlPart::None, 0},
      {upright, 0.0f, 1, {200, 150}, ControlPart::Inside, 3},
      {upright, 0.0f, 1, {50, 50}, ControlPart::None, 0},
      {upright, 0.0f, 1, {350, 150}, ControlPart::None, 0},
      // A quarter turn carries the x1 edge's middle below the centre (200, 150).
      {upright, kQuarterTurn, 0, {200, 50}, ControlPart::EdgeX1, 6},
      {upright, kQuarterTurn, 0, {250, 150}, ControlPart::EdgeY1, 8},
      {upright, kQuarterTurn, 0, {150, 50}, ControlPart::CornerX1Y0, 7},
      {upright, -kQuarterTurn, 0, {150, 50}, ControlPart::CornerX0Y1, 7},
      // Mirrored in x: its x0 edge is on the right and the diagonals swap.
      {mirrored, 0.0f, 0, {300, 100}, ControlPart::CornerX0Y0, 9},
      {mirrored, 0.0f, 0, {100, 200}, ControlPart::CornerX1Y1, 9},
  };
  for (const auto& c : cases) {
    refhost::Host host;
    RectParam param{c.rect, {}, 0, 0};
    AAQuadControl control = controlFor(param, c.allowMove);
    EXPECT_EQ(
        control.test(host.handle(), &host.api(), kFrame, c.pointer, {1, 1}, 0.0f, 0, c.rotation),
        c.part != ControlPart::None);
    EXPECT_EQ(control.part, c.part) << c.pointer.x << "," << c.pointer.y << " @" << c.rotation;
    EXPECT_EQ(static_cast<int>(control.cursor), c.cursor)
        << c.pointer.x << "," << c.pointer.y << " @" << c.rotation;
    EXPECT_EQ(host.cursorShapes(), std::vector<int32_t>{c.cursor});
    EXPECT_EQ(host.redrawCount(), c.part != ControlPart::None ? 1 : 0) << "the part changed";
  }
}

TEST(InputRectPlacement, EdgesAndCornersScaleUniformly) {
  // Frame 200 x 100; the input covers it exactly (translation 0, scale 100).
  const genVec2 frame{200.0f, 100.0f};
  const genVec4 grab{0.0f, 0.0f, 200.0f, 100.0f};
  const struct {
    genVec4 dragged;
    char mask;
    genVec2 translation;
    float scale;
  } cases[] = {
      {{0, 0, 300, 100}, 2, {50, 0}, 150},            // x1 edge: scale by width, about the middle
      {{0, 0, 200, 50}, 4, {0, -25}, 50},             // y1 edge
      {{0, 0, 300, 120}, 2 | 4, {50, 25}, 150},       // corner (x1, y1): wider wins, (0, 0) stays
      {{0, 0, 220, 150}, 2 | 4, {50, 25}, 150},       // taller wins: x0 stays
      {{-100, 0, 200, 100}, 8 | 1, {-50, -25}, 150},  // corner (x0, y0): (200, 100) stays
      {{0, -60, 200, 100}, 8 | 1, {-60, -30}, 160},
      {{10, 20, 210, 120}, 15, {10, 20}, 100},  // all four edges: a move
  };
  for (const auto& c : cases) {
    const auto placement = veltrane::placementForRect(grab, c.dragged, c.mask, 0.0f, frame);
    EXPECT_NEAR(placement.translation.x, c.translation.x, 1e-4f) << int(c.mask);
    EXPECT_NEAR(placement.translation.y, c.translation.y, 1e-4f) << int(c.mask);
    EXPECT_NEAR(placement.scalePercent, c.scale, 1e-3f) << int(c.mask);
  }
}

}  // namespace
