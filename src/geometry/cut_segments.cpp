// Clipping each cut's line or ray into its visible segment.
#include "geometry/cut_segments.h"

#include "geometry/angles.h"
#include "geometry/region_partition.h"

namespace veltrane {

namespace {

using plugin_glsl_types::genVec2;

// The stretch [behind, ahead] of a cut's line, in units of its direction from its position.
struct LineSpan {
  float behind;
  float ahead;
};

// Narrows the span by the crossing of the cut's line with the segment from a to b.
void clipByEdge(const Cut& cut, genVec2 a, genVec2 b, LineSpan& span) {
  const genVec2 position{cut.positionX, cut.positionY};
  const float ax = position.x - a.x;
  const float ay = position.y - a.y;
  const float bx = position.x - b.x;
  const float by = position.y - b.y;
  if (ax * ax + ay * ay == 0.0f || bx * bx + by * by == 0.0f) {
    // Starting on an end point: the cut runs on from here but not back across it.
    if (span.behind < 0.0f) span.behind = 0.0f;
    return;
  }
  const LineHit hit = solveLineCrossing(position, {cut.directionX, cut.directionY}, a, b);
  if (hit.parallel || !(hit.u >= 0.0f && hit.u <= 1.0f)) return;
  if (hit.v > kFloatEpsilon) {
    if (hit.v < span.ahead) span.ahead = hit.v;
  } else {
    // A crossing a hair ahead is where the cut starts, not an end to it.
    const float behind = hit.v > 0.0f ? 0.0f : hit.v;
    if (behind > span.behind) span.behind = behind;
  }
}

genVec2 endPoint(const CutSegment& segment) { return {segment.end.x, segment.end.y}; }
genVec2 startPoint(const CutSegment& segment) { return {segment.start.x, segment.start.y}; }

}  // namespace

std::vector<CutSegment> clipCutSegments(const CutList& cuts, genVec2 frameSize) {
  const float halfWidth = frameSize.x / 2.0f;
  const float halfHeight = frameSize.y / 2.0f;
  const genVec2 frameEdges[4][2] = {
      {{-halfWidth, halfHeight}, {halfWidth, halfHeight}},    // top
      {{-halfWidth, -halfHeight}, {halfWidth, -halfHeight}},  // bottom
      {{-halfWidth, -halfHeight}, {-halfWidth, halfHeight}},  // left
      {{halfWidth, -halfHeight}, {halfWidth, halfHeight}},    // right
  };

  std::vector<CutSegment> segments;
  segments.reserve(cuts.size());
  for (const Cut& cut : cuts) {
    LineSpan span{cut.radial ? 0.0f : -kFloatMax, kFloatMax};
    for (const auto& edge : frameEdges) clipByEdge(cut, edge[0], edge[1], span);
    for (const CutSegment& earlier : segments) {
      clipByEdge(cut, startPoint(earlier), endPoint(earlier), span);
    }
    CutSegment segment;
    segment.start = {cut.positionX + span.behind * cut.directionX,
                     cut.positionY + span.behind * cut.directionY, 0.0f, 0.0f};
    segment.end = {cut.positionX + span.ahead * cut.directionX,
                   cut.positionY + span.ahead * cut.directionY, 0.0f, 0.0f};
    segments.push_back(segment);
  }
  return segments;
}

}  // namespace veltrane
