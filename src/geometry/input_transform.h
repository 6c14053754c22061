// Placement of an input's picture in the frame: the sampling transform the region pass hands to
// its shader, and the rectangle and rotation the on-screen controls draw and edit.
#pragma once

#include <array>
#include <cstdint>

#include "common/glsl_types.h"
#include "host/wisp_api.h"

namespace veltrane {

// How a region samples its input's picture, in frame texture units. The picture is scaled about
// its centre, turned in a space where x is stretched by the frame's aspect ratio (so the turn is
// a true rotation on screen) and moved.
struct InputSampling {
  plugin_glsl_types::genVec2 sampleOffset;  // minus the translation, in frame texture units
  float inverseScale = 1.0f;
  float sampleRotation = 0.0f;                    // minus the rotation, radians
  float aspectRatio = 1.0f;                       // frame width over height
  std::array<float, 3> tint{{1.0f, 1.0f, 1.0f}};  // set by the region pass for the grey ramp
};

// The sampling transform of a picture moved by `translation` pixels, scaled by `scalePercent`
// and turned by `rotationDegrees`. A scale of 0 samples the picture unscaled, a frame of height 0
// has aspect ratio 1.
InputSampling makeInputSampling(plugin_glsl_types::genVec2 translation, float scalePercent,
                                float rotationDegrees, int32_t frameWidth, int32_t frameHeight,
                                float pixelAspect);

// The sampling transform of input `inputIndex` from its parameters. The pixel aspect applies
// only when `pixelAspectPresent` is set.
InputSampling readInputSampling(WispHost* host, const tagWispAPI* api, int32_t time,
                                int32_t frameWidth, int32_t frameHeight, bool pixelAspectPresent,
                                float pixelAspect, int inputIndex);

// The picture texture coordinate sampled at frame texture coordinate `frameCoordinate`; the
// picture shows there when both components lie in [0, 1]. A CPU copy of the shader's placement.
plugin_glsl_types::genVec2 inputTextureCoordinate(const InputSampling& sampling,
                                                  plugin_glsl_types::genVec2 frameCoordinate);

// The rectangle (x0, y0, x1, y1), in corner space and before rotation, that input `inputIndex`'s
// picture covers. No pixel aspect enters it.
plugin_glsl_types::genVec4 inputControlRect(WispHost* host, const tagWispAPI* api, int32_t time,
                                            plugin_glsl_types::genVec2 frameSize, int inputIndex);

// The rotation of input `inputIndex`'s picture in radians, not wrapped.
float inputRotationRadians(WispHost* host, const tagWispAPI* api, int32_t time, int inputIndex);

}  // namespace veltrane
