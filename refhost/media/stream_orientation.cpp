// Reading a stream's display matrix, and the display size it and the sample aspect ratio give.
#include "refhost/media/stream_orientation.h"

extern "C" {
#include <libavformat/avformat.h>
#include <libavutil/display.h>
}

#include <algorithm>
#include <cmath>
#include <utility>

namespace refhost {

Orientation orientationOf(const AVStream* video) {
  Orientation orientation;
  const auto* matrix = reinterpret_cast<const int32_t*>(
      av_stream_get_side_data(video, AV_PKT_DATA_DISPLAYMATRIX, nullptr));
  if (!matrix) return orientation;
  const double rotation = av_display_rotation_get(matrix);
  if (std::isnan(rotation)) return orientation;
  const double quarter = rotation / 90.0;
  if (std::fabs(quarter - std::round(quarter)) > 1.0 / 90.0) return orientation;
  // Each of a, b, c, d in 16.16 fixed point is -1, 0 or 1 times the scale here.
  auto unit = [](int32_t value) { return value > 0x8000 ? 1 : value < -0x8000 ? -1 : 0; };
  Orientation turned{unit(matrix[0]), unit(matrix[1]), unit(matrix[3]), unit(matrix[4])};
  const bool straight = turned.b == 0 && turned.c == 0 && turned.a != 0 && turned.d != 0;
  const bool crossed = turned.a == 0 && turned.d == 0 && turned.b != 0 && turned.c != 0;
  return straight || crossed ? turned : orientation;
}

std::array<int32_t, 2> displaySize(int32_t storedWidth, int32_t storedHeight,
                                   const Orientation& orientation, int sarNumerator,
                                   int sarDenominator) {
  int32_t width = storedWidth, height = storedHeight;
  if (orientation.transposes()) {
    std::swap(width, height);
    std::swap(sarNumerator, sarDenominator);
  }
  if (sarNumerator > 0 && sarDenominator > 0 && sarNumerator != sarDenominator)
    width =
        static_cast<int32_t>(std::max<int64_t>(1, av_rescale(width, sarNumerator, sarDenominator)));
  return {width, height};
}

}  // namespace refhost
