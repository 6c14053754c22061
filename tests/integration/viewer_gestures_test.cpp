// Viewer gestures through the real module: every drag writes what the handle promises and is
// exactly one named undo step, and undo restores every value bit for bit.
#include <cmath>

#include "loaded_plugin.h"
#include "viewer_events.h"

namespace {

using refhost::ParamValue;

constexpr int kW = 160;
constexpr int kH = 90;
constexpr uint32_t kShift = 65505;
constexpr uint32_t kEscape = 65307;

class ViewerGestures : public LoadedPlugin {
 protected:
  void SetUp() override {
    LoadedPlugin::SetUp();
    viewer_ = std::make_unique<ViewerEvents>(host(), kW, kH);
  }
  ViewerEvents& viewer() { return *viewer_; }

  std::array<float, 3> number(const std::string& id) { return host().valueAt(id, 0).number; }
  void setCut(int i, float x, float y, float degrees) {
    host().setValue("cutPosition_" + std::to_string(i), ParamValue::ofPoint(x, y));
    host().setValue("cutDirection_" + std::to_string(i), ParamValue::ofFloat(degrees));
  }
  std::vector<refhost::ParamState> snapshot() {
    std::vector<refhost::ParamState> states;
    for (const refhost::Param& param : host().panel().params()) states.push_back(param.state);
    return states;
  }

  std::unique_ptr<ViewerEvents> viewer_;
};

TEST_F(ViewerGestures, DraggingACutLineMovesItParallelToItself) {
  setCut(0, 0.0f, 0.0f, 0.0f);  // vertical line through the centre, corner x = 80
  const auto before = snapshot();
  viewer().drag(80, 70, 110, 60);
  EXPECT_EQ(number("cutPosition_0")[0], 30.0f);
  EXPECT_EQ(number("cutPosition_0")[1], 15.0f);
  EXPECT_EQ(number("cutDirection_0")[0], 0.0f);
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Split Screen Cut 1 Position"}));
  ASSERT_TRUE(host().undo());
  EXPECT_EQ(snapshot(), before);
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
  viewer().release(cx + radius, cy);
  EXPECT_NEAR(number("cutDirection_0")[0], 720.0f, 0.5f);
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Split Screen Cut 1 Direction"}));
}

TEST_F(ViewerGestures, ShiftPressInsertsACutUpToEight) {
  host().setValue("numberOfCuts", ParamValue::ofInt(7));
  for (int i = 0; i < 7; ++i) setCut(i, -70.0f + 2.0f * static_cast<float>(i), 0.0f, 0.0f);
  EXPECT_EQ(viewer().key(1007, kShift), 0);
  ASSERT_EQ(viewer().press(140, 45), 1);
  EXPECT_EQ(host().valueAt("numberOfCuts", 0).integer, 8);
  EXPECT_EQ(number("cutPosition_7")[0], 60.0f);
  EXPECT_EQ(number("cutPosition_7")[1], 0.0f);
  viewer().move(140, 80, true);
  viewer().release(140, 80);
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Inserting Cut"}));

  // With eight cuts Shift no longer inserts: the press falls through to the region under it.
  ASSERT_EQ(viewer().press(110, 10), 1);
  viewer().release(110, 10);
  EXPECT_EQ(host().valueAt("numberOfCuts", 0).integer, 8);
  ASSERT_EQ(host().undoStepNames().size(), 2u);
  EXPECT_EQ(host().undoStepNames()[1].rfind("Moved Split Screen Input ", 0), 0u)
      << host().undoStepNames()[1];
  EXPECT_EQ(viewer().key(1008, kShift), 0);
}

TEST_F(ViewerGestures, DraggingARegionMovesItsInput) {
  setCut(0, 0.0f, 0.0f, 0.0f);
  viewer().drag(120, 20, 130, 30);
  EXPECT_EQ(number("inputFrameTranslation0")[0], 10.0f);
  EXPECT_EQ(number("inputFrameTranslation0")[1], 10.0f);
  EXPECT_EQ(host().undoStepNames(), (std::vector<std::string>{"Moved Split Screen Input 0"}));
}

TEST_F(ViewerGestures, SelectedInputScalesFromTheOppositeCornerAndRotates) {
  setCut(0, -70.0f, 0.0f, 0.0f);  // the line at corner x = 10, out of the way
  host().setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  const auto initial = snapshot();
  viewer().press(150, 5);  // select input 0 (a zero-length move)
  viewer().release(150, 5);
  // Rectangle (40, 22.5)-(120, 67.5); drag its (x1, y1) corner out to (140, 77.5).
  viewer().move(120, 67, false);
  viewer().drag(120, 67, 140, 77);
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

  // The rotation handle sits above the picture's centre, half a handle beyond its circle.
  host().setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  host().setValue("inputFrameTranslation0", ParamValue::ofPoint(0.0f, 0.0f));
  viewer().move(80, 77, false);
  ASSERT_EQ(viewer().press(80, 77), 1);
  for (int step = 1; step <= 6; ++step) {
    const float theta = 15.0f * static_cast<float>(step) * 3.1415927f / 180.0f;
    viewer().move(80.0f + 32.0f * std::sin(theta), 45.0f + 32.0f * std::cos(theta), true);
  }
  viewer().release(112, 45);
  EXPECT_NEAR(host().valueAt("inputFrameRotation0", 0).number[0], 90.0f, 1.0f);

  const std::vector<std::string> steps = host().undoStepNames();
  ASSERT_EQ(steps.size(), 3u);
  EXPECT_EQ(steps[0], "Moved Split Screen Input 0");
  EXPECT_EQ(steps[1], "Split Screen Input 0 Scale");
  EXPECT_EQ(steps[2], "Split Screen Input 0 Rotation");
  while (host().undo()) {
  }
  // The host-side edits between gestures were not undo steps; put them back to compare.
  host().setValue("inputFrameScale0", ParamValue::ofFloat(50.0f));
  host().setValue("inputFrameTranslation0", ParamValue::ofPoint(0.0f, 0.0f));
  EXPECT_EQ(snapshot(), initial);
}

TEST_F(ViewerGestures, EscapeDeselectsAndTheQueryFollowsTheSelection) {
  setCut(0, 0.0f, 0.0f, 0.0f);
  EXPECT_EQ(viewer().key(1007, kEscape), 0);  // nothing selected: the key is not taken
  viewer().press(120, 20);
  viewer().release(120, 20);
  EXPECT_EQ(host().send(1012), 1);  // pointer over the selected input's region
  EXPECT_EQ(viewer().key(1007, kEscape), 1);
  EXPECT_EQ(host().send(1012), 1);  // key down changes nothing
  EXPECT_EQ(viewer().key(1008, kEscape), 1);
  EXPECT_EQ(host().send(1012), 0);
  EXPECT_EQ(viewer().key(1008, kEscape), 0);
}

TEST_F(ViewerGestures, ReleaseWithoutPressClosesNoStep) {
  setCut(0, 0.0f, 0.0f, 0.0f);
  EXPECT_EQ(viewer().release(120, 20), 1);   // over a region
  EXPECT_EQ(viewer().release(-50, -50), 0);  // outside the frame
  EXPECT_TRUE(host().callsTo("EndUndo").empty());
  EXPECT_TRUE(host().undoStepNames().empty());
}

}  // namespace

