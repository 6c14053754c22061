// Where the handles of one viewer message sit: the viewer's measures, the cut layout, and the
// circles of the direction and input rotation handles. Pointer handling and overlay drawing
// place the handles from the same functions so that what is drawn is what is hit.
#pragma once

#include "common/param_ids.h"
#include "controls/accessors.h"

namespace veltrane {

// The viewer context's measures as the controls use them.
struct ViewerMeasures {
  genVec2 frameSize;  // frame width and height in pixels
  genVec2 viewScale;  // frame pixels per viewer pixel, x and y
  float uiScale = 1.0f;
  int time = 0;
};
ViewerMeasures viewerMeasuresOf(const WispViewerContext& context);

// "numberOfCuts" at the viewer's time, held to [0, 8], and whether the cuts are Radial
// ("cutType" at time 0, as the partition reads it).
struct CutLayout {
  int cutCount = 0;
  bool radial = false;
};
CutLayout readCutLayout(WispHost* host, const tagWispAPI* api, int time);

// A handle circle in corner space.
struct HandleCircle {
  genVec2 centre;
  float radius = 0.0f;
};

// Cut `cutIndex`'s direction handle. A Local cut turns about its own position on a circle of
// constant on-screen size; Radial cuts turn about the shared centre on the circle through the
// pointer, so the whole ray can be grabbed.
HandleCircle cutDirectionHandle(WispHost* host, const tagWispAPI* api, const ViewerMeasures& view,
                                bool radial, int cutIndex, genVec2 pointer);

// The selected input's rotation handle circle and its rotation (radians).
struct InputHandle {
  HandleCircle circle;
  float rotation = 0.0f;
};
InputHandle selectedInputHandle(WispHost* host, const tagWispAPI* api, const ViewerMeasures& view,
                                int inputIndex);

// The selected input's handles are live only for an input the layout can show.
inline bool inputHandlesLive(int selectedInput, int cutCount) {
  return selectedInput >= 0 && selectedInput <= cutCount && selectedInput < kInputCount;
}

// Global centre of Radial cuts in corner space.
genVec2 radialCentre(WispHost* host, const tagWispAPI* api, const ViewerMeasures& view);

// Handle angle that points a cut from `centre` toward the pointer, for the direction setter:
// a Local handle sits a quarter turn off its line, a Radial one on it.
float insertedCutHandleAngle(genVec2 centre, genVec2 pointer, bool radial);

}  // namespace veltrane
