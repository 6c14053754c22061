// The region partition: a space-partitioning division of the frame, one cut at a time.
#include "geometry/region_partition.h"

#include <cmath>
#include <utility>

#include "common/param_ids.h"
#include "geometry/angles.h"

namespace veltrane {

namespace {

using plugin_glsl_types::genVec2;

genVec2 positionOf(const Cut& cut) { return {cut.positionX, cut.positionY}; }
genVec2 directionOf(const Cut& cut) { return {cut.directionX, cut.directionY}; }
genVec2 pointOf(const RegionVertex& vertex) { return {vertex.x, vertex.y}; }

bool samePoint(genVec2 a, genVec2 b) {
  const float dx = a.x - b.x;
  const float dy = a.y - b.y;
  return dx * dx + dy * dy == 0.0f;
}

// Positive to the left of the cut's direction (for direction +y: at smaller x).
float sideOf(const Cut& cut, float x, float y) {
  return (x - cut.positionX) * -cut.directionY + (y - cut.positionY) * cut.directionX;
}

// Positive when p lies to the left of the directed edge from a to b.
float edgeSide(const RegionVertex& a, const RegionVertex& b, genVec2 p) {
  return (b.x - a.x) * (p.y - a.y) - (b.y - a.y) * (p.x - a.x);
}

RegionVertex interpolate(const RegionVertex& a, const RegionVertex& b, float u) {
  return {a.x + u * (b.x - a.x), a.y + u * (b.y - a.y), a.s + u * (b.s - a.s),
          a.t + u * (b.t - a.t)};
}

// Where the cut's line crosses the edge from a to b, whose ends lie on opposite sides of it. The
// crossing is on the edge, but for a line running nearly along the edge rounding can put the
// solved parameter off it, or find the two parallel; holding it to the edge keeps the pieces
// tiling the triangle. Elsewhere the parameter is used as solved.
RegionVertex edgeCrossing(const Cut& cut, const RegionVertex& a, const RegionVertex& b) {
  float u = lineCrossing(cut, pointOf(a), pointOf(b), false);
  if (!(u >= 0.0f)) u = 0.0f;
  if (u > 1.0f) u = 1.0f;
  return interpolate(a, b, u);
}

// A vertex is alone on its side when its side value has one strict sign and both others the
// opposite strict sign.
bool aloneOnItsSide(float own, float other, float another) {
  return (own > 0.0f && other < 0.0f && another < 0.0f) ||
         (own < 0.0f && other > 0.0f && another > 0.0f);
}

// The angle of (x, y) around the origin measured from +y toward +x, as cut angles are.
float angleFromUp(float x, float y) {
  if (y == 0.0f) return x >= 0.0f ? kHalfPi : -kHalfPi;
  return std::atan2(x, y);
}

// Whether the triangle goes to the region split off by the cut.
bool movesToNewRegion(const RegionTriangle& triangle, const Cut& cut, float start, float end) {
  const auto& v = triangle.vertices;
  const float gx = (v[0].x + v[1].x + v[2].x) * kOneThird;
  const float gy = (v[0].y + v[1].y + v[2].y) * kOneThird;
  if (!cut.radial) return sideOf(cut, gx, gy) > 0.0f;
  const float alpha =
      wrapIntoRange(angleFromUp(gx - cut.positionX, gy - cut.positionY), start, end);
  return !(alpha > cut.angle);
}

}  // namespace

LineHit solveLineCrossing(genVec2 p, genVec2 d, genVec2 a, genVec2 b) {
  LineHit hit;
  float denominator;
  if (std::fabs(d.x) > std::fabs(d.y)) {
    const float k = d.y / d.x;
    denominator = (b.y - a.y) - (b.x - a.x) * k;
    if (denominator == 0.0f) return hit;
    hit.u = ((a.x - p.x) * k + (p.y - a.y)) / denominator;
    hit.v = (hit.u * (b.x - a.x) + a.x - p.x) / d.x;
  } else {
    const float k = d.x / d.y;
    denominator = (b.x - a.x) - (b.y - a.y) * k;
    if (denominator == 0.0f) return hit;
    hit.u = ((a.y - p.y) * k + (p.x - a.x)) / denominator;
    hit.v = (hit.u * (b.y - a.y) + a.y - p.y) / d.y;
  }
  hit.parallel = false;
  return hit;
}

float lineCrossing(const Cut& cut, genVec2 a, genVec2 b, bool rayOnly) {
  const genVec2 position = positionOf(cut);
  if (samePoint(position, a) || samePoint(position, b)) return rayOnly ? -1.0f : 0.0f;
  const LineHit hit = solveLineCrossing(position, directionOf(cut), a, b);
  if (hit.parallel) return -1.0f;
  if (rayOnly && !(hit.v > 0.0f)) return -1.0f;
  return hit.u;
}

RegionTriangle makeCcwTriangle(const RegionVertex& a, const RegionVertex& b,
                               const RegionVertex& c) {
  const float cross = (c.x - b.x) * (a.y - b.y) - (c.y - b.y) * (a.x - b.x);
  if (cross > 0.0f) return {{a, b, c}};
  return {{a, c, b}};
}

bool pointEntersTriangle(const RegionTriangle& triangle, const Cut& cut) {
  const genVec2 position = positionOf(cut);
  const genVec2 ahead = {position.x + cut.directionX, position.y + cut.directionY};
  const auto& v = triangle.vertices;
  for (int i = 0; i < 3; ++i) {
    const RegionVertex& a = v[i];
    const RegionVertex& b = v[(i + 1) % 3];
    const float side = edgeSide(a, b, position);
    const bool accepts = side > 0.0f || (side == 0.0f && edgeSide(a, b, ahead) > 0.0f);
    if (!accepts) return false;
  }
  return true;
}

void splitTriangle(RegionTriangle& triangle, const Cut& cut, std::vector<RegionTriangle>& pieces) {
  const RegionVertex v0 = triangle.vertices[0];
  const RegionVertex v1 = triangle.vertices[1];
  const RegionVertex v2 = triangle.vertices[2];
  const float s0 = sideOf(cut, v0.x, v0.y);
  const float s1 = sideOf(cut, v1.x, v1.y);
  const float s2 = sideOf(cut, v2.x, v2.y);
  if ((s0 >= 0.0f && s1 >= 0.0f && s2 >= 0.0f) || (s0 <= 0.0f && s1 <= 0.0f && s2 <= 0.0f)) {
    return;
  }
  // A line through one vertex and across the opposite edge makes two pieces; keeping that vertex
  // first keeps a radial fan's centre first in both. A line across two edges cuts off the vertex
  // alone on its side: a triangle at that vertex and a quadrilateral of two triangles.
  if (s0 == 0.0f) {
    const RegionVertex p = edgeCrossing(cut, v1, v2);
    triangle = makeCcwTriangle(v0, v1, p);
    pieces.push_back(makeCcwTriangle(v0, v2, p));
  } else if (s1 == 0.0f) {
    const RegionVertex p = edgeCrossing(cut, v2, v0);
    triangle = makeCcwTriangle(v1, v2, p);
    pieces.push_back(makeCcwTriangle(v0, v1, p));
  } else if (s2 == 0.0f) {
    const RegionVertex p = edgeCrossing(cut, v0, v1);
    triangle = makeCcwTriangle(v2, v0, p);
    pieces.push_back(makeCcwTriangle(v2, v1, p));
  } else if (aloneOnItsSide(s0, s1, s2)) {
    const RegionVertex p = edgeCrossing(cut, v0, v1);
    const RegionVertex q = edgeCrossing(cut, v0, v2);
    triangle = makeCcwTriangle(v0, p, q);
    pieces.push_back(makeCcwTriangle(v2, q, p));
    pieces.push_back(makeCcwTriangle(v1, v2, p));
  } else if (aloneOnItsSide(s1, s0, s2)) {
    const RegionVertex p = edgeCrossing(cut, v1, v0);
    const RegionVertex q = edgeCrossing(cut, v1, v2);
    triangle = makeCcwTriangle(v1, p, q);
    pieces.push_back(makeCcwTriangle(v2, q, p));
    pieces.push_back(makeCcwTriangle(v0, v2, p));
  } else if (aloneOnItsSide(s2, s0, s1)) {
    const RegionVertex p = edgeCrossing(cut, v2, v0);
    const RegionVertex q = edgeCrossing(cut, v2, v1);
    triangle = makeCcwTriangle(v2, p, q);
    pieces.push_back(makeCcwTriangle(v0, q, p));
    pieces.push_back(makeCcwTriangle(v1, v0, q));
  }
  // No case holds only when a side is NaN; such a triangle stays whole.
}

float regionReach(const Region& region, const Cut& cut) {
  if (region.triangles.empty()) return kFloatMax;
  for (const RegionTriangle& triangle : region.triangles) {
    if (pointEntersTriangle(triangle, cut)) return 0.0f;
  }
  float nearest = kFloatMax;
  for (const RegionTriangle& triangle : region.triangles) {
    const auto& v = triangle.vertices;
    for (int i = 0; i < 3; ++i) {
      const genVec2 a = pointOf(v[i]);
      const genVec2 b = pointOf(v[(i + 1) % 3]);
      const float u = lineCrossing(cut, a, b, true);
      if (!(u >= 0.0f && u <= 1.0f)) continue;
      const float dx = cut.positionX - ((1.0f - u) * a.x + u * b.x);
      const float dy = cut.positionY - ((1.0f - u) * a.y + u * b.y);
      const float squaredDistance = dx * dx + dy * dy;
      if (squaredDistance < nearest) nearest = squaredDistance;
    }
  }
  return nearest;
}

Region splitRegion(Region& region, const Cut& cut) {
  std::vector<RegionTriangle> pieces;
  for (RegionTriangle& triangle : region.triangles) splitTriangle(triangle, cut, pieces);
  region.triangles.insert(region.triangles.end(), pieces.begin(), pieces.end());

  float start = region.angleStart;
  float end = region.angleEnd;
  if (cut.radial) shiftRangeToContain(cut.angle, start, end);

  Region split;
  split.id = cut.cutNumber;
  split.angleStart = start;
  split.angleEnd = cut.angle;
  std::vector<RegionTriangle> staying;
  staying.reserve(region.triangles.size());
  for (const RegionTriangle& triangle : region.triangles) {
    if (movesToNewRegion(triangle, cut, start, end)) {
      split.triangles.push_back(triangle);
    } else {
      staying.push_back(triangle);
    }
  }
  region.triangles = std::move(staying);
  region.angleStart = cut.angle;
  region.angleEnd = end;
  return split;
}

RegionList makeInitialRegions(genVec2 frameSize, const Cut& firstCut) {
  const float width = frameSize.x;
  const float height = frameSize.y;
  const float halfWidth = width / 2.0f;
  const float halfHeight = height / 2.0f;
  const RegionVertex bottomLeft{-halfWidth, -halfHeight, 0.0f, 0.0f};
  const RegionVertex bottomRight{halfWidth, -halfHeight, 1.0f, 0.0f};
  const RegionVertex topRight{halfWidth, halfHeight, 1.0f, 1.0f};
  const RegionVertex topLeft{-halfWidth, halfHeight, 0.0f, 1.0f};

  Region region;
  region.id = 0;
  region.angleStart = firstCut.angle - kTwoPi;
  region.angleEnd = firstCut.angle;

  const float cx = firstCut.positionX;
  const float cy = firstCut.positionY;
  const bool centreInFrame =
      -halfWidth <= cx && cx <= halfWidth && -halfHeight <= cy && cy <= halfHeight;
  if (firstCut.radial && centreInFrame) {
    // A fan around the centre, so that every radial cut, running from the centre, meets each
    // triangle at its first vertex and divides it in two at most.
    const RegionVertex centre{cx, cy, width == 0.0f ? 0.5f : (cx + halfWidth) / width,
                              height == 0.0f ? 0.5f : (cy + halfHeight) / height};
    region.triangles = {makeCcwTriangle(centre, bottomLeft, topLeft),
                        makeCcwTriangle(centre, topLeft, topRight),
                        makeCcwTriangle(centre, topRight, bottomRight),
                        makeCcwTriangle(centre, bottomRight, bottomLeft)};
  } else {
    region.triangles = {makeCcwTriangle(bottomLeft, bottomRight, topLeft),
                        makeCcwTriangle(topLeft, bottomRight, topRight)};
  }
  return {region};
}

RegionList partitionFrame(const CutList& cuts, genVec2 frameSize, int32_t cutType) {
  if (cuts.empty()) return {};
  RegionList regions = makeInitialRegions(frameSize, cuts.front());
  // Radial layouts show inputs 1 to 8: the sector before the first cut is input 1's.
  if (cutType == kCutTypeRadial) {
    for (Region& region : regions) region.id = 1;
  }
  regions.reserve(cuts.size() + 1);
  for (const Cut& cut : cuts) {
    float best = kFloatMax;
    std::size_t target = regions.size();
    for (std::size_t i = 0; i < regions.size(); ++i) {
      const float reach = regionReach(regions[i], cut);
      if (best > reach) {
        best = reach;
        target = i;
      }
      // No reach is below 0, so no later region can win over one at 0.
      if (best == 0.0f) break;
    }
    if (target == regions.size()) continue;
    Region split = splitRegion(regions[target], cut);
    if (!split.triangles.empty()) regions.push_back(std::move(split));
  }
  return regions;
}

bool triangleContainsPoint(const RegionTriangle& triangle, genVec2 p) {
  const auto& v = triangle.vertices;
  return edgeSide(v[0], v[1], p) >= 0.0f && edgeSide(v[1], v[2], p) >= 0.0f &&
         edgeSide(v[2], v[0], p) >= 0.0f;
}

int32_t findRegionAt(const RegionList& regions, genVec2 point) {
  for (const Region& region : regions) {
    for (const RegionTriangle& triangle : region.triangles) {
      if (triangleContainsPoint(triangle, point)) return region.id;
    }
  }
  return -1;
}

}  // namespace veltrane
