// The parameter panel the module declares, read back from the host: every parameter's id,
// name, kind, flags, default and range, the group nesting, refusals and the layer labels.
#include "loaded_plugin.h"
#include "support/instrumented_host.h"

namespace {

using refhost::ParamKind;

struct Expected {
  std::string id;
  std::string displayName;
  ParamKind kind;
  int32_t flags;
  std::string defaultText;  // formatted as the host formats values
  double minimum = 0;
  double maximum = 0;
  std::string unit;
  std::string group;
};

// The whole declaration, written out independently of the module's code.
std::vector<Expected> expectedPanel(const std::string& layerLabelPrefix, bool numbered) {
  std::vector<Expected> rows = {
      {"preset", "Preset", ParamKind::Choice, 98, "0", 0, 0, "", ""},
      {"cutType", "Cut Type", ParamKind::Choice, 0, "0", 0, 0, "", "Cuts"},
      {"numberOfCuts", "Number of Cuts", ParamKind::Int, 0, "1", 1, 8, "", "Cuts"},
      {"viewCutRegions", "View Cut Regions", ParamKind::Bool, 1, "0", 0, 0, "", "Cuts"},
      {"cutPosition_global", "Position", ParamKind::Point, 1027, "(0, 0)", 0, 0, "", "Cuts"},
  };
  for (int i = 0; i < 8; ++i) {
    const int32_t flags = i == 0 ? 1 : 3;
    const std::string group = "Cuts > Cut " + std::to_string(i + 1);
    rows.push_back({"cutPosition_" + std::to_string(i), "Position", ParamKind::Point, flags,
                    "(0, 0)", 0, 0, "", group});
    rows.push_back({"cutDirection_" + std::to_string(i), "Direction", ParamKind::Angle, flags + 16,
                    i == 0 ? "225" : "0", 0, 0, "", group});
  }
  for (int j = 0; j < 9; ++j) {
    const int32_t flags = j <= 1 ? 1 : 3;
    const std::string n = std::to_string(j);
    const std::string group = "Input Layers/Frames > Input " + n;
    rows.push_back({"inputLayer" + n, numbered ? layerLabelPrefix + " " + n : layerLabelPrefix,
                    ParamKind::Layer, flags, "00000000-0000-0000-0000-000000000000", 0, 0, "",
                    group});
    rows.push_back({"inputFrameShift" + n, "Frame Shift", ParamKind::Int, flags, "0", -100000,
                    10000, "", group});
    rows.push_back({"inputFrameTranslation" + n, "Translation", ParamKind::Point, flags, "(0, 0)",
                    0, 0, "", group});
    rows.push_back(
        {"inputFrameScale" + n, "Scale", ParamKind::Float, flags, "100", 1, 1000, "%", group});
    rows.push_back(
        {"inputFrameRotation" + n, "Rotation", ParamKind::Angle, flags + 20, "0", 0, 0, "", group});
  }
  rows.push_back({"borderWidth", "Width", ParamKind::Float, 1, "2", 0, 200, "px", "Border"});
  rows.push_back({"borderColor", "Color", ParamKind::Color, 1, "(0, 0, 0)", 0, 0, "", "Border"});
  rows.push_back({"borderAlpha", "Alpha", ParamKind::Float, 1, "1", 0, 1, "", "Border"});
  return rows;
}

// The parameter's groups from the outermost in: "Cuts > Cut 1".
std::string groupPath(const refhost::ParamPanel& panel, const refhost::Param& param) {
  std::string path;
  for (const std::string& group : panel.groupPath(param))
    path += (path.empty() ? "" : " > ") + group;
  return path;
}

TEST_F(LoadedPlugin, DeclaresEveryParameterInOrder) {
  const refhost::ParamPanel& panel = host().panel();
  const std::vector<Expected> expected = expectedPanel("Layer", false);
  ASSERT_EQ(panel.params().size(), 69u);
  ASSERT_EQ(expected.size(), 69u);
  for (size_t k = 0; k < expected.size(); ++k) {
    const refhost::Param& actual = panel.params()[k];
    const Expected& want = expected[k];
    SCOPED_TRACE(want.id);
    EXPECT_EQ(actual.id, want.id);
    EXPECT_EQ(actual.displayName, want.displayName);
    EXPECT_EQ(actual.kind, want.kind);
    EXPECT_EQ(actual.flags, want.flags);
    EXPECT_EQ(refhost::formatValue(actual.kind, actual.defaultValue), want.defaultText);
    EXPECT_EQ(actual.unit, want.unit);
    EXPECT_EQ(groupPath(panel, actual), want.group);
    if (want.kind == ParamKind::Int || want.kind == ParamKind::Float) {
      EXPECT_EQ(actual.minimum, want.minimum);
      EXPECT_EQ(actual.maximum, want.maximum);
    }
    if (want.kind == ParamKind::Angle) {
      EXPECT_EQ(actual.extra, 1);
    }
  }
  EXPECT_EQ(panel.params()[0].choices, (std::vector<std::string>{"N/A"}));
  EXPECT_EQ(panel.params()[1].choices, (std::vector<std::string>{"Local", "Radial"}));
  EXPECT_EQ(host().param("inputFrameScale0").precision, 1);
  EXPECT_EQ(host().param("borderWidth").precision, 1);
  EXPECT_EQ(host().param("borderAlpha").precision, 2);
  ASSERT_EQ(panel.groups().size(), 20u);  // each holds a parameter, so each path is checked above
  EXPECT_EQ(panel.openGroupDepth(), 0);
  for (const refhost::ParamGroup& group : panel.groups()) EXPECT_TRUE(group.closed);
}

// A refused call stops the declaration at once: the result is 5, nothing after it is asked,
// and what was declared before stays.
TEST(ParameterDeclaration, StopsAtTheFirstRefusedCall) {
  refhost::Module module(VELTRANE_MODULE_PATH);
  const struct {
    int refusedCall;
    size_t paramsDeclared;
    int openGroups;
  } table[] = {
      {1, 0, 0},     // "preset"
      {4, 2, 1},     // "numberOfCuts": preset and cutType declared, "Cuts" open
      {7, 5, 1},     // opening "Cut 1"
      {9, 6, 2},     // "cutDirection_0", inside "Cuts" and "Cut 1"
      {109, 69, 1},  // closing "Border"
  };
  for (const auto& row : table) {
    SCOPED_TRACE(row.refusedCall);
    testsupport::InstrumentedHost host(module);
    ASSERT_EQ(host.send(kMessageLoad), 1);
    host.failDeclarationCall(row.refusedCall);
    EXPECT_EQ(host.send(kMessageDeclareParameters), 5);
    EXPECT_EQ(host.declarationCallCount(), row.refusedCall);
    EXPECT_EQ(host.panel().params().size(), row.paramsDeclared);
    EXPECT_EQ(host.panel().openGroupDepth(), row.openGroups);
    EXPECT_EQ(host.send(kMessageUnload), 1);
  }
}

TEST(ParameterDeclaration, LayerLabelsFollowTheHostProductCode) {
  refhost::Module module(VELTRANE_MODULE_PATH);
  const struct {
    int32_t hostId;
    bool numbered;
  } table[] = {{5100, true}, {5200, true},  {5600, true},  {6001, true},
               {0, false},   {3000, false}, {5101, false}, {-1, false}};
  for (const auto& row : table) {
    SCOPED_TRACE(row.hostId);
    testsupport::InstrumentedHost host(module);
    host.setHostId(row.hostId);
    ASSERT_EQ(host.send(kMessageLoad), 1);
    ASSERT_EQ(host.send(kMessageDeclareParameters), 1);
    for (int j = 0; j < 9; ++j) {
      const std::string label = host.param("inputLayer" + std::to_string(j)).displayName;
      EXPECT_EQ(label, row.numbered ? "Layer " + std::to_string(j) : "Layer");
    }
    // The label rule is asked just before each layer parameter.
    EXPECT_EQ(host.callsTo("GetHostId").size(), 9u);
    EXPECT_EQ(host.send(kMessageUnload), 1);
  }
}

}  // namespace
