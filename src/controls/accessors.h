// The callable objects through which a control reads and writes the effect parameter it edits.
// Controls see only corner-space geometry; the accessors own every parameter name and unit.
#pragma once

#include <functional>

#include "common/glsl_types.h"
#include "host/wisp_api.h"

namespace veltrane {

using plugin_glsl_types::genVec2;
using plugin_glsl_types::genVec4;

// One function serves every cut; the control passes its own index.
using PointGetter =
    std::function<genVec2(WispHost*, tagWispAPI*, int time, genVec2 frameSize, int index)>;
using PointSetter = std::function<void(WispHost*, tagWispAPI*, genVec2 value, int time,
                                       genVec2 frameSize, int index)>;
// Bound to one cut or input; angles in radians.
using AngleGetter = std::function<float(WispHost*, tagWispAPI*, int time)>;
using AngleSetter = std::function<void(WispHost*, tagWispAPI*, float radians, int time)>;
// Bound to one input; rectangles are (x0, y0, x1, y1) in corner space before rotation.
using QuadGetter = std::function<genVec4(WispHost*, tagWispAPI*, int time, genVec2 frameSize)>;
using QuadSetter = std::function<void(WispHost*, tagWispAPI*, genVec4 grabRect, genVec4 newRect,
                                      char edgeMask, int time, genVec2 frameSize)>;

}  // namespace veltrane
