// Small vector and angle helpers shared by the control classes. Angles follow the effect's
// convention: angle a points along (sin a, cos a), 0 along +y, growing toward +x.
#pragma once

#include "common/glsl_types.h"
#include "controls/control_constants.h"
#include "geometry/angles.h"
#include "host/wisp_protocol.h"

namespace veltrane {
namespace handle_math {

using plugin_glsl_types::genVec2;

inline float radiansToDegrees(float radians) { return radians * 180.0f / kPi; }

inline genVec2 add(genVec2 a, genVec2 b) { return {a.x + b.x, a.y + b.y}; }
inline genVec2 subtract(genVec2 a, genVec2 b) { return {a.x - b.x, a.y - b.y}; }
inline genVec2 scaled(genVec2 a, float s) { return {a.x * s, a.y * s}; }
inline float dot(genVec2 a, genVec2 b) { return a.x * b.x + a.y * b.y; }
float length(genVec2 a);

// The host's doubles as floats; values beyond the float range become infinities instead of
// the undefined result of a plain conversion.
float narrowToFloat(double value);

// Fractional part in [0, 1): a negative fraction has 1 added. Uses modf, so an angle of any
// size (1e30 included) costs the same.
float positiveFraction(float value);

// Octant 0..7 of a direction in degrees within [0, 360]: octant 0 spans (-22.5, 22.5], the
// others follow every 45 degrees. A value that compares with nothing (NaN) counts as octant 0.
int octantOfDegrees(float degrees);
// The same for an angle in radians of any size.
int octantOfRadians(float radians);

// Rotate cursor of the octant a rotation handle points into.
CursorShape rotateCursorForOctant(int octant);
// Resize cursor that moves along the octant's direction (opposite octants share one).
CursorShape resizeCursorForOctant(int octant);

// Turns p about centre by angle, the turn that carries +y onto (sin angle, cos angle).
genVec2 rotateAbout(genVec2 p, genVec2 centre, float angle);

}  // namespace handle_math
}  // namespace veltrane
