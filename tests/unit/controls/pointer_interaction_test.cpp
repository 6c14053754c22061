// Viewer gestures through the real pointer and key handlers on the in-memory host: what each
// writes, which undo step it makes, and what the instance remembers afterwards.
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <string>
#include <vector>

#include "viewer_fixture.h"

namespace controls_test {
namespace {

using PointerInteraction = ViewerFixture;

// The 1920 x 1080 frame split by one vertical Local cut through its centre: region 1 (input 1)
// on the left, region 0 on the right.
void splitDown(ViewerFixture& viewer) {
  viewer.setCutCount(1);
  viewer.setCut(0, 0.0f, 0.0f, 0.0f);
}

TEST_F(PointerInteraction, DraggingACutLineMovesItParallelToItself) {
  splitDown(*this);
  host_.recordCalls(true);
  EXPECT_EQ(press(960, 300), 1);
  EXPECT_EQ(host_.pointValue("cutPosition_0"), (std::array<float, 2>{0.0f, -240.0f}))
      << "the position jumps onto the clicked point of the line";
  EXPECT_EQ(move(1060, 350, 1.0), 1);
  EXPECT_EQ(host_.pointValue("cutPosition_0"), (std::array<float, 2>{100.0f, -190.0f}));
  EXPECT_EQ(release(1060, 350), 1);
  EXPECT_TRUE(callsOf("SetAngleParam").empty()) << "the direction is left alone";
  EXPECT_EQ(instance().cutPositionControls[0].pressed, 0);
}

TEST_F(PointerInteraction, ShiftPressInsertsACutUntilThereAreEight) {
  // Seven vertical cuts, the rightmost at x = 450; the pointer stays well clear of them.
  setCutCount(7);
  for (int i = 0; i < 7; ++i) setCut(i, -750.0f + 200.0f * static_cast<float>(i), 0.0f, 0.0f);
  veltrane::onKeyDown(host(), api(), veltrane::kKeyLeftShift);
  host_.recordCalls(true);

  EXPECT_EQ(move(1810, 100, 0.0), 0);
  EXPECT_EQ(callsOf("SetCursor").back(), "SetCursor(19)");

  EXPECT_EQ(press(1810, 100), 1);
  EXPECT_EQ(host_.intValue(param::kNumberOfCuts), 8);
  EXPECT_EQ(host_.pointValue("cutPosition_7"), (std::array<float, 2>{850.0f, -440.0f}));
  EXPECT_EQ(instance().activeIndex, 7);
  // The new line turns toward the pointer: straight down +y, then along +x.
  EXPECT_EQ(move(1810, 300, 1.0), 1);
  EXPECT_NEAR(host_.floatValue("cutDirection_7"), 0.0f, 1e-4f);
  EXPECT_EQ(release(1910, 100), 1);
  EXPECT_NEAR(host_.floatValue("cutDirection_7"), 90.0f, 1e-4f);
  EXPECT_EQ(instance().insertingCut, 0);

  // Eight cuts: Shift changes nothing; the press grabs the region under the pointer, the part
  // of the rightmost strip above the new horizontal cut.
  host_.clearCalls();
  EXPECT_EQ(move(1810, 800, 0.0), 1);
  EXPECT_EQ(callsOf("SetCursor").back(), "SetCursor(3)");
  EXPECT_EQ(press(1810, 800), 1);
  EXPECT_EQ(host_.intValue(param::kNumberOfCuts), 8);
  EXPECT_TRUE(callsOf("SetIntParam").empty());
  EXPECT_EQ(callsOf("BeginUndo"),
            std::vector<std::string>{"BeginUndo(Moved Split Screen Input 8)"});
}

TEST_F(PointerInteraction, PressingARegionSelectsAndMovesItsInput) {
  splitDown(*this);
  EXPECT_EQ(press(1400, 540), 1);
  EXPECT_EQ(instance().selectedInput, 0);
  EXPECT_EQ(move(1450, 560, 1.0), 1);
  EXPECT_EQ(host_.pointValue("inputFrameTranslation0"), (std::array<float, 2>{50.0f, 20.0f}));
  EXPECT_EQ(release(1450, 560), 1);
  EXPECT_EQ(instance().movingInput, 0);
  EXPECT_EQ(instance().selectedInput, 0) << "the selection outlives the drag";

  EXPECT_EQ(press(400, 540), 1);
  EXPECT_EQ(release(400, 540), 1);
  EXPECT_EQ(instance().selectedInput, 1);
  EXPECT_EQ(veltrane::pointerOverSelectedInput(instance()), 1);

  // Escape is claimed on key down and clears the selection on key up.
  EXPECT_EQ(veltrane::onKeyDown(host(), api(), veltrane::kKeyEscape), 1);
  EXPECT_EQ(instance().selectedInput, 1);
  EXPECT_EQ(veltrane::onKeyUp(host(), api(), veltrane::kKeyEscape), 1);
  EXPECT_EQ(instance().selectedInput, -1);
  EXPECT_EQ(veltrane::pointerOverSelectedInput(instance()), 0);
  EXPECT_EQ(veltrane::onKeyUp(host(), api(), veltrane::kKeyEscape), 0);
}

TEST_F(PointerInteraction, EveryGestureIsOneNamedUndoStep) {
  struct Gesture {
    const char* undoName;
    std::function<void(PointerInteraction&)> prepare;
    int pressX, pressY, moveX, moveY;
  };
  const auto selectInputZero = [](PointerInteraction& viewer) {
    splitDown(viewer);
    viewer.press(1400, 540);
    viewer.release(1400, 540);
  };
  const Gesture gestures[] = {
      {"Split Screen Cut 1 Position", splitDown, 960, 300, 1000, 300},
      // Zoomed out, the direction handle sits 20 frame pixels off the line, out of its reach.
      {"Split Screen Cut 1 Direction",
       [](PointerInteraction& viewer) {
         splitDown(viewer);
         viewer.context_.viewScaleX = viewer.context_.viewScaleY = 2.0;
       },
       980, 540, 975, 530},
      {"Split Screen Cut 1 Direction",
       [](PointerInteraction& viewer) {
         splitDown(viewer);
         viewer.host_.setChoice(param::kCutType, veltrane::kCutTypeRadial);
       },
       960, 740, 1100, 700},
      {"Split Screen Input 0 Rotation", selectInputZero, 960, 1090, 1200, 1000},
      {"Split Screen Input 0 Scale", selectInputZero, 1920, 300, 2020, 300},
      {"Moved Split Screen Input 0", splitDown, 1400, 540, 1500, 500},
      {"Moved Split Screen Input 1", splitDown, 400, 540, 500, 500},
      {"Inserting Cut",
       [](PointerInteraction& viewer) {
         splitDown(viewer);
         veltrane::onKeyDown(viewer.host(), viewer.api(), veltrane::kKeyLeftShift);
       },
       1400, 540, 1500, 500},
  };
  for (const Gesture& gesture : gestures) {
    restart();
    gesture.prepare(*this);
    host_.recordCalls(true);
    host_.clearCalls();
    EXPECT_EQ(press(gesture.pressX, gesture.pressY), 1) << gesture.undoName;
    EXPECT_EQ(move(gesture.moveX, gesture.moveY, 1.0), 1) << gesture.undoName;
    EXPECT_EQ(move(gesture.moveX + 3, gesture.moveY + 3, 1.0), 1) << gesture.undoName;
    EXPECT_EQ(release(gesture.moveX, gesture.moveY), 1) << gesture.undoName;
    std::vector<std::string> undoCalls;
    for (const std::string& call : host_.calls()) {
      if (call.rfind("BeginUndo(", 0) == 0 || call.rfind("EndUndo(", 0) == 0)
        undoCalls.push_back(call);
    }
    EXPECT_EQ(undoCalls, (std::vector<std::string>{
                             std::string("BeginUndo(") + gesture.undoName + ")", "EndUndo()"}));
  }
}

TEST_F(PointerInteraction, PressedDirectionHandleKeepsTheDragOverAnotherHandle) {
  // Radial cuts at 0 and 90 degrees round the frame centre.
  host_.setChoice(param::kCutType, veltrane::kCutTypeRadial);
  setCutCount(2);
  setCut(0, 0.0f, 0.0f, 0.0f);
  setCut(1, 0.0f, 0.0f, 90.0f);
  ASSERT_EQ(press(960, 740), 1);
  host_.recordCalls(true);
  EXPECT_EQ(move(1160, 540, 1.0), 1);  // onto cut 1's handle
  EXPECT_NEAR(host_.floatValue("cutDirection_0"), 90.0f, 1e-3f);
  EXPECT_EQ(host_.floatValue("cutDirection_1"), 90.0f);
  for (const std::string& call : callsOf("SetAngleParam"))
    EXPECT_EQ(call.find("cutDirection_1"), std::string::npos) << call;
}

TEST_F(PointerInteraction, ReleaseWithoutPressOnlyReportsTheRegion) {
  splitDown(*this);
  host_.recordCalls(true);
  EXPECT_EQ(release(1400, 540), 1);
  EXPECT_EQ(instance().regionHover, 1);
  EXPECT_EQ(instance().activeIndex, 0);
  EXPECT_EQ(release(-50, -50), 0) << "outside every region";
  EXPECT_EQ(instance().regionHover, 0);
  veltrane::onKeyDown(host(), api(), veltrane::kKeyLeftShift);
  EXPECT_EQ(release(1400, 540), 0) << "Shift with room for a cut: no region";
  EXPECT_TRUE(callsOf("EndUndo").empty());
  EXPECT_TRUE(callsOf("BeginUndo").empty());
}

TEST_F(PointerInteraction, StickyHoverHostDropsTheSelectionAfterEveryRelease) {
  splitDown(*this);
  host_.setHostId(3000);
  press(1400, 540);
  EXPECT_EQ(instance().selectedInput, 0);
  release(1400, 540);
  EXPECT_EQ(instance().selectedInput, -1);
}

TEST_F(PointerInteraction, MissingInstanceContextOrEventIsIgnored) {
  splitDown(*this);
  const std::function<void(tagWispAPI&)> breakages[] = {
      [](tagWispAPI& api) { api.instanceData = nullptr; },
      [](tagWispAPI& api) { api.renderContext = nullptr; },
      [](tagWispAPI& api) { api.event = nullptr; },
  };
  for (const auto& breakage : breakages) {
    tagWispAPI broken = *api();
    breakage(broken);
    EXPECT_EQ(veltrane::onPointerMove(host(), &broken, false), 0);
    EXPECT_EQ(veltrane::onPointerPress(host(), &broken), 0);
    EXPECT_EQ(veltrane::onPointerRelease(host(), &broken), 0);
  }
}

}  // namespace
}  // namespace controls_test
