// Region partition: which region a cut's ray reaches, and the empty first region of a radial
// layout. (Which input shows where shows in the renders and the random layouts.)
#include "geometry/region_partition.h"

#include <gtest/gtest.h>

#include "common/param_ids.h"
#include "make_cut.h"

namespace veltrane {
namespace {

// A cut starting outside a region divides the one its ray enters first; a region the ray
// passes by is never reached, however near the lines of its edges run.
TEST(RegionPartition, ACutReachesOnlyTheRegionsItsRayEnters) {
  Region corner;
  corner.triangles.push_back(
      {{RegionVertex{0, 0, 0, 0}, RegionVertex{10, 0, 0, 0}, RegionVertex{0, 10, 0, 0}}});
  EXPECT_EQ(regionReach(corner, makeCut(1, -5, 5, 90)), 25.0f);  // enters at (0, 5)
  EXPECT_EQ(regionReach(corner, makeCut(1, -5, 20, 90)), kFloatMax);
}

TEST(RegionPartition, RadialLayoutStartsWithAnEmptyRegion) {
  const CutList cuts{makeCut(1, 40, 20, 10, true), makeCut(2, 40, 20, 100, true),
                     makeCut(3, 40, 20, -120, true)};
  const RegionList regions = partitionFrame(cuts, {1920, 1080}, kCutTypeRadial);
  ASSERT_EQ(regions.size(), 4u);
  EXPECT_TRUE(regions[0].triangles.empty());
  EXPECT_EQ(regions[0].id, 1);
  EXPECT_EQ(regions[1].id, 1);
}

}  // namespace
}  // namespace veltrane
