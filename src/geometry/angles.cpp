// Whole-turn angle arithmetic with a bounded number of steps.
#include "geometry/angles.h"

#include <cmath>
#include <limits>

namespace veltrane {

namespace {

// Angles up to this size need at most kMaxTurnSteps turns to come into [-pi, pi].
constexpr float kSteppedAngleLimit = kMaxTurnSteps * kTwoPi;

// Narrows a double to float without leaving the float range (an out-of-range conversion is
// undefined behaviour in C++).
float toFloat(double value) {
  constexpr double kLargest = std::numeric_limits<float>::max();
  if (value > kLargest) return std::numeric_limits<float>::infinity();
  if (value < -kLargest) return -std::numeric_limits<float>::infinity();
  return static_cast<float>(value);
}

// Adds `turns` whole turns to a value; a turn count that is not finite leaves it alone.
float addTurns(float value, double turns) {
  if (!std::isfinite(turns)) return value;
  return toFloat(static_cast<double>(value) + turns * static_cast<double>(kTwoPi));
}

}  // namespace

float wrapAngle(float radians) {
  if (!(std::fabs(radians) <= kSteppedAngleLimit)) {
    // The remainder of the float angle by the float turn lies in [-pi, pi]; of NaN or an
    // infinity it is NaN.
    return static_cast<float>(std::remainder(static_cast<double>(radians), kTwoPi));
  }
  if (-kPi > radians) {
    while (-kPi > radians) radians += kTwoPi;
  } else if (radians > kPi) {
    while (radians > kPi) radians -= kTwoPi;
  }
  return radians;
}

void shiftRangeToContain(float theta, float& start, float& end) {
  if (theta > end) {
    int steps = 0;
    for (; theta > end && steps < kMaxTurnSteps; ++steps) {
      start += kTwoPi;
      end += kTwoPi;
    }
    if (theta > end) {
      const double turns =
          std::ceil((static_cast<double>(theta) - end) / static_cast<double>(kTwoPi));
      start = addTurns(start, turns);
      end = addTurns(end, turns);
    }
  }
  if (start > theta) {
    int steps = 0;
    for (; start > theta && steps < kMaxTurnSteps; ++steps) {
      start -= kTwoPi;
      end -= kTwoPi;
    }
    if (start > theta) {
      const double turns =
          std::ceil((static_cast<double>(start) - theta) / static_cast<double>(kTwoPi));
      start = addTurns(start, -turns);
      end = addTurns(end, -turns);
    }
  }
}

float wrapIntoRange(float alpha, float start, float end) {
  const float low = start - kFloatEpsilon;
  const float high = end + kFloatEpsilon;
  int steps = 0;
  for (; low > alpha && steps < kMaxTurnSteps; ++steps) alpha += kTwoPi;
  if (low > alpha) {
    alpha = addTurns(alpha, std::ceil((static_cast<double>(low) - alpha) / kTwoPi));
  }
  steps = 0;
  for (; alpha > high && steps < kMaxTurnSteps; ++steps) alpha -= kTwoPi;
  if (alpha > high) {
    alpha = addTurns(alpha, -std::ceil((static_cast<double>(alpha) - high) / kTwoPi));
  }
  return alpha;
}

}  // namespace veltrane
