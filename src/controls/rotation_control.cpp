// Hover test and drag step of the angle handle. The drag adds the pointer's shortest turn since
// the last anchor to the anchored value, and re-anchors after every large step, so the value
// follows the pointer continuously through any number of turns.
#include "controls/rotation_control.h"

#include <algorithm>
#include <cmath>
#include <utility>

#include "controls/handle_math.h"

namespace veltrane {

using namespace handle_math;

namespace {

// The handle's hit area, as fractions of the handle size: across the circle and along it.
constexpr float kRadialReach = 0.25f;
constexpr float kTangentialReach = 0.6f;

float signOf(float v) { return static_cast<float>((v > 0.0f) - (v < 0.0f)); }

// Pointer angle round the centre, in the same sense as the parameter angle.
float pointerAngle(genVec2 offset) { return std::atan2(-offset.y, offset.x); }

}  // namespace

RotationControl::RotationControl(AngleSetter setter, AngleGetter getter, int32_t showSweep,
                                 HandleMode handleMode, float sizeFactor)
    : setter(std::move(setter)),
      getter(std::move(getter)),
      showSweep(showSweep),
      handleMode(handleMode),
      sizeFactor(sizeFactor) {}

bool RotationControl::test(WispHost* host, tagWispAPI* api, genVec2 centre, float radius,
                           genVec2 pointer, genVec2 viewScale, float uiScale, float button,
                           int time) {
  if (pressed && button > 0.5f) return dragStep(host, api, centre, pointer, time);
  return hoverTest(host, api, centre, radius, pointer, viewScale, uiScale, button, time);
}

RotationControl::HandleGeometry RotationControl::handleGeometry(float radius, genVec2 viewScale,
                                                                float uiScale) const {
  const float size = std::min(2.0f * radius, (viewScale.x + viewScale.y) * sizeFactor) * uiScale;
  const float half = size / 2.0f;
  float handleRadius = radius;
  if (handleMode == HandleMode::Outside) handleRadius = radius + half;
  if (handleMode == HandleMode::Inside) handleRadius = radius - half;
  return {size, handleRadius, !(half > handleRadius)};
}

bool RotationControl::hoverTest(WispHost* host, tagWispAPI* api, genVec2 centre, float radius,
                                genVec2 pointer, genVec2 viewScale, float uiScale, float button,
                                int time) {
  const float angle = getter(host, api, time);
  const genVec2 d = subtract(pointer, centre);
  const bool keepPressedHover =
      pressed && button <= 0.5f && api->GetHostId(host) == kHostProductTouch;

  const HandleGeometry geometry = handleGeometry(radius, viewScale, uiScale);
  if (!geometry.fits) {
    if (!keepPressedHover) storeHot(host, api, false);
    return false;
  }

  // u runs along the circle at the handle, v away from the centre through it.
  const float c = std::cos(angle);
  const float s = std::sin(angle);
  const float u = d.x * c - d.y * s;
  const float v = d.x * s + d.y * c;
  const float l = std::sqrt(u * u + v * v);
  const bool on =
      std::fabs(signOf(v) * l - geometry.handleRadius) <= geometry.size * kRadialReach &&
      std::fabs(u / std::fabs(v) * l) <= geometry.size * kTangentialReach;

  const CursorShape cursor =
      on ? rotateCursorForOctant(octantOfRadians(angle)) : CursorShape::Default;
  api->SetCursor(host, static_cast<int32_t>(cursor));

  if (keepPressedHover) return on;
  grabValue = angle;
  grabPointerAngle = pointerAngle(d);
  storeHot(host, api, on);
  return on;
}

bool RotationControl::dragStep(WispHost* host, tagWispAPI* api, genVec2 centre, genVec2 pointer,
                               int time) {
  const float p = pointerAngle(subtract(pointer, centre));
  // Shortest turn from the anchor, in [-pi, pi).
  const float f = positiveFraction((p - grabPointerAngle) / kTwoPi + 0.5f);
  const float delta = (f - 0.5f) * kTwoPi;
  const float value = grabValue + delta;
  setter(host, api, value, time);
  if (std::fabs(delta) > kHalfPi) {
    grabValue = value;
    grabPointerAngle = p;
  }
  hot = 1;
  return true;
}

void RotationControl::storeHot(WispHost* host, tagWispAPI* api, bool nowHot) {
  const uint8_t value = nowHot ? 1 : 0;
  if (value == hot) return;
  hot = value;
  api->Redraw(host, 0);
}

}  // namespace veltrane
