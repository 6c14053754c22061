// Pointer messages of the viewer. Every message rebuilds the cuts, regions and visible cut
// segments from the parameters, exactly as the render does, and offers the pointer to the
// controls in a fixed order: cut positions, cut directions, the selected input's rotation and
// rectangle, then the regions. A press that something takes opens one undo step, which the
// release that ends the drag closes.
#include "controls/pointer_handling.h"

#include <algorithm>
#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "common/param_ids.h"
#include "controls/control_constants.h"
#include "controls/handle_geometry.h"
#include "controls/handle_math.h"
#include "controls/instance_record.h"
#include "controls/undo_names.h"
#include "geometry/cut_model.h"
#include "geometry/cut_segments.h"
#include "geometry/region_partition.h"

namespace veltrane {

using namespace handle_math;

namespace {

constexpr float kButtonDown = 1.0f;
constexpr float kButtonUp = 0.0f;

// Everything one pointer message works from.
struct PointerScene {
  WispHost* host;
  tagWispAPI* api;
  EffectInstance& instance;
  ViewerMeasures view;
  genVec2 pointer;  // corner space
  float button;     // above 0.5: held
  CutLayout layout;
  RegionList regions;
  std::vector<CutSegment> segments;  // frame space, one per cut of the cut list
};

std::optional<PointerScene> readScene(WispHost* host, tagWispAPI* api) {
  EffectInstance* instance = instanceOf(api);
  if (!instance || !api->renderContext || !api->event) return std::nullopt;
  const auto& context = *static_cast<const WispViewerContext*>(api->renderContext);
  const auto& event = *static_cast<const WispPointerEvent*>(api->event);

  PointerScene scene{host, api, *instance, viewerMeasuresOf(context), {}, 0.0f, {}, {}, {}};
  scene.pointer = {static_cast<float>(event.x), static_cast<float>(event.y)};
  scene.button = narrowToFloat(event.button);
  const CutList cuts = readCutList(host, api, scene.view.time, scene.view.frameSize, false, 1.0f);
  scene.layout = readCutLayout(host, api, scene.view.time);
  if (!cuts.empty()) {
    scene.regions = partitionFrame(cuts, scene.view.frameSize, scene.layout.radial ? 1 : 0);
    scene.segments = clipCutSegments(cuts, scene.view.frameSize);
  }
  return scene;
}

genVec2 halfFrame(const PointerScene& scene) {
  return {scene.view.frameSize.x / 2.0f, scene.view.frameSize.y / 2.0f};
}

// Cut position controls pair with the segments by list position.
int segmentCount(const PointerScene& scene) {
  return static_cast<int>(std::min<std::size_t>(scene.segments.size(), kMaxCuts));
}

genVec2 cornerPoint(const PointerScene& scene, const plugin_glsl_types::genVec4& framePoint) {
  return add({framePoint.x, framePoint.y}, halfFrame(scene));
}

bool testCutPosition(PointerScene& scene, int i, float button) {
  const CutSegment& segment = scene.segments[static_cast<std::size_t>(i)];
  return scene.instance.cutPositionControls[static_cast<std::size_t>(i)].test(
      scene.host, scene.api, scene.view.frameSize, cornerPoint(scene, segment.start),
      cornerPoint(scene, segment.end), scene.pointer, scene.view.viewScale, button,
      scene.view.time);
}

bool testCutDirection(PointerScene& scene, int i, float button) {
  const HandleCircle circle =
      cutDirectionHandle(scene.host, scene.api, scene.view, scene.layout.radial, i, scene.pointer);
  return scene.instance.cutDirectionControls[static_cast<std::size_t>(i)].test(
      scene.host, scene.api, circle.centre, circle.radius, scene.pointer, scene.view.viewScale,
      scene.view.uiScale, button, scene.view.time);
}

bool testInputRotation(PointerScene& scene, int s, const InputHandle& handle, float button) {
  return scene.instance.inputRotationControls[static_cast<std::size_t>(s)].test(
      scene.host, scene.api, handle.circle.centre, handle.circle.radius, scene.pointer,
      scene.view.viewScale, scene.view.uiScale, button, scene.view.time);
}

bool testInputRect(PointerScene& scene, int s, const InputHandle& handle, float button) {
  return scene.instance.inputQuadControls[static_cast<std::size_t>(s)].test(
      scene.host, scene.api, scene.view.frameSize, scene.pointer, scene.view.viewScale, button,
      scene.view.time, handle.rotation);
}

bool shiftInserts(const PointerScene& scene) {
  return scene.instance.shiftDown && scene.layout.cutCount < kMaxCuts;
}

bool stickyHoverHost(const PointerScene& scene) {
  return scene.api->GetHostId(scene.host) == kHostProductTouch;
}

void setCursor(const PointerScene& scene, CursorShape cursor) {
  scene.api->SetCursor(scene.host, static_cast<int32_t>(cursor));
}

// The input shown under the pointer, or -1 outside every region.
int32_t regionUnderPointer(const PointerScene& scene) {
  return findRegionAt(scene.regions, subtract(scene.pointer, halfFrame(scene)));
}

// Points the cut being inserted at the pointer.
void aimInsertedCut(PointerScene& scene) {
  const int cut = scene.instance.activeIndex;
  if (cut < 0 || cut >= kMaxCuts) return;
  const genVec2 centre =
      scene.layout.radial
          ? radialCentre(scene.host, scene.api, scene.view)
          : cutControlPosition(scene.host, scene.api, scene.view.time, cut, scene.view.frameSize);
  const float angle = insertedCutHandleAngle(centre, scene.pointer, scene.layout.radial);
  scene.instance.cutDirectionControls[static_cast<std::size_t>(cut)].setter(scene.host, scene.api,
                                                                            angle, scene.view.time);
}

void moveActiveInput(PointerScene& scene) {
  const EffectInstance& instance = scene.instance;
  const genVec2 translation =
      subtract(subtract(scene.pointer, halfFrame(scene)), instance.moveGrabOffset);
  const std::string id = inputParamId(param::kInputFrameTranslationPrefix, instance.activeIndex);
  scene.api->SetPointParam(scene.host, id.c_str(), scene.view.time, &translation.x, &translation.y,
                           0);
}

void insertCut(PointerScene& scene) {
  EffectInstance& instance = scene.instance;
  const int cut = scene.layout.cutCount;
  instance.insertingCut = 1;
  instance.activeIndex = cut;
  instance.selectedInput = -1;
  scene.api->BeginUndo(scene.host, kInsertCutUndoName);
  scene.api->SetIntParam(scene.host, param::kNumberOfCuts, scene.view.time, cut + 1, 0);
  if (scene.layout.radial) {
    aimInsertedCut(scene);
  } else {
    // The new line goes through the pointer; its direction waits for the first move.
    instance.cutPositionControls[static_cast<std::size_t>(cut)].setter(
        scene.host, scene.api, scene.pointer, scene.view.time, scene.view.frameSize, cut);
  }
}

void startMovingInput(PointerScene& scene, int32_t input) {
  EffectInstance& instance = scene.instance;
  instance.regionHover = 1;
  instance.activeIndex = input;
  instance.pointerPosition = scene.pointer;
  instance.movingInput = 1;
  instance.selectedInput = input;
  genVec2 translation;
  const std::string id = inputParamId(param::kInputFrameTranslationPrefix, input);
  scene.api->GetPointParam(scene.host, id.c_str(), scene.view.time, &translation.x, &translation.y);
  instance.moveGrabOffset = subtract(subtract(scene.pointer, halfFrame(scene)), translation);
  scene.api->BeginUndo(scene.host, inputMoveUndoName(input).c_str());
}

// Releases the first pressed control of `controls` below `limit`: one more hover test with the
// button up, and the drag's undo step is closed. `test` re-runs the control's hover test.
template <typename Controls, typename Test>
bool releasePressed(PointerScene& scene, Controls& controls, int limit, Test test) {
  for (int i = 0; i < limit; ++i) {
    auto& control = controls[static_cast<std::size_t>(i)];
    if (!control.pressed) continue;
    control.pressed = 0;
    test(i);
    scene.api->EndUndo(scene.host);
    return true;
  }
  return false;
}

}  // namespace

int onPointerMove(WispHost* host, tagWispAPI* api, bool pressedPass) {
  std::optional<PointerScene> read = readScene(host, api);
  if (!read) return 0;
  PointerScene& scene = *read;
  EffectInstance& instance = scene.instance;
  const uint8_t pass = pressedPass ? 1 : 0;

  instance.pointerPosition = scene.pointer;
  if (instance.insertingCut) {
    aimInsertedCut(scene);
    return 1;
  }
  if (instance.movingInput) {
    moveActiveInput(scene);
    return 1;
  }
  instance.regionHover = 0;

  if (!scene.layout.radial) {
    for (int i = 0; i < segmentCount(scene); ++i) {
      if (instance.cutPositionControls[static_cast<std::size_t>(i)].pressed == pass &&
          testCutPosition(scene, i, scene.button))
        return 1;
    }
  }
  for (int i = 0; i < scene.layout.cutCount; ++i) {
    if (instance.cutDirectionControls[static_cast<std::size_t>(i)].pressed == pass &&
        testCutDirection(scene, i, scene.button))
      return 1;
  }
  const int s = instance.selectedInput;
  if (inputHandlesLive(s, scene.layout.cutCount)) {
    const InputHandle handle = selectedInputHandle(host, api, scene.view, s);
    if (instance.inputRotationControls[static_cast<std::size_t>(s)].pressed == pass &&
        testInputRotation(scene, s, handle, scene.button))
      return 1;
    if (instance.inputQuadControls[static_cast<std::size_t>(s)].pressed == pass &&
        testInputRect(scene, s, handle, scene.button))
      return 1;
  }
  if (shiftInserts(scene)) {
    setCursor(scene, CursorShape::InsertCut);
    return 0;
  }
  if (instance.movingInput == pass) {
    const int32_t input = regionUnderPointer(scene);
    if (input >= 0) {
      instance.regionHover = 1;
      setCursor(scene, CursorShape::Move);
      instance.activeIndex = input;
      return 1;
    }
  }
  return 0;
}

int onPointerPress(WispHost* host, tagWispAPI* api) {
  std::optional<PointerScene> read = readScene(host, api);
  if (!read) return 0;
  PointerScene& scene = *read;
  EffectInstance& instance = scene.instance;
  instance.regionHover = 0;

  if (!scene.layout.radial) {
    for (int i = 0; i < segmentCount(scene) && i < scene.layout.cutCount; ++i) {
      const CutSegment& segment = scene.segments[static_cast<std::size_t>(i)];
      if (instance.cutPositionControls[static_cast<std::size_t>(i)].press(
              host, api, scene.view.frameSize, cornerPoint(scene, segment.start),
              cornerPoint(scene, segment.end), scene.pointer, scene.view.viewScale, kButtonDown,
              scene.view.time)) {
        instance.selectedInput = -1;
        return 1;
      }
    }
  }
  for (int i = 0; i < scene.layout.cutCount; ++i) {
    RotationControl& control = instance.cutDirectionControls[static_cast<std::size_t>(i)];
    testCutDirection(scene, i, kButtonDown);
    control.pressed = control.hot;
    if (control.hot) {
      instance.selectedInput = -1;
      api->BeginUndo(host, cutDirectionUndoName(i).c_str());
      return 1;
    }
  }
  const int s = instance.selectedInput;
  if (inputHandlesLive(s, scene.layout.cutCount)) {
    const InputHandle handle = selectedInputHandle(host, api, scene.view, s);
    RotationControl& rotation = instance.inputRotationControls[static_cast<std::size_t>(s)];
    testInputRotation(scene, s, handle, kButtonDown);
    rotation.pressed = rotation.hot;
    if (rotation.hot) {
      api->BeginUndo(host, inputRotationUndoName(s).c_str());
      return 1;
    }
    if (instance.inputQuadControls[static_cast<std::size_t>(s)].press(
            host, api, scene.view.frameSize, scene.pointer, scene.view.viewScale, kButtonDown,
            scene.view.time, handle.rotation)) {
      api->BeginUndo(host, inputScaleUndoName(s).c_str());
      return 1;
    }
  }
  if (shiftInserts(scene)) {
    insertCut(scene);
    return 1;
  }
  const int32_t input = regionUnderPointer(scene);
  if (input >= 0) {
    startMovingInput(scene, input);
    return 1;
  }
  return 0;
}

int onPointerRelease(WispHost* host, tagWispAPI* api) {
  std::optional<PointerScene> read = readScene(host, api);
  if (!read) return 0;
  PointerScene& scene = *read;
  EffectInstance& instance = scene.instance;

  if (instance.insertingCut) {
    aimInsertedCut(scene);
    api->EndUndo(host);
    instance.insertingCut = 0;
    return 1;
  }
  if (instance.movingInput) {
    api->EndUndo(host);
    instance.movingInput = 0;
  }
  instance.regionHover = 0;

  // Every pressed control is looked at, not only those of the current layout, so that a drag
  // always ends and its undo step is always closed, even if the cuts changed under it.
  if (!scene.layout.radial &&
      releasePressed(scene, instance.cutPositionControls, kMaxCuts, [&](int i) {
        if (i < segmentCount(scene)) testCutPosition(scene, i, kButtonUp);
      }))
    return 1;
  if (releasePressed(scene, instance.cutDirectionControls, kMaxCuts,
                     [&](int i) { testCutDirection(scene, i, kButtonUp); }))
    return 1;

  const int s = instance.selectedInput;
  if (s >= 0 && s < kInputCount) {
    RotationControl& rotation = instance.inputRotationControls[static_cast<std::size_t>(s)];
    AAQuadControl& rect = instance.inputQuadControls[static_cast<std::size_t>(s)];
    if (rotation.pressed || rect.pressed) {
      const InputHandle handle = selectedInputHandle(host, api, scene.view, s);
      if (rotation.pressed) {
        rotation.pressed = 0;
        testInputRotation(scene, s, handle, kButtonUp);
      } else {
        rect.pressed = 0;
        testInputRect(scene, s, handle, kButtonUp);
      }
      api->EndUndo(host);
      if (stickyHoverHost(scene)) instance.selectedInput = -1;
      return 1;
    }
  }
  if (stickyHoverHost(scene)) instance.selectedInput = -1;

  if (!shiftInserts(scene)) {
    const int32_t input = regionUnderPointer(scene);
    if (input >= 0) {
      instance.regionHover = 1;
      instance.activeIndex = input;
      instance.pointerPosition = scene.pointer;
      return 1;
    }
  }
  return 0;
}

}  // namespace veltrane
