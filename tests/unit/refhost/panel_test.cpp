// The host's parameter panel as the plug-in's calls build and use it: refused declarations,
// keyframed values, misuse and undo steps.
#include <gtest/gtest.h>

#include <cmath>

#include "refhost/core/host.h"
#include "support/instrumented_host.h"

namespace refhost {
namespace {

const char* const kLayerA = "11111111-2222-3333-4444-555555555555";
const char* const kLayerB = "aaaaaaaa-bbbb-cccc-dddd-eeeeeeeeeeee";

// One parameter of every kind, two of them in nested groups, in the plug-in's style.
class HostPanel : public ::testing::Test {
 protected:
  void SetUp() override {
    int32_t second = 1;
    const int32_t results[] = {
        api.AddChoiceParam(h, L"Preset", "c", 98, L"A|B|C", &second, 0),
        api.BeginParamGroup(h, L"Cuts"),
        api.AddFloatParam(h, L"Width", L"px", "f", 3, 0, 200, 2, 1),
        api.BeginParamGroup(h, L"Cut 1"),
        api.AddAngleParam(h, L"Direction", "a", 17, 1, 225),
        api.EndParamGroup(h),
        api.EndParamGroup(h),
        api.AddIntParam(h, L"Count", L"", "i", 0, 1, 8, 1),
        api.AddBoolParam(h, L"Show", "b", 1, 0),
        api.AddPointParam(h, L"Position", "p", 1, 0, 0),
        api.AddColorParam(h, L"Color", "col", 1, 0, 0, 0),
        api.AddLayerParam(h, L"Layer", "l", 1),
    };
    for (int32_t result : results) ASSERT_EQ(result, 0);
  }

  // The value at the time as the panel formats it (the plug-in's getters read the same value).
  std::string read(const std::string& id, int32_t time) const {
    return formatValue(host.param(id).kind, host.valueAt(id, time));
  }

