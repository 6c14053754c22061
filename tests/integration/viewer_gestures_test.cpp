// Viewer gestures through the real module: what every drag writes, the one named undo step it
// makes, the cursor it asks for, and that undo restores every value bit for bit.
#include <cmath>

#include "loaded_plugin.h"
#include "viewer_events.h"

namespace {

using refhost::ParamValue;

class ViewerGestures : public LoadedPlugin {
 protected:
  void SetUp() override {
    LoadedPlugin::SetUp();
    resize(160, 90);
  }
  // A fresh viewer of a frame of this size at view scale 1.
  void resize(int32_t width, int32_t height) {
    viewer_ = std::make_unique<ViewerEvents>(host(), width, height);
  }
  ViewerEvents& viewer() { return *viewer_; }

  std::array<float, 3> number(const std::string& id) { return host().valueAt(id, 0).number; }
  void setCut(int i, float x, float y, float degrees) { ::setCut(host(), i, x, y, degrees); }
  void setRadial(int cuts) {
    host().setValue("cutType", ParamValue::ofInt(1));
    host().setValue("numberOfCuts", ParamValue::ofInt(cuts));
  }
  // An HD frame split by two rays from its centre, at 0 and 90 degrees.
  void twoRaysInHd() {
    resize(1920, 1080);
    setRadial(2);
    setCut(0, 0.0f, 0.0f, 0.0f);
    setCut(1, 0.0f, 0.0f, 90.0f);
  }
  CursorShape lastCursor() { return static_cast<CursorShape>(host().lastCursor()); }

