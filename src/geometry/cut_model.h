// Cuts read from the effect's parameters at one time: clamped positions, unit directions and the
// ordered, de-duplicated list that the region partition and the cut border are built from.
#pragma once

#include <cstdint>
#include <vector>

#include "common/glsl_types.h"
#include "host/wisp_api.h"

namespace veltrane {

// One straight cut. Positions are in frame space (origin at the frame centre); an angle a
// denotes the direction (sin a, cos a), so 0 points along +y and pi/2 along +x.
struct Cut {
  float positionX = 0.0f;   // clamped one pixel inside the frame, times the pixel aspect
  float positionY = 0.0f;   // clamped one pixel inside the frame
  float directionX = 0.0f;  // unit direction, x stretched by the pixel aspect before normalising
  float directionY = 1.0f;
  float angle = 0.0f;     // radians in [-pi, pi]
  uint8_t radial = 0;     // 1: a ray from the shared centre; 0: a full line through the position
  int32_t cutNumber = 0;  // parameter index + 1; also the id of the region the cut creates
};

// Cuts in ascending cut number, at most one per parameter index, none repeated.
using CutList = std::vector<Cut>;

// Reads the cut of parameter index `index` (0 to 7). A Radial cut takes its position from the
// shared centre parameter and its direction from its own. The pixel aspect applies only when
// `pixelAspectPresent` is set.
Cut readCut(WispHost* host, const tagWispAPI* api, int index, int32_t time,
            plugin_glsl_types::genVec2 frameSize, bool pixelAspectPresent, float pixelAspect);

// Reads "numberOfCuts" cuts (none for a count below 1, at most eight) and drops repeats.
CutList readCutList(WispHost* host, const tagWispAPI* api, int32_t time,
                    plugin_glsl_types::genVec2 frameSize, bool pixelAspectPresent,
                    float pixelAspect);

// Drops every cut equal to an earlier one in type, angle and position; of cuts given in ascending
// cut number the one with the lowest number stays. Equality is judged in the order Local before
// Radial, then by angle, then (Radial only) by position, so two Local cuts at one spot stay apart
// when a cut of the same angle sorts between them. Returns the survivors in ascending cut number.
CutList removeRepeatedCuts(CutList cuts);

// The unclamped position parameter of cut `index` in corner space, also in Radial layouts.
plugin_glsl_types::genVec2 cutControlPosition(WispHost* host, const tagWispAPI* api, int32_t time,
                                              int index, plugin_glsl_types::genVec2 frameSize);

// The angle, in radians and not wrapped, at which the direction handle of cut `index` sits: a
// Local cut's handle is a quarter turn from its direction, a Radial cut's on it.
float cutControlAngle(WispHost* host, const tagWispAPI* api, int32_t time, int index);

}  // namespace veltrane
