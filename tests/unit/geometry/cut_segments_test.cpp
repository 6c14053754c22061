// Clipping cuts into visible segments by the frame border and by earlier segments.
#include "geometry/cut_segments.h"

#include <gtest/gtest.h>

#include <array>
#include <vector>

#include "make_cut.h"

namespace veltrane {
namespace {

TEST(CutSegments, ClippedByFrameThenEarlierSegments) {
  const struct {
    const char* what;
    CutList cuts;
    std::vector<std::array<float, 4>> segments;  // start x, start y, end x, end y
  } cases[] = {
      {"a local cut through the centre spans the frame",
       {makeCut(1, 0, 0, 0)},
       {{0, -540, 0, 540}}},
      {"a local cut starting on an earlier segment runs forward only",
       {makeCut(1, 0, 0, 0), makeCut(2, 0, 100, 90)},
       {{0, -540, 0, 540}, {0, 100, 960, 100}}},
      {"an earlier segment ahead ends the cut",
       {makeCut(1, 0, 0, 0), makeCut(2, 200, 0, -90)},
       {{0, -540, 0, 540}, {960, 0, 0, 0}}},
      {"earlier segments clip on both sides",
       {makeCut(1, 0, 0, 0), makeCut(2, 300, 0, 90), makeCut(3, 500, 200, 0)},
       {{0, -540, 0, 540}, {0, 0, 960, 0}, {500, 0, 500, 540}}},
      {"radial cuts run from the centre to the border",
       {makeCut(1, 0, 0, 0, true), makeCut(2, 0, 0, 90, true), makeCut(3, 0, 0, -135, true)},
       {{0, 0, 0, 540}, {0, 0, 960, 0}, {0, 0, -540, -540}}},
      {"a radial cut never runs behind its position",
       {makeCut(1, 100, 50, 0, true)},
       {{100, 50, 100, 540}}},
      {"no cuts, no segments", {}, {}},
  };
  for (const auto& c : cases) {
    const std::vector<CutSegment> segments = clipCutSegments(c.cuts, {1920, 1080});
    ASSERT_EQ(segments.size(), c.segments.size()) << c.what;
    for (std::size_t i = 0; i < segments.size(); ++i) {
      const CutSegment& s = segments[i];
      const float actual[4] = {s.start.x, s.start.y, s.end.x, s.end.y};
      for (int k = 0; k < 4; ++k) EXPECT_NEAR(actual[k], c.segments[i][k], 1e-3f) << c.what;
      EXPECT_EQ(s.start.z + s.start.w + s.end.z + s.end.w, 0.0f);
    }
  }
}

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