  testsupport::InstrumentedHost host;
  tagWispAPI& api = host.api();
  WispHost* h = host.handle();
};

TEST_F(HostPanel, RefusesTheArmedCallDuplicatesAndUnbalancedGroups) {
  // Counting restarts when the failure is armed, and later calls succeed again.
  host.failDeclarationCall(2);
  EXPECT_EQ(api.AddBoolParam(h, L"A", "x", 0, 0), 0);
  EXPECT_NE(api.AddBoolParam(h, L"B", "y", 0, 0), 0);
  EXPECT_EQ(api.AddBoolParam(h, L"C", "z", 0, 0), 0);
  EXPECT_EQ(host.declarationCallCount(), 3);
  EXPECT_TRUE(host.problems().empty());

  EXPECT_NE(api.AddIntParam(h, L"Again", L"", "i", 0, 1, 8, 1), 0);
  EXPECT_NE(api.EndParamGroup(h), 0);
  EXPECT_NE(api.AddLayerParam(h, L"No id", nullptr, 0), 0);
  EXPECT_EQ(host.param("i").displayName, "Count");
  EXPECT_EQ(host.problems().size(), 3u);
}

TEST_F(HostPanel, InterpolatesContinuousKindsAndHoldsDiscreteOnes) {
  // Keys at times 10 and 20, and what each kind reads at other times.
  using Value = ParamValue;
  const struct {
    const char* id;
    Value at10, at20;
    std::vector<std::pair<int32_t, std::string>> reads;
  } keys[] = {
      {"f", Value::ofFloat(0), Value::ofFloat(100), {{5, "0"}, {12, "20"}, {99, "100"}}},
      {"a", Value::ofFloat(90), Value::ofFloat(-270), {{15, "-90"}, {11, "54"}}},
      {"p", Value::ofPoint(-10, 4), Value::ofPoint(10, 8), {{15, "(0, 6)"}, {0, "(-10, 4)"}}},
      {"col", Value::ofColor(0, 1, 0.5f), Value::ofColor(1, 0, 0.5f), {{15, "(0.5, 0.5, 0.5)"}}},
      {"i", Value::ofInt(1), Value::ofInt(8), {{19, "1"}, {20, "8"}, {-5, "1"}}},
      {"b", Value::ofInt(0), Value::ofInt(1), {{19, "0"}, {20, "1"}}},
      {"c", Value::ofInt(2), Value::ofInt(0), {{15, "2"}, {25, "0"}}},
      {"l", Value::ofLayer(kLayerA), Value::ofLayer(kLayerB), {{19, kLayerA}, {20, kLayerB}}},
  };
  for (const auto& key : keys) {
    host.setKeyframe(key.id, 10, key.at10);
    host.setKeyframe(key.id, 20, key.at20);
    for (const auto& [time, expected] : key.reads)
      EXPECT_EQ(read(key.id, time), expected) << key.id << " @" << time;
  }

  // A plug-in edit of an animated parameter adds a keyframe; of a static one sets the value.
  api.SetFloatParam(h, "f", 15, 10, 0);
  EXPECT_EQ(host.param("f").state.keyframes.size(), 3u);
  EXPECT_EQ(read("f", 12), "4");
  host.clearKeyframes("i");
  api.SetIntParam(h, "i", 50, 7, 0);
  EXPECT_TRUE(host.param("i").state.keyframes.empty());
  EXPECT_EQ(read("i", -1000), "7");
  EXPECT_TRUE(host.problems().empty());
}

TEST_F(HostPanel, StoresWhatItIsGivenAndReportsMisuse) {
  // Values outside the declared range are stored as given: the plug-in must cope with them.
  host.setValue("i", ParamValue::ofInt(-3));
  host.setValue("f", ParamValue::ofFloat(NAN));
  EXPECT_EQ(read("i", 7), "-3");
  EXPECT_TRUE(std::isnan(api.GetFloatParam(h, "f", 0)));

  // Unknown ids and kind mismatches read zero values, write nothing and are reported.
  EXPECT_EQ(api.GetIntParam(h, "nope", 0), 0);
  EXPECT_EQ(api.GetChoiceParam(h, "i", 0), 0);
  float x = 3, y = 3;
  api.GetPointParam(h, nullptr, 0, &x, &y);
  EXPECT_EQ(x + y, 0.0f);
  char guid[40];
  api.GetLayerParam(h, "missing", 0, guid);
  EXPECT_STREQ(guid, kNoLayer);
  api.SetFloatParam(h, "i", 0, 1.5f, 0);
  EXPECT_EQ(host.valueAt("i", 0).integer, -3);
  EXPECT_EQ(host.problems().size(), 5u);
  EXPECT_EQ(host.callLog().back(), "SetFloatParam i 0 1.5 0");
  EXPECT_THROW(host.setValue("typo", ParamValue::ofInt(1)), std::out_of_range);
}

TEST_F(HostPanel, UndoStepsRestoreExactStatesAndANewStepDropsRedo) {
  host.setKeyframe("a", 0, ParamValue::ofFloat(0));
  host.setKeyframe("a", 100, ParamValue::ofFloat(90));
  std::vector<std::vector<ParamState>> history{host.paramStates()};

  // Step 1: two edits of the same point and a width: one step, the first state kept.
  const float x1 = 10, y1 = 20, x2 = -0.0f, y2 = NAN;
  api.BeginUndo(h, "Move Cut");
  api.SetPointParam(h, "p", 0, &x1, &y1, 0);
  api.SetPointParam(h, "p", 0, &x2, &y2, 0);
  api.SetFloatParam(h, "f", 0, 7.25f, 0);
  api.EndUndo(h);
  history.push_back(host.paramStates());
  // Step 2: a nested bracket joins the outer step; the animated angle gains a keyframe.
  api.BeginUndo(h, "Rotate Cut");
  api.SetAngleParam(h, "a", 50, 1e30f, 0);
  api.BeginUndo(h, "inner");
  api.SetLayerParam(h, "l", 0, kLayerA, 0);
  api.EndUndo(h);
  api.EndUndo(h);
  history.push_back(host.paramStates());
  // A bracket that changes nothing (an edit to the value already there) is no step.
  const float same = 7.25f;
  api.BeginUndo(h, "Select");
  api.SetFloatParam(h, "f", 0, same, 0);
  api.EndUndo(h);

  EXPECT_EQ(host.undoStepNames(), (std::vector<std::string>{"Move Cut", "Rotate Cut"}));
  EXPECT_TRUE(host.immediateEdits().empty());
  for (int step = 2; step > 0; --step) {
    ASSERT_TRUE(host.undo());
    EXPECT_EQ(host.paramStates(), history[static_cast<std::size_t>(step - 1)])
        << "undoing " << step;
  }
  EXPECT_FALSE(host.undo());
  for (std::size_t step = 1; step <= 2; ++step) {
    ASSERT_TRUE(host.redo());
    EXPECT_EQ(host.paramStates(), history[step]) << "redoing " << step;
  }
  EXPECT_FALSE(host.redo());
  EXPECT_TRUE(std::isnan(host.valueAt("p", 0).number[1]));
  EXPECT_TRUE(std::signbit(host.valueAt("p", 0).number[0]));

  // An edit outside any bracket is immediate and keeps the step that can be redone.
  ASSERT_TRUE(host.undo());
  api.SetLayerParam(h, "l", 4, kLayerB, 0);
  ASSERT_EQ(host.immediateEdits().size(), 1u);
  EXPECT_EQ(host.immediateEdits()[0].id, "l");
  EXPECT_EQ(host.immediateEdits()[0].time, 4);
  EXPECT_EQ(host.immediateEdits()[0].value, kLayerB);
  EXPECT_EQ(host.redoStepNames(), std::vector<std::string>{"Rotate Cut"});
  // So does a bracket that changes nothing; a new step drops it.
  api.BeginUndo(h, "Select");
  api.EndUndo(h);
  EXPECT_EQ(host.redoStepNames(), std::vector<std::string>{"Rotate Cut"});
  api.BeginUndo(h, "Width");
  api.SetFloatParam(h, "f", 0, 9, 0);
  api.EndUndo(h);
  EXPECT_EQ(host.undoStepNames(), (std::vector<std::string>{"Move Cut", "Width"}));
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
