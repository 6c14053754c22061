// How a video stream's pictures are shown, as FFmpeg describes the stream: turned by its display
// matrix, and widened or narrowed by its sample aspect ratio.
#pragma once

#include <array>
#include <cstdint>

#include "refhost/media/orientation.h"

struct AVStream;

namespace refhost {

// The orientation the stream's display matrix asks for; upright when it has none, or one that
// is no right angle.
Orientation orientationOf(const AVStream* video);

// The size a picture stored at storedWidth x storedHeight is shown at: turned, then its width
// scaled by the sample aspect ratio (sarNumerator / sarDenominator, ignored unless both are
// positive) at its height, as players size their window.
std::array<int32_t, 2> displaySize(int32_t storedWidth, int32_t storedHeight,
                                   const Orientation& orientation, int sarNumerator,
                                   int sarDenominator);

}  // namespace refhost
