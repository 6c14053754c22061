// Cut position handle: the open segment as grab area and the cursor it shows there. (The press
// that pins the position onto the clicked point shows in the viewer gestures.)
#include "controls/cut_position_control.h"

#include <gtest/gtest.h>

#include <vector>

#include "refhost/core/host.h"
#include "support/instrumented_host.h"

namespace {

using plugin_glsl_types::genVec2;
using veltrane::SplitScreenCutPositionControl;

struct PointParam {
  genVec2 value;
};

SplitScreenCutPositionControl controlFor(PointParam& param) {
  return SplitScreenCutPositionControl(
      [&param](WispHost*, tagWispAPI*, genVec2 value, int, genVec2, int) { param.value = value; },
      [&param](WispHost*, tagWispAPI*, int, genVec2, int) { return param.value; }, 0);
}

const genVec2 kFrame{1920.0f, 1080.0f};

// Tests the pointer against the segment from a to b; the cursors asked for on the way.
bool hot(genVec2 a, genVec2 b, genVec2 pointer, float viewScale, std::vector<int32_t>* cursors) {
  testsupport::InstrumentedHost host;
  PointParam param;
  SplitScreenCutPositionControl control = controlFor(param);
  const bool result = control.test(host.handle(), &host.api(), kFrame, a, b, pointer,
                                   {viewScale, viewScale}, 0.0f, 0);
  EXPECT_EQ(control.hot, result ? 1 : 0);
  *cursors = host.cursorShapes();
  return result;
}

TEST(CutPositionControl, HotOnlyBetweenTheEndsAndWithinReach) {
  const genVec2 a{100.0f, 100.0f};
  const genVec2 b{100.0f, 300.0f};
  const struct {
    genVec2 pointer;
    float viewScale;
    bool hot;
    int cursor;  // -1: no cursor call at all
  } cases[] = {
      {{100.0f, 200.0f}, 1.0f, true, 8},   {{114.9f, 200.0f}, 1.0f, true, 8},
      {{115.0f, 200.0f}, 1.0f, false, 0},  {{85.5f, 150.0f}, 1.0f, true, 8},
      {{107.0f, 200.0f}, 2.0f, true, 8},   {{108.0f, 200.0f}, 2.0f, false, 0},
      {{105.0f, 100.5f}, 1.0f, true, 8},   {{105.0f, 100.0f}, 1.0f, false, -1},  // t = 0
      {{100.0f, 300.0f}, 1.0f, false, -1},                                       // t = 1
      {{100.0f, 50.0f}, 1.0f, false, -1},  {{100.0f, 301.0f}, 1.0f, false, -1},
  };
  std::vector<int32_t> cursors;
  for (const auto& c : cases) {
    EXPECT_EQ(hot(a, b, c.pointer, c.viewScale, &cursors), c.hot)
        << c.pointer.x << "," << c.pointer.y;
    EXPECT_EQ(cursors, c.cursor < 0 ? std::vector<int32_t>{} : std::vector{c.cursor})
        << c.pointer.x << "," << c.pointer.y;
  }
  // Across a horizontal segment the reach follows the vertical view scale.
  EXPECT_TRUE(hot(a, {300.0f, 100.0f}, {200.0f, 107.0f}, 2.0f, &cursors));
  EXPECT_FALSE(hot(a, {300.0f, 100.0f}, {200.0f, 108.0f}, 2.0f, &cursors));
  // A zero-length segment has no inside at all.
  EXPECT_FALSE(hot(a, a, a, 1.0f, &cursors));
  EXPECT_TRUE(cursors.empty());
}

}  // namespace
