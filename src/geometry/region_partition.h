// Division of the frame into regions of triangles, one cut at a time, each region tagged with the
// input it shows; and the point-in-region lookup of the pointer handlers.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

#include "common/glsl_types.h"
#include "geometry/cut_model.h"

namespace veltrane {

// A vertex in frame space (x, y) with its frame texture coordinate (s, t). Vertices made on an
// edge interpolate all four, so s = (x + W/2) / W and t = (y + H/2) / H hold up to rounding.
struct RegionVertex {
  float x = 0.0f;
  float y = 0.0f;
  float s = 0.0f;
  float t = 0.0f;
};

// Always counter-clockwise: cross(V1 - V0, V2 - V0) > 0, up to rounding for slivers.
struct RegionTriangle {
  std::array<RegionVertex, 3> vertices;
};

struct Region {
  std::vector<RegionTriangle> triangles;  // may be empty; order carries no meaning
  int32_t id = 0;                         // the input shown, 0 to 8
  float angleStart = 0.0f;                // angular range around a radial centre, radians
  float angleEnd = 0.0f;
};

// Regions are only ever appended; one that lost all its triangles stays in place.
using RegionList = std::vector<Region>;

// Applies every cut, in list order, to the one region it lies in (or, failing that, the region
// its ray reaches first). `cutType` 1 (Radial) makes the first region show input 1. An empty cut
// list gives no regions: there is nothing to start the frame's division from.
RegionList partitionFrame(const CutList& cuts, plugin_glsl_types::genVec2 frameSize,
                          int32_t cutType);

// One region with id 0 covering the frame: a fan of four triangles around the first cut's
// position when that cut is radial and inside the frame, else two triangles. Its angular range
// is the turn ending at the first cut's angle.
RegionList makeInitialRegions(plugin_glsl_types::genVec2 frameSize, const Cut& firstCut);

// How far the cut's position is from the region: 0 when it enters one of the region's triangles,
// else the squared distance to the nearest edge crossing ahead along the cut's ray, or FLT_MAX
// (never chosen) when there is none or the region is empty.
float regionReach(const Region& region, const Cut& cut);

// Cuts the region's triangles along the cut and moves one side (by side of the line for a Local
// cut, by angle around the centre for a Radial one) into the returned region, whose id is the
// cut number. The returned region may be empty.
Region splitRegion(Region& region, const Cut& cut);

// Cuts a triangle that the cut's line crosses: the triangle is replaced by its first piece and the
// other one or two are appended to `pieces`. A triangle touched only at a vertex, lying along the
// line or with an undefined side (NaN) stays whole.
void splitTriangle(RegionTriangle& triangle, const Cut& cut, std::vector<RegionTriangle>& pieces);

// (a, b, c) when counter-clockwise, else (a, c, b); a zero-area triangle comes out as (a, c, b).
RegionTriangle makeCcwTriangle(const RegionVertex& a, const RegionVertex& b, const RegionVertex& c);

// Whether the cut's position lies in the triangle. A position on an edge or a vertex belongs to
// the triangle its direction points into; a direction along an edge belongs to neither side.
bool pointEntersTriangle(const RegionTriangle& triangle, const Cut& cut);

// Where the cut's line crosses the segment from a to b, as the segment parameter u (crossing at
// a + u (b - a)), or -1 for parallel. With `rayOnly` the crossing must lie strictly ahead of the
// cut's position, else -1. A position exactly on a or b gives 0, or -1 with `rayOnly`.
float lineCrossing(const Cut& cut, plugin_glsl_types::genVec2 a, plugin_glsl_types::genVec2 b,
                   bool rayOnly);

// The crossing of the line p + v d with the line through a and b at a + u (b - a). Both are
// solved by eliminating with the larger component of d.
struct LineHit {
  bool parallel = true;
  float u = -1.0f;  // segment parameter
  float v = 0.0f;   // parameter along d
};
LineHit solveLineCrossing(plugin_glsl_types::genVec2 p, plugin_glsl_types::genVec2 d,
                          plugin_glsl_types::genVec2 a, plugin_glsl_types::genVec2 b);

// Whether p lies in the triangle or on its border.
bool triangleContainsPoint(const RegionTriangle& triangle, plugin_glsl_types::genVec2 p);

// The id of the first region, in list order, holding a triangle that contains the frame-space
// point, border included; -1 when none does.
int32_t findRegionAt(const RegionList& regions, plugin_glsl_types::genVec2 point);

}  // namespace veltrane
