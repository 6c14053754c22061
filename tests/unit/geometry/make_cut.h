// Builds cuts directly, without a host, for the geometry tests.
#pragma once

#include <cmath>

#include "geometry/angles.h"
#include "geometry/cut_model.h"

namespace veltrane {

// A cut as the cut model would read it with no pixel aspect and a position already in the frame.
inline Cut makeCut(int number, float x, float y, float degrees, bool radial = false) {
  Cut cut;
  cut.positionX = x;
  cut.positionY = y;
  cut.angle = wrapAngle(degreesToRadians(degrees));
  cut.directionX = std::sin(cut.angle);
  cut.directionY = std::cos(cut.angle);
  cut.radial = radial ? 1 : 0;
  cut.cutNumber = number;
  return cut;
}

}  // namespace veltrane
