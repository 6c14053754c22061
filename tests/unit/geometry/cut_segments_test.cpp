// Clipping cuts into visible segments where floats decide: a crossing within epsilon ahead of a
// cut's position. (Clipping by the frame and by earlier segments shows in the rendered borders.)
#include "geometry/cut_segments.h"

#include <gtest/gtest.h>

#include <vector>

#include "make_cut.h"

namespace veltrane {
namespace {

TEST(CutSegments, CrossingJustAheadCountsAsThePositionItself) {
  // The second cut starts a hair before the first segment, within float epsilon: it starts
  // there rather than ending there.
  const CutList cuts{makeCut(1, 0, 0, 0), makeCut(2, -5e-8f, 10, 90)};
  const std::vector<CutSegment> segments = clipCutSegments(cuts, {100, 100});
  EXPECT_NEAR(segments[1].start.x, -5e-8f, 1e-9f);
  EXPECT_NEAR(segments[1].end.x, 50, 1e-4f);
}

}  // namespace
}  // namespace veltrane