  std::unique_ptr<ViewerEvents> viewer_;
};

TEST_F(ViewerGestures, DraggingACutLineMovesItParallelToItself) {
  setCut(0, 0.0f, 0.0f, 0.0f);  // vertical line through the centre, corner x = 80
  const auto before = host().paramStates();
  ASSERT_EQ(viewer().press(80, 70), 1);
  EXPECT_EQ(number("cutPosition_0")[1], 25.0f) << "the position jumps onto the pressed point";
  viewer().move(95, 65, true);
  viewer().move(110, 60, true);
  EXPECT_EQ(viewer().release(110, 60), 1);
  EXPECT_EQ(number("cutPosition_0")[0], 30.0f);
  EXPECT_EQ(number("cutPosition_0")[1], 15.0f);
  EXPECT_TRUE(host().callsTo("SetAngleParam").empty()) << "the direction is left alone";
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Split Screen Cut 1 Position"}));
  ASSERT_TRUE(host().undo());
  EXPECT_EQ(host().paramStates(), before);
}

TEST_F(ViewerGestures, DirectionHandleTurnsContinuouslyThroughTwoFullTurns) {
  // At view scale 2 the handle circle (20 frame px) lies beyond the line's own reach.
  viewer().context().viewScaleX = viewer().context().viewScaleY = 2.0;
  setCut(0, 0.0f, 0.0f, 0.0f);
  const float cx = 80.0f, cy = 45.0f, radius = 20.0f;
  // The handle of a Local cut sits a quarter turn off its line: at (sin 90deg, cos 90deg).
  ASSERT_EQ(viewer().press(cx + radius, cy), 1);
  for (int step = 1; step <= 48; ++step) {
    const float theta = (90.0f + 15.0f * static_cast<float>(step)) * 3.1415927f / 180.0f;
    viewer().move(cx + 40.0f * std::sin(theta), cy + 40.0f * std::cos(theta), true);
  }
  EXPECT_EQ(viewer().release(cx + radius, cy), 1);
  EXPECT_NEAR(number("cutDirection_0")[0], 720.0f, 0.5f);
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Split Screen Cut 1 Direction"}));
}

TEST_F(ViewerGestures, PressedDirectionHandleKeepsTheDragOverAnotherHandle) {
  twoRaysInHd();
  ASSERT_EQ(viewer().press(960, 740), 1);
  host().clearCallLog();
  EXPECT_EQ(viewer().move(1160, 540, true), 1);  // onto cut 2's handle
  EXPECT_NEAR(number("cutDirection_0")[0], 90.0f, 1e-3f);
  EXPECT_EQ(number("cutDirection_1")[0], 90.0f);
  for (const std::string& call : host().callsTo("SetAngleParam"))
    EXPECT_EQ(call.find("cutDirection_1"), std::string::npos) << call;
  viewer().release(1160, 540);
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Split Screen Cut 1 Direction"}));
}

TEST_F(ViewerGestures, ShiftPressInsertsACutUpToEight) {
  // Seven vertical cuts, the rightmost at x = 450; the pointer stays well clear of them.
  resize(1920, 1080);
  host().setValue("numberOfCuts", ParamValue::ofInt(7));
  for (int i = 0; i < 7; ++i) setCut(i, -750.0f + 200.0f * static_cast<float>(i), 0.0f, 0.0f);
  EXPECT_EQ(viewer().key(kMessageKeyDown, kKeyLeftShift), 0);
  EXPECT_EQ(viewer().move(1810, 100, false), 0);
  EXPECT_EQ(lastCursor(), CursorShape::InsertCut);

  ASSERT_EQ(viewer().press(1810, 100), 1);
  EXPECT_EQ(host().valueAt("numberOfCuts", 0).integer, 8);
  EXPECT_EQ(number("cutPosition_7")[0], 850.0f);
  EXPECT_EQ(number("cutPosition_7")[1], -440.0f);
  // The new line turns toward the pointer: straight down +y, then along +x.
  viewer().move(1810, 300, true);
  EXPECT_NEAR(number("cutDirection_7")[0], 0.0f, 1e-4f);
  viewer().release(1910, 100);
  EXPECT_NEAR(number("cutDirection_7")[0], 90.0f, 1e-4f);
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Inserting Cut"}));

  // Eight cuts: Shift no longer inserts; the press takes the region under the pointer, the
  // part of the rightmost strip above the new horizontal cut.
  EXPECT_EQ(viewer().move(1810, 800, false), 1);
  EXPECT_EQ(lastCursor(), CursorShape::Move);
  host().clearCallLog();
  ASSERT_EQ(viewer().press(1810, 800), 1);
  viewer().release(1810, 800);
  EXPECT_TRUE(host().callsTo("SetIntParam").empty());
  // The plug-in brackets the press as a move; moving nothing, it leaves the host no step.
  EXPECT_EQ(host().callsTo("BeginUndo").back(), "BeginUndo \"Moved Split Screen Input 8\"");
  EXPECT_EQ(host().undoStepNames().back(), "Inserting Cut");
  EXPECT_EQ(viewer().key(kMessageKeyUp, kKeyLeftShift), 0);
}

TEST_F(ViewerGestures, ShiftPressAimsANewRadialCutAtThePointerAtOnce) {
  twoRaysInHd();
  viewer().key(kMessageKeyDown, kKeyLeftShift);
  ASSERT_EQ(viewer().press(960 - 300, 540 - 300), 1);  // down and left of the centre
  EXPECT_EQ(host().valueAt("numberOfCuts", 0).integer, 3);
  EXPECT_NEAR(number("cutDirection_2")[0], -135.0f, 1e-3f);
  viewer().release(960 - 300, 540 - 300);
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Inserting Cut"}));
}

TEST_F(ViewerGestures, DraggingARegionMovesItsInput) {
  setCut(0, 0.0f, 0.0f, 0.0f);
  EXPECT_EQ(viewer().move(120, 20, false), 1) << "the pointer rests over input 0's region";
  viewer().drag(120, 20, 130, 30);
  EXPECT_EQ(number("inputFrameTranslation0")[0], 10.0f);
  EXPECT_EQ(number("inputFrameTranslation0")[1], 10.0f);
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Moved Split Screen Input 0"}));
  // Radial sectors count from input 1: with cuts up and right, the three quarters from the
  // right round to the top are input 1's.
  setRadial(2);
  setCut(1, 0.0f, 0.0f, 90.0f);
  viewer().drag(40, 20, 45, 25);
  EXPECT_EQ(number("inputFrameTranslation1")[0], 5.0f);
  EXPECT_EQ(host().undoStepNames().back(), "Moved Split Screen Input 1");
}

TEST_F(ViewerGestures, SelectedInputScalesFromTheOppositeCornerAndRotates) {
  setCut(0, -70.0f, 0.0f, 0.0f);  // the line at corner x = 10, out of the way
  host().setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  const auto initial = host().paramStates();
  viewer().press(150, 5);  // select input 0 (a zero-length move)
  viewer().release(150, 5);
  // Rectangle (40, 22.5)-(120, 67.5); drag its (x1, y1) corner out to (140, 77.5).
  viewer().move(120, 67, false);
  viewer().drag(120, 67, 140, 77);
  EXPECT_EQ(viewer().release(-50, -50), 0) << "the drag's release left nothing pressed";
  EXPECT_NEAR(host().valueAt("inputFrameScale0", 0).number[0], 62.5f, 1e-3f);
  EXPECT_NEAR(number("inputFrameTranslation0")[0], 10.0f, 1e-3f);   // x0 stays at 40
  EXPECT_NEAR(number("inputFrameTranslation0")[1], 5.625f, 1e-3f);  // y0 stays at 22.5

  // However far the pointer goes, the scale stays within [1, 1000] percent.
  const struct {
    float x, y, scale;
  } extremes[] = {{-5000, -5000, 1.0f}, {100000, 100000, 1000.0f}};
  for (const auto& extreme : extremes) {
    viewer().move(140, 77, false);
    viewer().drag(140, 77, extreme.x, extreme.y, 2);
    EXPECT_EQ(host().valueAt("inputFrameScale0", 0).number[0], extreme.scale);
    ASSERT_TRUE(host().undo());
  }

  // The rotation handle sits above the picture's centre, half a handle beyond its circle; the
  // press finds it without a hover before it.
  host().setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  host().setValue("inputFrameTranslation0", ParamValue::ofPoint(0.0f, 0.0f));
  ASSERT_EQ(viewer().press(80, 77), 1);
  for (int step = 1; step <= 6; ++step) {
    const float theta = 15.0f * static_cast<float>(step) * 3.1415927f / 180.0f;
    viewer().move(80.0f + 32.0f * std::sin(theta), 45.0f + 32.0f * std::cos(theta), true);
  }
  viewer().release(112, 45);
  EXPECT_NEAR(host().valueAt("inputFrameRotation0", 0).number[0], 90.0f, 1.0f);

  // The selecting click was bracketed as a move but moved nothing, so it is no step.
  const std::vector<std::string> steps = host().undoStepNames();
  ASSERT_EQ(steps.size(), 2u);
  EXPECT_EQ(steps[0], "Split Screen Input 0 Scale");
  EXPECT_EQ(steps[1], "Split Screen Input 0 Rotation");
  while (host().undo()) {
  }
  // The host-side edits between gestures were not undo steps; put them back to compare.
  host().setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  host().setValue("inputFrameTranslation0", ParamValue::ofPoint(0.0f, 0.0f));
  EXPECT_EQ(host().paramStates(), initial);
}

TEST_F(ViewerGestures, EscapeDeselectsAndTheQueryFollowsTheSelection) {
  setCut(0, 0.0f, 0.0f, 0.0f);
  // Nothing selected: the key is not taken.
  EXPECT_EQ(viewer().key(kMessageKeyDown, kKeyEscape), 0);
  viewer().press(120, 20);
  viewer().release(120, 20);
  // The pointer is over the selected input's region.
  EXPECT_EQ(host().send(kMessagePointerOverSelection), 1);
  EXPECT_EQ(viewer().key(kMessageKeyDown, kKeyEscape), 1);
  EXPECT_EQ(host().send(kMessagePointerOverSelection), 1);  // key down changes nothing
  EXPECT_EQ(viewer().key(kMessageKeyUp, kKeyEscape), 1);
  EXPECT_EQ(host().send(kMessagePointerOverSelection), 0);
  EXPECT_EQ(viewer().key(kMessageKeyUp, kKeyEscape), 0);
  viewer().drag(120, 20, 200, 20);  // released outside the frame: over no input
  EXPECT_EQ(host().send(kMessagePointerOverSelection), 0);

  // A host that keeps a pressed control's hover drops the selection after every release.
  host().setHostId(kHostProductTouch);
  viewer().press(120, 20);
  viewer().release(120, 20);
  EXPECT_EQ(host().send(kMessagePointerOverSelection), 0);
}

TEST_F(ViewerGestures, ReleaseWithoutPressClosesNoStep) {
  setCut(0, 0.0f, 0.0f, 0.0f);
  EXPECT_EQ(viewer().release(120, 20), 1);   // over a region
  EXPECT_EQ(viewer().release(-50, -50), 0);  // outside the frame
  viewer().key(kMessageKeyDown, kKeyLeftShift);
  EXPECT_EQ(viewer().release(120, 20), 0) << "Shift with room for a cut: no region";
  EXPECT_TRUE(host().callsTo("EndUndo").empty());
  EXPECT_TRUE(host().undoStepNames().empty());
}

// Copy instance copies another instance's interaction state into this one.
TEST_F(ViewerGestures, CopyTakesTheOtherInstancesSelectionAndKeys) {
  host().setValue("numberOfCuts", ParamValue::ofInt(3));
  setCut(0, -40.0f, 0.0f, 0.0f);
  setCut(1, 0.0f, 0.0f, 0.0f);
  setCut(2, 40.0f, 0.0f, 0.0f);
  viewer().press(140, 10);  // right of every cut: input 3's region
  viewer().release(140, 10);
  viewer().key(kMessageKeyDown, kKeyLeftShift);
  void* const source = host().api().instanceData;

  host().api().instanceData = nullptr;
  ASSERT_EQ(host().send(kMessageCreateInstance), 1);
  void* const copy = host().api().instanceData;
  EXPECT_EQ(viewer().key(kMessageKeyDown, kKeyEscape), 0);  // a fresh record has no selection
  host().setRenderContext(source);
  EXPECT_EQ(host().send(kMessageCopyInstance), 0);
  host().setRenderContext(nullptr);
  EXPECT_EQ(host().api().instanceData, copy);
  EXPECT_EQ(viewer().key(kMessageKeyDown, kKeyEscape), 1);  // input 3 is selected here now
  host().clearViewerRecords();
  viewer().move(150, 80, false);  // Shift is down here too: the insert cursor
  EXPECT_EQ(lastCursor(), CursorShape::InsertCut);

  EXPECT_EQ(host().send(kMessageDestroyInstance), 1);
  host().api().instanceData = source;
}

}  // namespace
