// The per-instance record: the viewer's on-screen controls and the interaction state kept
// between messages. Parameter values are never cached here; they live in the host.
#pragma once

#include <array>
#include <cstdint>

#include "common/glsl_types.h"
#include "common/param_ids.h"
#include "controls/aa_quad_control.h"
#include "controls/cut_position_control.h"
#include "controls/rotation_control.h"
#include "host/wisp_api.h"

namespace veltrane {

using plugin_glsl_types::genVec2;

// Handle sizes per unit of view scale.
constexpr float kCutDirectionHandleSize = 6.0f;
constexpr float kInputRotationHandleSize = 10.0f;

struct EffectInstance {
  EffectInstance();

  // Control i edits cut i or input i. Members are destroyed in reverse order, each array
  // from its last element to its first.
  std::array<SplitScreenCutPositionControl, kMaxCuts> cutPositionControls;
  std::array<RotationControl, kMaxCuts> cutDirectionControls;  // on the handle circle
  uint8_t regionHover = 0;     // pointer over a region: the move-input marker is shown
  uint8_t movingInput = 0;     // a region drag is in progress
  uint8_t insertingCut = 0;    // a cut insertion drag is in progress
  int32_t activeIndex = 0;     // input of the hovered or moved region; the new cut while inserting
  genVec2 pointerPosition;     // last pointer position seen (corner space)
  genVec2 moveGrabOffset;      // pointer minus the input's translation at the start of a move
  uint8_t shiftDown = 0;       // left Shift held
  int32_t selectedInput = -1;  // -1: none
  std::array<RotationControl, kInputCount> inputRotationControls;  // outside the circle
  std::array<AAQuadControl, kInputCount> inputQuadControls;        // edges and corners only
};

// Creates the record in the host's instance slot: zero-filled storage, then the constructor.
// If construction throws, the storage is freed and the slot is left as it was.
void createInstance(tagWispAPI* api);
// Destroys the record in the instance slot, if any, and clears the slot.
void destroyInstance(tagWispAPI* api);
// Copies the state of another record of this effect into this instance member by member,
// accessors included; the host's pointer to this record stays the same. A null source
// changes nothing.
void copyInstance(tagWispAPI* api, const EffectInstance* source);

inline EffectInstance* instanceOf(tagWispAPI* api) {
  return api ? static_cast<EffectInstance*>(api->instanceData) : nullptr;
}

}  // namespace veltrane
