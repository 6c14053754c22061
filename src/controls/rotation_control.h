// An angle handle: a short arc on a circle round a centre, turned by dragging it round. Used for
// the cut directions and the selected input's rotation.
#pragma once

#include <cstdint>

#include "controls/accessors.h"
#include "controls/control_constants.h"

namespace veltrane {

class RotationControl {
 public:
  // Size of the handle and the radius its centre sits on; `fits` is false when the handle
  // would reach past the centre, and such a handle is neither drawn nor hit.
  struct HandleGeometry {
    float size;
    float handleRadius;
    bool fits;
  };

  RotationControl(AngleSetter setter, AngleGetter getter, int32_t showSweep, HandleMode handleMode,
                  float sizeFactor);

  // While this control owns a drag and the button is held, one drag step; otherwise a hover
  // test that updates hot, the drag anchor and the host cursor. True when the pointer is on
  // the handle (always during a drag).
  bool test(WispHost* host, tagWispAPI* api, genVec2 centre, float radius, genVec2 pointer,
            genVec2 viewScale, float uiScale, float button, int time);

  HandleGeometry handleGeometry(float radius, genVec2 viewScale, float uiScale) const;

  AngleSetter setter;
  AngleGetter getter;
  uint8_t pressed = 0;            // this control owns the current drag
  uint8_t hot = 0;                // pointer over the handle, or dragging
  float grabPointerAngle = 0.0f;  // pointer angle round the centre at the last anchor
  float grabValue = 0.0f;         // parameter value (radians) at the last anchor
  int32_t showSweep = 0;          // drawing only: show the swept arc
  HandleMode handleMode = HandleMode::Outside;
  float sizeFactor = 0.0f;  // handle size per unit of view scale

 private:
  bool hoverTest(WispHost* host, tagWispAPI* api, genVec2 centre, float radius, genVec2 pointer,
                 genVec2 viewScale, float uiScale, float button, int time);
  bool dragStep(WispHost* host, tagWispAPI* api, genVec2 centre, genVec2 pointer, int time);
  void storeHot(WispHost* host, tagWispAPI* api, bool nowHot);
};

}  // namespace veltrane
