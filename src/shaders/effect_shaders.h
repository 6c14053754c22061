// GLSL 4.10 sources of the effect's own programs: the split-screen composition, the distance
// field of the cuts, the border combine, layer alignment and the solid and copy helpers.
#pragma once

#include <string>

namespace veltrane {
namespace shaders {

// Vertex stages.
extern const std::string kTexturedVertex;        // position and texture coordinate through
extern const std::string kDistanceVertex;        // carries the vertex's z as the distance value
extern const std::string kSolidVertex;           // position only
extern const std::string kLayerAlignmentVertex;  // a layer's own transform and camera

// Fragment stages; each writes one vec4 at location 0.
extern const std::string kSplitScreenFragment;    // one region's moved, scaled, turned input
extern const std::string kCombineBorderFragment;  // composition with the anti-aliased border
extern const std::string kDistanceFragment;       // the interpolated distance value
extern const std::string kSolidFragment;          // one fill colour
extern const std::string kCopyFragment;           // the texture as it is

}  // namespace shaders
}  // namespace veltrane
