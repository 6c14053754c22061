// Invariants of the whole geometry path (parameters -> cuts -> regions -> segments) over many
// seeded random layouts, Local and Radial, including tiny frames and coincident cuts.
#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <string>
#include <vector>

#include "common/param_ids.h"
#include "geometry/cut_model.h"
#include "geometry/cut_segments.h"
#include "geometry/region_partition.h"
#include "support/in_memory_host.h"

namespace veltrane {
namespace {

using plugin_glsl_types::genVec2;

struct Random {
  std::mt19937 engine;
  double unit() { return engine() / 4294967296.0; }
  float between(double low, double high) { return float(low + (high - low) * unit()); }
  int below(int count) { return int(unit() * count); }
  bool chance(double p) { return unit() < p; }
};

// Writes a random layout into the host's parameters. Positions and angles often repeat earlier
// ones or share a coordinate with them, so that cuts start on, run along or duplicate others.
void writeLayout(Random& random, testsupport::InMemoryHost& host, genVec2 frame, bool radial) {
  const int count = 1 + random.below(kMaxCuts);
  host.setInt(param::kNumberOfCuts, count);
  host.setInt(param::kCutType, radial ? kCutTypeRadial : 0);
  host.setPoint(param::kCutPositionGlobal, random.between(-0.6, 0.6) * frame.x,
                random.between(-0.6, 0.6) * frame.y);
  std::vector<genVec2> positions;
  std::vector<float> angles;
  for (int i = 0; i < count; ++i) {
    genVec2 p{random.between(-0.6, 0.6) * frame.x, random.between(-0.6, 0.6) * frame.y};
    if (i > 0 && random.chance(0.3)) {
      const genVec2 earlier = positions[random.below(i)];
      const double pick = random.unit();
      p = pick < 0.4 ? earlier : pick < 0.7 ? genVec2{earlier.x, p.y} : genVec2{p.x, earlier.y};
    }
    float degrees = random.chance(0.3) ? 45.0f * (random.below(17) - 8) : random.between(-400, 400);
    if (i > 0 && random.chance(0.15)) degrees = angles[random.below(i)];
    positions.push_back(p);
    angles.push_back(degrees);
    host.setPoint(cutParamId(param::kCutPositionPrefix, i), p.x, p.y);
    host.set(cutParamId(param::kCutDirectionPrefix, i), degrees);
  }
}

double signedArea(const RegionTriangle& triangle) {
  const auto& v = triangle.vertices;
  return 0.5 * ((double(v[1].x) - v[0].x) * (double(v[2].y) - v[0].y) -
                (double(v[1].y) - v[0].y) * (double(v[2].x) - v[0].x));
}

bool strictlyInside(const RegionTriangle& triangle, genVec2 p) {
  const auto& v = triangle.vertices;
  for (int i = 0; i < 3; ++i) {
    const RegionVertex& a = v[i];
    const RegionVertex& b = v[(i + 1) % 3];
    if (!((b.x - a.x) * (p.y - a.y) - (b.y - a.y) * (p.x - a.x) > 0.0f)) return false;
  }
  return true;
}

// Returns the first invariant the layout breaks, or an empty string.
std::string brokenInvariant(Random& random, genVec2 frame, bool radial, const CutList& cuts,
                            const RegionList& regions, const std::vector<CutSegment>& segments) {
  const double w = frame.x, h = frame.y, slack = 1e-4 * (w + h);
  const auto inFrame = [&](float x, float y) {
    return std::fabs(x) <= w / 2 + slack && std::fabs(y) <= h / 2 + slack;
  };
  double area = 0;
  for (const Region& region : regions) {
    if (region.id < (radial ? 1 : 0) || region.id > kMaxCuts) return "region id out of range";
    for (const RegionTriangle& triangle : region.triangles) {
      if (signedArea(triangle) < -1e-6 * (w + h) * (w + h)) return "clockwise triangle";
      area += signedArea(triangle);
      for (const RegionVertex& v : triangle.vertices) {
        if (!inFrame(v.x, v.y)) return "vertex outside the frame";
        if (std::fabs(v.s - (v.x + w / 2) / w) > 1e-4 ||
            std::fabs(v.t - (v.y + h / 2) / h) > 1e-4) {
          return "texture coordinate off its position";
        }
      }
      const RegionVertex& first = triangle.vertices[0];
      if (radial && (first.x != cuts[0].positionX || first.y != cuts[0].positionY)) {
        return "radial triangle not led by the centre";
      }
    }
  }
  if (std::fabs(area - w * h) > 1e-5 * w * h) return "areas do not sum to the frame";
  // A cut on the border of a frame under two pixels wide or high can point out of the frame and
  // find no border ahead; its segment runs off to FLT_MAX.
  for (const CutSegment& s : segments) {
    if (w >= 2 && h >= 2 && !(inFrame(s.start.x, s.start.y) && inFrame(s.end.x, s.end.y))) {
      return "segment leaves the frame";
    }
  }
  // Points on boundaries are left out: crossing points are rounded, leaving slivers there.
  for (int i = 0; i < 16; ++i) {
    const genVec2 p{random.between(-0.5, 0.5) * frame.x, random.between(-0.5, 0.5) * frame.y};
    if (findRegionAt(regions, p) < 0) return "point in no region";
    int covering = 0;
    for (const Region& region : regions) {
      for (const RegionTriangle& triangle : region.triangles)
        covering += strictlyInside(triangle, p);
    }
    if (covering > 1) return "overlapping triangles";
  }
  return "";
}

TEST(GeometryProperties, RandomLayoutsTileTheFrame) {
  Random random{std::mt19937(20240611)};
  testsupport::InMemoryHost host;
  for (int i = 0; i < 10000; ++i) {
    const bool tiny = random.chance(0.1);
    const genVec2 frame{float(1 + random.below(tiny ? 4 : 8192)),
                        float(1 + random.below(tiny ? 4 : 4320))};
    const bool radial = random.chance(0.5);
    host.clearCallLog();
    writeLayout(random, host, frame, radial);
    const CutList cuts = readCutList(host.handle(), host.record(), 0, frame, false, 1.0f);
    ASSERT_FALSE(cuts.empty());
    const RegionList regions = partitionFrame(cuts, frame, radial ? kCutTypeRadial : 0);
    const std::string broken =
        brokenInvariant(random, frame, radial, cuts, regions, clipCutSegments(cuts, frame));
    ASSERT_EQ(broken, "") << "layout " << i << ": " << frame.x << " x " << frame.y
                          << (radial ? " radial, " : " local, ") << cuts.size() << " cuts";
  }
}

}  // namespace
}  // namespace veltrane
