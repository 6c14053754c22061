// Turning pictures upright: the EXIF orientations and the turn itself.
#include "refhost/media/orientation.h"

#include <cstring>

namespace refhost {

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

}  // namespace refhost
