// Reading a stream's display matrix, and the display size it and the sample aspect ratio give.
#include "refhost/media/orientation.h"

extern "C" {
#include <libavformat/avformat.h>
#include <libavutil/display.h>
}

#include <cmath>
#include <cstring>
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

Orientation orientationOfExif(int tag) {
  // Tags 2 to 8 mirror, turn 180 degrees, flip, transpose, turn 90 degrees clockwise,
  // transverse and turn 90 degrees anticlockwise the stored picture to show it.
  constexpr Orientation kTags[] = {{1, 0, 0, 1}, {-1, 0, 0, 1}, {-1, 0, 0, -1}, {1, 0, 0, -1},
                                   {0, 1, 1, 0}, {0, 1, -1, 0}, {0, -1, -1, 0}, {0, -1, 1, 0}};
  return tag >= 1 && tag <= 8 ? kTags[tag - 1] : Orientation{};
}

RgbaImage upright(const RgbaImage& stored, const Orientation& orientation) {
  if (orientation.rowOrderOnly() && orientation.d > 0) return stored;
  const int32_t width = orientation.transposes() ? stored.height : stored.width;
  const int32_t height = orientation.transposes() ? stored.width : stored.height;
  const std::size_t pixel = bytesPerPixel(stored.format);
  std::vector<uint8_t> rows(stored.pixels.size());
  forEachShown(orientation, stored.width, stored.height, width, height,
               [&](std::size_t shown, std::ptrdiff_t source) {
                 std::memcpy(&rows[shown * pixel], &stored.pixels[source * pixel], pixel);
               });
  RgbaImage shown(width, height, stored.format);
  shown.pixels = flipRows(rows, width, height);
  return shown;
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
