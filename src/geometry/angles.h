// Single-precision constants of the split geometry and whole-turn angle arithmetic that finishes
// in bounded time for any input, infinities and NaN included.
#pragma once

namespace veltrane {

constexpr float kPi = 3.1415927f;
constexpr float kTwoPi = 6.2831855f;
constexpr float kHalfPi = 1.5707964f;
constexpr float kOneThird = 0.33333334f;
constexpr float kFloatEpsilon = 1.1920929e-7f;
constexpr float kFloatMax = 3.4028235e38f;

// Angles are stepped by whole turns one addition at a time, so that ordinary values come out
// with exactly the rounding of that loop. Past this many steps (about 25,700 radians) the loop
// gives way to a direct reduction; that also covers values whose float spacing exceeds a turn,
// where the loop would never end.
constexpr int kMaxTurnSteps = 4096;

inline float degreesToRadians(float degrees) { return degrees * kPi / 180.0f; }

// Brings an angle into [-pi, pi] by adding or subtracting whole turns; exactly -pi and pi stay
// as they are. Angles beyond kMaxTurnSteps turns are reduced with an exact remainder instead,
// which can differ from step-by-step subtraction in the last bits. NaN stays NaN, and so does an
// infinite angle, which has no direction.
float wrapAngle(float radians);

// Shifts the range [start, end] by whole turns so that it contains theta: up while theta lies
// above the end, then down while the start lies above theta. When the turn count exceeds
// kMaxTurnSteps it is computed directly; a range or theta that is not finite is left unshifted.
void shiftRangeToContain(float theta, float& start, float& end);

// Brings alpha into [start - epsilon, end + epsilon] by whole turns: up while it lies below the
// start, then down while it lies above the end. Bounded like shiftRangeToContain.
float wrapIntoRange(float alpha, float start, float end);

}  // namespace veltrane
