// The panel the module declares, read back from the host against the declaration's rules (ids,
// groups, flags, defaults within ranges), its refusals and the layer labels per host product.
#include <set>

#include "loaded_plugin.h"
#include "support/instrumented_host.h"

namespace {

using refhost::ParamKind;

constexpr int kCuts = 8;
constexpr int kInputs = 9;
constexpr int32_t kAnimated = kParamFlagAnimated;

// Where the declaration puts a parameter: once at the top, in "Cuts" or in "Border", or once per
// cut ("cutPosition_3" in "Cut 4") or per input ("inputLayer3" in "Input 3").
enum class Place { Top, Cuts, PerCut, PerInput, Border };

// What the declaration says of one parameter, or of every parameter with one stem.
struct Rule {
  Place place;
  std::string stem;
  ParamKind kind;
  std::string defaultText;  // as the host formats values
  int32_t flags;            // every flag but the not-in-use one
  double minimum = 0, maximum = 0;
};

const Rule kRules[] = {
    {Place::Top, "preset", ParamKind::Choice, "0", kParamFlagHostPresets | kParamFlagNotSaved},
    {Place::Cuts, "cutType", ParamKind::Choice, "0", kParamFlagsNone},
    {Place::Cuts, "numberOfCuts", ParamKind::Int, "1", kParamFlagsNone, 1, kCuts},
    {Place::Cuts, "viewCutRegions", ParamKind::Bool, "0", kAnimated},
    {Place::Cuts, "cutPosition_global", ParamKind::Point, "(0, 0)",
     kAnimated | kParamFlagHostHandle},
    {Place::PerCut, "cutPosition", ParamKind::Point, "(0, 0)", kAnimated},
    {Place::PerCut, "cutDirection", ParamKind::Angle, "0", kAnimated | kParamFlagsDirection},
    {Place::PerInput, "inputLayer", ParamKind::Layer, refhost::kNoLayer, kAnimated},
    {Place::PerInput, "inputFrameShift", ParamKind::Int, "0", kAnimated, -100000, 10000},
    {Place::PerInput, "inputFrameTranslation", ParamKind::Point, "(0, 0)", kAnimated},
    {Place::PerInput, "inputFrameScale", ParamKind::Float, "100", kAnimated, 1, 1000},
    {Place::PerInput, "inputFrameRotation", ParamKind::Angle, "0", kAnimated | kParamFlagsRotation},
    {Place::Border, "borderWidth", ParamKind::Float, "2", kAnimated, 0, 200},
    {Place::Border, "borderColor", ParamKind::Color, "(0, 0, 0)", kAnimated},
    {Place::Border, "borderAlpha", ParamKind::Float, "1", kAnimated, 0, 1}};

struct Declared {
  std::string id;
  std::string group;  // from the outermost in: "Cuts > Cut 1"
  const Rule* rule;
  bool unused;
};

// The panel in declaration order, each parameter marked unused where the default layout of
// `cuts` Local cuts leaves it so: the cuts from that count on, the inputs after the one beyond
// the last cut, the Radial centre and the placeholder preset.
std::vector<Declared> declarationOrder(int cuts) {
  std::vector<Declared> order;
  const auto add = [&](Place place, int index, const std::string& group, bool unused) {
    for (const Rule& rule : kRules) {
      if (rule.place != place) continue;
      const std::string suffix =
          index < 0 ? "" : (place == Place::PerCut ? "_" : "") + std::to_string(index);
      const bool neverInUse = rule.stem == "preset" || rule.stem == "cutPosition_global";
      order.push_back({rule.stem + suffix, group, &rule, unused || neverInUse});
    }
  };
  add(Place::Top, -1, "", false);
  add(Place::Cuts, -1, "Cuts", false);
  for (int i = 0; i < kCuts; ++i)
    add(Place::PerCut, i, "Cuts > Cut " + std::to_string(i + 1), i >= cuts);
  for (int j = 0; j < kInputs; ++j)
    add(Place::PerInput, j, "Input Layers/Frames > Input " + std::to_string(j), j > cuts);
  add(Place::Border, -1, "Border", false);
  return order;
}

// The parameter's groups from the outermost in: "Cuts > Cut 1".
std::string groupPath(const refhost::ParamPanel& panel, const refhost::Param& param) {
  std::string path;
  for (const std::string& group : panel.groupPath(param))
    path += (path.empty() ? "" : " > ") + group;
  return path;
}

TEST_F(LoadedPlugin, PanelFollowsTheDeclarationRules) {
  const refhost::ParamPanel& panel = host().panel();
  ASSERT_EQ(host().param("cutType").defaultValue.integer, 0) << "the default layout is Local";
  const std::vector<Declared> expected =
      declarationOrder(host().param("numberOfCuts").defaultValue.integer);
  ASSERT_EQ(panel.params().size(), expected.size());
  std::set<std::string> groupsHoldingParameters;
  for (size_t k = 0; k < expected.size(); ++k) {
    const refhost::Param& actual = panel.params()[k];
    const Declared& want = expected[k];
    const Rule& rule = *want.rule;
    SCOPED_TRACE(want.id);
    EXPECT_EQ(actual.id, want.id);
    EXPECT_EQ(groupPath(panel, actual), want.group);
    groupsHoldingParameters.insert(want.group);
    EXPECT_EQ(actual.kind, rule.kind);
    EXPECT_EQ(actual.flags, rule.flags | (want.unused ? kParamFlagNotInUse : kParamFlagsNone));
    // The first cut starts on the diagonal; every other default is the stem's.
    const std::string defaultText = want.id == "cutDirection_0" ? "225" : rule.defaultText;
    EXPECT_EQ(refhost::formatValue(actual.kind, actual.defaultValue), defaultText);
    if (rule.kind == ParamKind::Int || rule.kind == ParamKind::Float) {
      EXPECT_EQ(actual.minimum, rule.minimum);
      EXPECT_EQ(actual.maximum, rule.maximum);
      const double value =
          rule.kind == ParamKind::Int ? actual.defaultValue.integer : actual.defaultValue.number[0];
      EXPECT_TRUE(actual.minimum <= value && value <= actual.maximum) << value;
    }
    EXPECT_EQ(actual.extra, rule.kind == ParamKind::Angle ? 1 : 0);
  }
  // Every group but "Input Layers/Frames" holds a parameter, so each path was checked above.
  groupsHoldingParameters.erase("");
  EXPECT_EQ(panel.groups().size(), groupsHoldingParameters.size() + 1);
  EXPECT_EQ(panel.openGroupDepth(), 0);
  for (const refhost::ParamGroup& group : panel.groups()) EXPECT_TRUE(group.closed);
}

// A refused call stops the declaration at once: Notify answers the exception result, nothing
// after the refused call is asked, and what was declared before stays.
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
    EXPECT_EQ(host.send(kMessageDeclareParameters), kResultException);
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
  } table[] = {{kHostProductCompositor, true},      {kHostProductCompositorPro, true},
               {kHostProductRenderNode, true},      {kHostProductCompositorPreview, true},
               {kHostProductTouch, false},          {0, false},
               {kHostProductCompositor + 1, false}, {-1, false}};
  for (const auto& row : table) {
    SCOPED_TRACE(row.hostId);
    testsupport::InstrumentedHost host(module);
    host.setHostId(row.hostId);
    ASSERT_EQ(host.send(kMessageLoad), 1);
    ASSERT_EQ(host.send(kMessageDeclareParameters), 1);
    for (int j = 0; j < kInputs; ++j) {
      const std::string label = host.param("inputLayer" + std::to_string(j)).displayName;
      EXPECT_EQ(label, row.numbered ? "Layer " + std::to_string(j) : "Layer");
    }
    // The label rule is asked just before each layer parameter.
    EXPECT_EQ(host.callsTo("GetHostId").size(), 9u);
    EXPECT_EQ(host.send(kMessageUnload), 1);
  }
}

}  // namespace
