// The times a render context carries for a frame, in whole milliseconds at any frame rate. (The
// other fields of the context show in every render of the module.)
#include "refhost/engine/render_frame.h"

#include <gtest/gtest.h>

namespace refhost {
namespace {

TEST(RenderFrame, MillisecondsFollowTheFrameRate) {
  const struct {
    int32_t frame;
    double rate;
    int32_t ms;
  } cases[] = {{0, 25, 0},     {25, 25, 1000}, {1, 30, 33},  {2, 30, 67},
               {1, 29.97, 33}, {3, 0, 120},    {-1, 25, -39}};
  for (const auto& c : cases)
    EXPECT_EQ(frameToMilliseconds(c.frame, c.rate), c.ms) << c.frame << " at " << c.rate;
}

}  // namespace
}  // namespace refhost
