// The visible piece of every cut: its line (or ray) clipped by the frame border and by the
// pieces of earlier cuts. The render draws the border along these; the pointer handlers grab them.
#pragma once

#include <vector>

#include "common/glsl_types.h"
#include "geometry/cut_model.h"

namespace veltrane {

// Two frame-space points, each padded to four floats as (x, y, 0, 0).
struct CutSegment {
  plugin_glsl_types::genVec4 start;
  plugin_glsl_types::genVec4 end;
};
static_assert(sizeof(CutSegment) == 8 * sizeof(float), "a cut segment is eight floats");

// One segment per cut, in list order. Each runs from the nearest crossing behind the cut's
// position to the nearest one ahead, where crossings are the frame edges (top, bottom, left,
// right) and then the segments of earlier cuts; a radial cut never extends behind its position.
// A crossing within float epsilon ahead counts as the position itself. A cut with no crossing
// on a side (only possible on the border of a frame under two pixels wide or high) runs FLT_MAX
// along its direction on that side.
std::vector<CutSegment> clipCutSegments(const CutList& cuts, plugin_glsl_types::genVec2 frameSize);

}  // namespace veltrane
