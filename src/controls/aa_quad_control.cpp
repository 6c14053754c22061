// Hover and drag of the input rectangle. Everything is measured in the rectangle's own axes:
// the pointer is turned back by the input's rotation about the rectangle's centre first.
#include "controls/aa_quad_control.h"

#include <algorithm>
#include <utility>

#include "controls/handle_math.h"

namespace veltrane {

using namespace handle_math;

namespace {

// How near an edge the pointer must be, in scaled pixels.
constexpr float kEdgeReach = 4.0f;

genVec2 centreOf(genVec4 r) { return {(r.x + r.z) / 2.0f, (r.y + r.w) / 2.0f}; }

// Closest point of the segment a-b to p; a zero-length segment answers a.
genVec2 closestOnSegment(genVec2 a, genVec2 b, genVec2 p) {
  const genVec2 ab = subtract(b, a);
  const float lengthSquared = dot(ab, ab);
  float t = lengthSquared > 0.0f ? dot(subtract(p, a), ab) / lengthSquared : 0.0f;
  t = t < 0.0f ? 0.0f : (t > 1.0f ? 1.0f : t);
  return add(a, scaled(ab, t));
}

float distanceSquared(genVec2 a, genVec2 b) {
  const genVec2 d = subtract(a, b);
  return dot(d, d);
}

struct PartChoice {
  ControlPart part;
  genVec2 feature;  // the point that follows the pointer: a corner, or the edge projection
};

PartChoice choosePart(genVec4 r, genVec2 p, float tolerance, bool allowMove) {
  const genVec2 c00{r.x, r.y}, c10{r.z, r.y}, c11{r.z, r.w}, c01{r.x, r.w};
  const genVec2 onY0 = closestOnSegment(c00, c10, p);
  const genVec2 onX1 = closestOnSegment(c10, c11, p);
  const genVec2 onY1 = closestOnSegment(c11, c01, p);
  const genVec2 onX0 = closestOnSegment(c01, c00, p);
  const bool nearY0 = distanceSquared(p, onY0) <= tolerance;
  const bool nearX1 = distanceSquared(p, onX1) <= tolerance;
  const bool nearY1 = distanceSquared(p, onY1) <= tolerance;
  const bool nearX0 = distanceSquared(p, onX0) <= tolerance;

  // Corners win over edges; on a rectangle thinner than the reach the x1 side and then the
  // y1 side are preferred.
  if (nearX1 && nearY0) return {ControlPart::CornerX1Y0, c10};
  if (nearX1 && nearY1) return {ControlPart::CornerX1Y1, c11};
  if (!nearX1 && nearY1 && nearX0) return {ControlPart::CornerX0Y1, c01};
  if (nearX0 && nearY0) return {ControlPart::CornerX0Y0, c00};
  if (!nearX0 && nearY0) return {ControlPart::EdgeY0, onY0};
  if (nearX1) return {ControlPart::EdgeX1, onX1};
  if (nearY1) return {ControlPart::EdgeY1, onY1};
  if (nearX0) return {ControlPart::EdgeX0, onX0};
  const bool inside = p.x > std::min(r.x, r.z) && p.x < std::max(r.x, r.z) &&
                      p.y > std::min(r.y, r.w) && p.y < std::max(r.y, r.w);
  if (allowMove && inside) return {ControlPart::Inside, {}};
  return {ControlPart::None, {}};
}

// Resize cursor along the part's direction on screen. A rectangle stored with exactly one
// axis reversed is mirrored, which swaps its diagonals.
CursorShape cursorFor(ControlPart part, genVec4 r, float rotation) {
  if (part == ControlPart::None) return CursorShape::Default;
  if (part == ControlPart::Inside) return CursorShape::Move;
  const bool flipped = (r.x <= r.z) != (r.y <= r.w);
  float offset = 0.0f;
  switch (part) {
    case ControlPart::EdgeX0:
    case ControlPart::EdgeX1:
      offset = 90.0f;
      break;
    case ControlPart::CornerX0Y0:
    case ControlPart::CornerX1Y1:
      offset = flipped ? 135.0f : 45.0f;
      break;
    case ControlPart::CornerX1Y0:
    case ControlPart::CornerX0Y1:
      offset = flipped ? 45.0f : 135.0f;
      break;
    default:
      break;
  }
  const float degrees = radiansToDegrees(rotation) + offset;
  return resizeCursorForOctant(octantOfDegrees(positiveFraction(degrees / 360.0f) * 360.0f));
}

}  // namespace

AAQuadControl::AAQuadControl(QuadSetter setter, QuadGetter getter, uint8_t allowMove)
    : setter(std::move(setter)), getter(std::move(getter)), allowMove(allowMove) {}

char AAQuadControl::edgeMaskOf(ControlPart part) {
  switch (part) {
    case ControlPart::EdgeX0:
      return kEdgeBitX0;
    case ControlPart::EdgeX1:
      return kEdgeBitX1;
    case ControlPart::EdgeY0:
      return kEdgeBitY0;
    case ControlPart::EdgeY1:
      return kEdgeBitY1;
    case ControlPart::CornerX0Y0:
      return kEdgeBitX0 | kEdgeBitY0;
    case ControlPart::CornerX1Y0:
      return kEdgeBitX1 | kEdgeBitY0;
    case ControlPart::CornerX0Y1:
      return kEdgeBitX0 | kEdgeBitY1;
    case ControlPart::CornerX1Y1:
      return kEdgeBitX1 | kEdgeBitY1;
    case ControlPart::Inside:
      return kEdgeBitX0 | kEdgeBitX1 | kEdgeBitY0 | kEdgeBitY1;
    case ControlPart::None:
      break;
  }
  return 0;
}

bool AAQuadControl::test(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 pointer,
                         genVec2 viewScale, float button, int time, float rotation) {
  if (pressed && button > 0.5f) return dragStep(host, api, frameSize, pointer, time, rotation);
  return hoverTest(host, api, frameSize, pointer, viewScale, button, time, rotation);
}

bool AAQuadControl::press(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 pointer,
                          genVec2 viewScale, float /*button*/, int time, float rotation) {
  hoverTest(host, api, frameSize, pointer, viewScale, 1.0f, time, rotation);
  grabRect = getter(host, api, time, frameSize);
  grabPointer = rotateAbout(pointer, centreOf(grabRect), -rotation);
  pressed = part != ControlPart::None ? 1 : 0;
  return pressed != 0;
}

bool AAQuadControl::hoverTest(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 pointer,
                              genVec2 viewScale, float button, int time, float rotation) {
  const genVec4 rect = getter(host, api, time, frameSize);
  const genVec2 p = rotateAbout(pointer, centreOf(rect), -rotation);
  const float reach = kEdgeReach * std::max(viewScale.x, viewScale.y);
  const PartChoice choice = choosePart(rect, p, reach * reach, allowMove != 0);
  const CursorShape chosenCursor = cursorFor(choice.part, rect, rotation);
  api->SetCursor(host, static_cast<int32_t>(chosenCursor));

  const bool onPart = choice.part != ControlPart::None;
  if (pressed && button <= 0.5f && api->GetHostId(host) == kHostProductTouch) return onPart;
  cursor = chosenCursor;
  grabOffset = subtract(choice.feature, p);
  if (choice.part != part) {
    part = choice.part;
    api->Redraw(host, 0);
  }
  return onPart;
}

bool AAQuadControl::dragStep(WispHost* host, tagWispAPI* api, genVec2 frameSize, genVec2 pointer,
                             int time, float rotation) {
  const char mask = edgeMaskOf(part);
  const genVec2 p = rotateAbout(pointer, centreOf(grabRect), -rotation);
  const genVec2 q = add(p, grabOffset);
  genVec4 moved = grabRect;
  if (part == ControlPart::Inside) {
    moved = {grabRect.x + q.x, grabRect.y + q.y, grabRect.z + q.x, grabRect.w + q.y};
  } else {
    if (mask & kEdgeBitX0) moved.x = q.x;
    if (mask & kEdgeBitY0) moved.y = q.y;
    if (mask & kEdgeBitX1) moved.z = q.x;
    if (mask & kEdgeBitY1) moved.w = q.y;
  }
  setter(host, api, grabRect, moved, mask, time, frameSize);
  api->SetCursor(host, static_cast<int32_t>(cursor));
  return part != ControlPart::None;
}

}  // namespace veltrane
