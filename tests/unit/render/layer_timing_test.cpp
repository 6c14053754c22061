// Conversions between composition milliseconds and frames: a time exactly between two frames
// stays on the earlier one, and times no frame number can hold land on frame 0.
#include <gtest/gtest.h>

#include <cmath>

#include "render/layer_state.h"

namespace veltrane {
namespace {

TEST(LayerTiming, HalfWayTimesRoundToTheEarlierFrame) {
  const struct {
    double milliseconds, rate;
    int32_t frame;
  } frames[] = {{0, 25, 0},    {20, 25, 0},    {21, 25, 1},           {40, 25, 1},   {-20, 25, 0},
                {-60, 25, -1}, {1500, 30, 45}, {std::nan(""), 25, 0}, {1e300, 25, 0}};
  for (const auto& c : frames)
    EXPECT_EQ(frameOfTime(c.milliseconds, c.rate), c.frame) << c.milliseconds << " at " << c.rate;

  const struct {
    int32_t frame;
    double rate;
    int32_t milliseconds;
  } times[] = {{1, 2000, 0},   {3, 2000, 1}, {1, 30, 33},   {2, 30, 67},
               {45, 30, 1500}, {3, 0, 120},  {-1, 25, -39}, {2000000000, 0.001, 0}};
  for (const auto& c : times)
    EXPECT_EQ(timeOfFrame(c.frame, c.rate), c.milliseconds) << c.frame << " at " << c.rate;
}

}  // namespace
}  // namespace veltrane
