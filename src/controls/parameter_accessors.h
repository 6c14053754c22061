// The accessors that tie each control to its effect parameters, and the per-index bindings the
// instance record builds its controls with. Values cross in corner space and radians; the
// parameters hold frame space, degrees and percent.
#pragma once

#include "controls/accessors.h"

namespace veltrane {

// Writes cut `index`'s position from a corner-space point.
void writeCutPosition(WispHost* host, tagWispAPI* api, genVec2 value, int time, genVec2 frameSize,
                      int index);
// Writes cut `index`'s direction from the handle angle. A Local cut's handle sits on the
// line's normal, a quarter turn off the stored line direction.
void writeCutDirection(WispHost* host, tagWispAPI* api, float radians, int time, int index);
void writeInputRotation(WispHost* host, tagWispAPI* api, float radians, int time, int index);
// Moves and scales input `index` so that its picture fills `newRect`, the rectangle dragged
// from `grabRect` by the edges in `edgeMask`, as nearly as a uniform scale allows.
void writeInputRect(WispHost* host, tagWispAPI* api, genVec4 grabRect, genVec4 newRect,
                    char edgeMask, int time, genVec2 frameSize, int index);

// Input placement that a dragged rectangle asks for: translation in frame space and scale
// in percent, clamped to [kMinimumScalePercent, kMaximumScalePercent].
struct InputPlacement {
  genVec2 translation;
  float scalePercent;
};
constexpr float kMinimumScalePercent = 1.0f;
constexpr float kMaximumScalePercent = 1000.0f;

// Keeps the picture's aspect: an edge drag scales by its own axis, a corner drag by the larger
// of the two and pins the opposite corner. `rotation` (radians) turns the rectangle's own
// axes onto the screen about grabRect's centre.
InputPlacement placementForRect(genVec4 grabRect, genVec4 newRect, char edgeMask, float rotation,
                                genVec2 frameSize);

// Bindings. The position accessors are shared by all cuts (the control passes its index);
// the others are bound to one cut (0..7) or input (0..8). An index out of range throws.
PointGetter cutPositionGetter();
PointSetter cutPositionSetter();
AngleGetter cutDirectionGetter(int cutIndex);
AngleSetter cutDirectionSetter(int cutIndex);
AngleGetter inputRotationGetter(int inputIndex);
AngleSetter inputRotationSetter(int inputIndex);
QuadGetter inputRectGetter(int inputIndex);
QuadSetter inputRectSetter(int inputIndex);

}  // namespace veltrane
