// How a stored picture is turned to be shown upright: right angles and flips, as players honour
// a stream's display matrix without a rotate filter and viewers a photo's EXIF orientation.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "refhost/media/rgba_image.h"

namespace refhost {

// A displayed pixel (x', y') comes from the stored (x, y) with x' = a x + c y and y' = b x + d y,
// counted from the far edge where negative; each of a, b, c, d is -1, 0 or 1.
struct Orientation {
  int a = 1, b = 0, c = 0, d = 1;

  bool transposes() const { return a == 0; }
  // Needs no pass of its own: a scaler writes rows in either order.
  bool rowOrderOnly() const { return a == 1 && b == 0 && c == 0; }
};

// The orientation of a photo's EXIF orientation tag, 1 (as stored) to 8; upright for any
// other value.
Orientation orientationOfExif(int tag);

// The picture turned as the orientation says, top row first.
RgbaImage upright(const RgbaImage& stored, const Orientation& orientation);

// Calls shown(i, s) for every displayed pixel: i counts the `width` x `height` displayed pixels
// in GL's row order (bottom row first); s is the index of the stored pixel it shows, of the
// stored picture (`storedWidth` wide, top row first) that the orientation turns upright.
template <typename Shown>
void forEachShown(const Orientation& orientation, int32_t storedWidth, int32_t storedHeight,
                  int32_t width, int32_t height, Shown shown) {
  // The stored pixel of the displayed top left, and the steps for a displayed step right and
  // down.
  std::ptrdiff_t origin, stepX, stepY;
  if (!orientation.transposes()) {
    origin = (orientation.a > 0 ? 0 : storedWidth - 1) +
             static_cast<std::ptrdiff_t>(orientation.d > 0 ? 0 : storedHeight - 1) * storedWidth;
    stepX = orientation.a;
    stepY = static_cast<std::ptrdiff_t>(orientation.d) * storedWidth;
  } else {
    origin = (orientation.b > 0 ? 0 : storedWidth - 1) +
             static_cast<std::ptrdiff_t>(orientation.c > 0 ? 0 : storedHeight - 1) * storedWidth;
    stepX = static_cast<std::ptrdiff_t>(orientation.c) * storedWidth;
    stepY = orientation.b;
  }
  auto row = [&](int32_t y) { return static_cast<std::size_t>(glRowOf(y, height)) * width; };
  if (!orientation.transposes()) {
    for (int32_t y = 0; y < height; ++y) {
      const std::size_t first = row(y);
      const std::ptrdiff_t start = origin + y * stepY;
      for (int32_t x = 0; x < width; ++x) shown(first + x, start + x * stepX);
    }
    return;
  }
  // Displayed columns are stored rows: tiles of a few displayed rows read each stored row along
  // instead of across.
  constexpr int32_t kTile = 16;
  for (int32_t top = 0; top < height; top += kTile) {
    const int32_t bottom = std::min(top + kTile, height);
    for (int32_t x = 0; x < width; ++x)
      for (int32_t y = top; y < bottom; ++y) shown(row(y) + x, origin + x * stepX + y * stepY);
  }
}

}  // namespace refhost
