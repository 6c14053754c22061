// Angle folding and cursor choice for the control classes.
#include "controls/handle_math.h"

#include <cmath>
#include <limits>

namespace veltrane {
namespace handle_math {

float length(genVec2 a) { return std::sqrt(a.x * a.x + a.y * a.y); }

float narrowToFloat(double value) {
  constexpr double kLargest = std::numeric_limits<float>::max();
  if (value > kLargest) return std::numeric_limits<float>::infinity();
  if (value < -kLargest) return -std::numeric_limits<float>::infinity();
  return static_cast<float>(value);
}

float positiveFraction(float value) {
  float wholePart = 0.0f;
  float fraction = std::modf(value, &wholePart);
  if (fraction < 0.0f) fraction += 1.0f;
  return fraction;
}

int octantOfDegrees(float degrees) {
  if (degrees <= 22.5f || degrees > 337.5f) return 0;
  for (int octant = 1; octant < 8; ++octant) {
    if (degrees <= 22.5f + 45.0f * static_cast<float>(octant)) return octant;
  }
  return 0;
}

int octantOfRadians(float radians) {
  return octantOfDegrees(positiveFraction(radians * 0.5f / kPi) * 360.0f);
}

CursorShape rotateCursorForOctant(int octant) {
  return static_cast<CursorShape>(static_cast<int32_t>(CursorShape::Rotate0) + octant);
}

CursorShape resizeCursorForOctant(int octant) {
  return static_cast<CursorShape>(static_cast<int32_t>(CursorShape::Resize0) + octant % 4);
}

genVec2 rotateAbout(genVec2 p, genVec2 centre, float angle) {
  const float c = std::cos(angle);
  const float s = std::sin(angle);
  const genVec2 d = subtract(p, centre);
  return {centre.x + d.x * c + d.y * s, centre.y - d.x * s + d.y * c};
}

}  // namespace handle_math
}  // namespace veltrane
