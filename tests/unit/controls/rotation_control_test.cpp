// Angle handle: which rotate cursor it shows, and what a pressed hover survives. (Where it is
// hit and how a drag turns it show in the viewer gestures.)
#include "controls/rotation_control.h"

#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "controls/handle_math.h"
#include "refhost/core/host.h"
#include "support/instrumented_host.h"

namespace {

using plugin_glsl_types::genVec2;
using veltrane::HandleMode;
using veltrane::RotationControl;

constexpr float kDegree = 3.1415927f / 180.0f;

// An angle parameter held by the test, in radians.
struct AngleParam {
  float radians = 0.0f;
  std::vector<float> written;
};

RotationControl controlFor(AngleParam& param) {
  return RotationControl(
      [&param](WispHost*, tagWispAPI*, float value, int) {
        param.written.push_back(value);
        param.radians = value;
      },
      [&param](WispHost*, tagWispAPI*, int) { return param.radians; }, 0, HandleMode::OnCircle,
      6.0f);
}

const genVec2 kCentre{500.0f, 400.0f};
const genVec2 kUnitScale{1.0f, 1.0f};

// Point at `distance` from the centre in direction `degrees`, nudged `along` the circle.
genVec2 around(float degrees, float distance, float along = 0.0f) {
  const float a = degrees * kDegree;
  return {kCentre.x + distance * std::sin(a) + along * std::cos(a),
          kCentre.y + distance * std::cos(a) - along * std::sin(a)};
}

TEST(RotationControl, HoverShowsTheRotateCursorOfTheHandlesOctant) {
  const struct {
    float degrees;
    int cursor;
  } cases[] = {{0, 10}, {135, 13}, {315, 17}, {-90, 16}, {-675, 11}, {3600 + 240, 15}};
  for (const auto& c : cases) {
    testsupport::InstrumentedHost host;
    AngleParam param{c.degrees * kDegree, {}};
    RotationControl control = controlFor(param);
    EXPECT_TRUE(control.test(host.handle(), &host.api(), kCentre, 100.0f, around(c.degrees, 100.0f),
                             kUnitScale, 1.0f, 0.0f, 0))
        << c.degrees;
    EXPECT_EQ(control.hot, 1);
    EXPECT_EQ(host.lastCursor(), c.cursor) << c.degrees;
  }
}

// Each rotate and resize cursor covers 45 degrees centred on its direction, upper bounds
// included: the cursor turns exactly half way between two directions.
TEST(RotationControl, CursorOctantsTurnHalfWayBetweenDirections) {
  const std::pair<float, int> cases[] = {{0, 0},      {22.5f, 0},   {22.51f, 1},
                                         {67.5f, 1},  {67.51f, 2},  {292.5f, 6},
                                         {337.5f, 7}, {337.51f, 0}, {359.9f, 0}};
  for (const auto& [degrees, octant] : cases)
    EXPECT_EQ(veltrane::handle_math::octantOfDegrees(degrees), octant) << degrees;
}

TEST(RotationControl, PressedHoverSurvivesButtonUpMovesOnlyOnTheStickyHost) {
  for (const int hostId : {0, static_cast<int>(kHostProductTouch)}) {
    testsupport::InstrumentedHost host;
    host.setHostId(hostId);
    AngleParam param;
    RotationControl control = controlFor(param);
    control.test(host.handle(), &host.api(), kCentre, 100.0f, around(0.0f, 100.0f), kUnitScale,
                 1.0f, 1.0f, 0);
    control.pressed = control.hot;
    const float anchor = control.grabPointerAngle;

    host.clearViewerRecords();
    EXPECT_FALSE(control.test(host.handle(), &host.api(), kCentre, 100.0f, around(90.0f, 300.0f),
                              kUnitScale, 1.0f, 0.0f, 0));
    const bool sticky = hostId == kHostProductTouch;
    EXPECT_EQ(control.hot, sticky ? 1 : 0) << hostId;
    EXPECT_EQ(control.grabPointerAngle == anchor, sticky) << hostId;
    EXPECT_EQ(host.redrawCount(), sticky ? 0 : 1) << hostId;
    EXPECT_TRUE(param.written.empty()) << "a button-up move never drags";
  }
}

}  // namespace
