// Undo steps made by the plug-in's BeginUndo/EndUndo brackets: grouping, names, and exact
// restoration of values and keyframes across several steps.
#include <gtest/gtest.h>

#include <cmath>

#include "refhost/host.h"

namespace refhost {
namespace {

class HostUndo : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_EQ(api.AddFloatParam(h, L"Width", L"px", "width", 1, 0, 200, 2, 1), 0);
    ASSERT_EQ(api.AddPointParam(h, L"Position", "position", 1, 0, 0), 0);
    ASSERT_EQ(api.AddAngleParam(h, L"Direction", "direction", 17, 1, 225), 0);
    ASSERT_EQ(api.AddLayerParam(h, L"Layer", "layer", 1), 0);
  }

  std::vector<ParamState> snapshot() const {
    std::vector<ParamState> states;
    for (const Param& param : host.panel().params()) states.push_back(param.state);
    return states;
  }

  Host host;
  tagWispAPI& api = host.api();
  WispHost* h = host.handle();
};

TEST_F(HostUndo, UndoAndRedoRestoreExactStatesAcrossSteps) {
  host.setKeyframe("direction", 0, ParamValue::ofFloat(0));
  host.setKeyframe("direction", 100, ParamValue::ofFloat(90));
  std::vector<std::vector<ParamState>> history{snapshot()};

  // Step 1: two edits of the same point and a width: one step, the first state kept.
  const float x1 = 10, y1 = 20, x2 = -0.0f, y2 = NAN;
  api.BeginUndo(h, "Move Cut");
  api.SetPointParam(h, "position", 0, &x1, &y1, 0);
  api.SetPointParam(h, "position", 0, &x2, &y2, 0);
  api.SetFloatParam(h, "width", 0, 7.25f, 0);
  api.EndUndo(h);
  history.push_back(snapshot());

  // Step 2: a nested bracket joins the outer step; the animated angle gains a keyframe.
  api.BeginUndo(h, "Rotate Cut");
  api.SetAngleParam(h, "direction", 50, 1e30f, 0);
  api.BeginUndo(h, "inner");
  api.SetLayerParam(h, "layer", 0, "11111111-2222-3333-4444-555555555555", 0);
  api.EndUndo(h);
  api.SetFloatParam(h, "width", 0, 3, 0);
  api.EndUndo(h);
  history.push_back(snapshot());

  // Step 3: a bracket without edits is still a step.
  api.BeginUndo(h, "Select");
  api.EndUndo(h);
  history.push_back(snapshot());

  EXPECT_EQ(host.undoStepNames(), (std::vector<std::string>{"Move Cut", "Rotate Cut", "Select"}));
  EXPECT_TRUE(host.immediateEdits().empty());
  EXPECT_EQ(host.param("direction").state.keyframes.size(), 3u);

  for (int step = 3; step > 0; --step) {
    ASSERT_TRUE(host.undo());
    EXPECT_EQ(snapshot(), history[static_cast<std::size_t>(step - 1)]) << "after undoing " << step;
  }
  EXPECT_FALSE(host.undo());
  EXPECT_EQ(host.redoStepNames(), (std::vector<std::string>{"Move Cut", "Rotate Cut", "Select"}));
  for (std::size_t step = 1; step <= 3; ++step) {
    ASSERT_TRUE(host.redo());
    EXPECT_EQ(snapshot(), history[step]) << "after redoing " << step;
  }
  EXPECT_FALSE(host.redo());
  EXPECT_TRUE(std::isnan(host.valueAt("position", 0).number[1]));
  EXPECT_TRUE(std::signbit(host.valueAt("position", 0).number[0]));
  EXPECT_TRUE(host.problems().empty());
}

TEST_F(HostUndo, NewStepDropsRedoAndEditsOutsideBracketsAreImmediate) {
  api.BeginUndo(h, "First");
  api.SetFloatParam(h, "width", 0, 5, 0);
  api.EndUndo(h);
  ASSERT_TRUE(host.undo());

  api.SetLayerParam(h, "layer", 4, "aaaaaaaa-bbbb-cccc-dddd-eeeeeeeeeeee", 0);
  ASSERT_EQ(host.immediateEdits().size(), 1u);
  EXPECT_EQ(host.immediateEdits()[0].id, "layer");
  EXPECT_EQ(host.immediateEdits()[0].time, 4);
  EXPECT_EQ(host.immediateEdits()[0].value, "aaaaaaaa-bbbb-cccc-dddd-eeeeeeeeeeee");
  EXPECT_EQ(host.redoStepNames(), std::vector<std::string>{"First"});  // immediate edits keep it

  api.BeginUndo(h, "Second");
  api.SetFloatParam(h, "width", 0, 9, 0);
  api.EndUndo(h);
  EXPECT_EQ(host.undoStepNames(), std::vector<std::string>{"Second"});
  EXPECT_TRUE(host.redoStepNames().empty());
  EXPECT_FALSE(host.redo());

  // Undo is refused while the plug-in holds a bracket open (a drag in progress).
  api.BeginUndo(h, "Drag");
  EXPECT_FALSE(host.undo());
  api.EndUndo(h);
  api.EndUndo(h);  // unbalanced
  EXPECT_EQ(host.problems(), std::vector<std::string>{"EndUndo without BeginUndo"});
}

}  // namespace
}  // namespace refhost