namespace {

// Message 1014 copies another instance's interaction state into this one.
TEST_F(ViewerGestures, CopyTakesTheOtherInstancesSelectionAndKeys) {
  host().setValue("numberOfCuts", ParamValue::ofInt(3));
  setCut(0, -40.0f, 0.0f, 0.0f);
  setCut(1, 0.0f, 0.0f, 0.0f);
  setCut(2, 40.0f, 0.0f, 0.0f);
  viewer().press(140, 10);  // right of every cut: input 3's region
  viewer().release(140, 10);
  viewer().key(1007, kShift);
  void* const source = host().api().instanceData;

  host().api().instanceData = nullptr;
  ASSERT_EQ(host().send(3), 1);
  void* const copy = host().api().instanceData;
  EXPECT_EQ(viewer().key(1007, kEscape), 0);  // a fresh record has no selection
  host().setRenderContext(source);
  EXPECT_EQ(host().send(1014), 0);
  host().setRenderContext(nullptr);
  EXPECT_EQ(host().api().instanceData, copy);
  EXPECT_EQ(viewer().key(1007, kEscape), 1);  // input 3 is selected here now
  host().clearViewerRecords();
  viewer().move(150, 80, false);  // Shift is down here too: the insert cursor
  ASSERT_FALSE(host().cursorShapes().empty());
  EXPECT_EQ(host().cursorShapes().back(), 19);

  EXPECT_EQ(host().send(4), 1);
  host().api().instanceData = source;
}

}  // namespace
