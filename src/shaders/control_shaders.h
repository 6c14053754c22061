// GLSL 4.10 fragment sources of the on-screen control programs. Each draws its handle
// analytically on one quad: anti-aliased segments of a given width with a soft halo, so
// handles look the same at every zoom. Their vertex stage is the effect's textured vertex.
#pragma once

#include <string>

namespace veltrane {
namespace shaders {

// A curved double arrow on the handle circle; with a sweep mode, a tick and a fading arc.
extern const std::string kRotationHandleFragment;
// A straight double arrow with a gap in its middle (cut moves, resize arrows).
extern const std::string kDoubleArrowFragment;
// The four edges of a rectangle, the flagged ones in the highlight colour.
extern const std::string kQuadEdgesFragment;
// Two crossing bars beside the pointer: a cut will be inserted.
extern const std::string kCutMarkerFragment;
// A plus with four arrowheads beside the pointer: the region's input will move.
extern const std::string kMoveMarkerFragment;

}  // namespace shaders
}  // namespace veltrane
