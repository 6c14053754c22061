// Region partition: which input shows where, and which region a cut on a boundary divides.
// Tiling and orientation are checked over random layouts elsewhere.
#include "geometry/region_partition.h"

#include <gtest/gtest.h>

#include <vector>

#include "effect/param_ids.h"
#include "make_cut.h"

namespace veltrane {
namespace {

struct Probe {
  float x, y;
  int32_t id;
};

TEST(RegionPartition, InputsShownAcrossLayouts) {
  const int32_t radial = kCutTypeRadial;
  const struct {
    const char* what;
    CutList cuts;
    int32_t cutType;
    std::vector<Probe> probes;
  } cases[] = {
      {"one local cut splits off the left half",
       {makeCut(1, 0, 0, 0)},
       0,
       {{-500, 0, 1}, {500, 0, 0}, {-1, 539, 1}, {0, 0, 0}, {-960, -540, 1}, {961, 0, -1}}},
      {"one radial cut shows input 1 everywhere",
       {makeCut(1, 100, -50, 33, true)},
       radial,
       {{-900, 500, 1}, {900, -500, 1}, {100, -50, 1}}},
      {"radial sectors are numbered by the cut at their end",
       {makeCut(1, 0, 0, 0, true), makeCut(2, 0, 0, 90, true)},
       radial,
       {{300, 300, 2}, {300, -300, 1}, {-300, -300, 1}, {-300, 300, 1}}},
      {"a third radial cut takes the quarter before it",
       {makeCut(1, 0, 0, 0, true), makeCut(2, 0, 0, 90, true), makeCut(3, 0, 0, 180, true)},
       radial,
       {{300, 300, 2}, {300, -300, 3}, {-300, -300, 1}, {-300, 300, 1}}},
      {"radial cuts out of angle order",
       {makeCut(1, 0, 0, 90, true), makeCut(2, 0, 0, -90, true), makeCut(3, 0, 0, 0, true)},
       radial,
       {{300, 300, 1}, {300, -300, 2}, {-300, -300, 2}, {-300, 300, 3}}},
      {"a position on a boundary divides the region its direction points into",
       {makeCut(1, 0, 0, 0), makeCut(2, 0, 100, -90)},
       0,
       {{-500, 0, 2}, {-500, 300, 1}, {500, 300, 0}, {500, -300, 0}}},
      {"a local cut divides only the region holding its position",
       {makeCut(1, 0, 0, 0), makeCut(2, 300, 0, 90)},
       0,
       {{-500, 300, 1}, {-500, -300, 1}, {500, 300, 2}, {500, -300, 0}}},
      {"a cut along an existing boundary adds nothing",
       {makeCut(1, 0, 0, 0), makeCut(2, 0, 100, 0)},
       0,
       {{-500, 0, 1}, {500, 0, 0}}},
      {"no cuts, no regions", {}, 0, {{0, 0, -1}}},
  };
  for (const auto& c : cases) {
    const RegionList regions = partitionFrame(c.cuts, {1920, 1080}, c.cutType);
    for (const Probe& p : c.probes) {
      EXPECT_EQ(findRegionAt(regions, {p.x, p.y}), p.id) << c.what << " at " << p.x << ", " << p.y;
    }
  }
}

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
