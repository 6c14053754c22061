// The panel the host builds from declaration calls, the call log lines they leave, and the
// injected failure of the k-th declaration call.
#include <gtest/gtest.h>

#include <algorithm>

#include "refhost/host.h"

namespace refhost {
namespace {

// A small declaration in the plug-in's style; returns the number of calls that succeeded
// before the first refusal (all nine when none is refused), stopping at a refusal as the
// plug-in does.
int declareSample(Host& host) {
  tagWispAPI& api = host.api();
  WispHost* h = host.handle();
  int32_t second = 1;
  int done = 0;
  auto call = [&](int32_t result) { return result == 0 && ++done; };
  call(api.AddChoiceParam(h, L"Preset", "preset", 98, L"N/A", &second, 0)) &&
      call(api.BeginParamGroup(h, L"Cuts")) &&
      call(api.AddChoiceParam(h, L"Cut Type", "cutType", 0, L"Local|Radial", &second, 0)) &&
      call(api.BeginParamGroup(h, L"Cut 1")) &&
      call(api.AddAngleParam(h, L"Direction", "cutDirection_0", 17, 1, 225)) &&
      call(api.EndParamGroup(h)) && call(api.EndParamGroup(h)) &&
      call(api.AddFloatParam(h, L"Scale", L"%", "scale", 3, 1, 1000, 100, 1)) &&
      call(api.AddLayerParam(h, L"Layer 0", "inputLayer0", 1));
  return done;
}

TEST(HostDeclaration, PanelHoldsExactlyWhatWasDeclared) {
  Host host;
  ASSERT_EQ(declareSample(host), 9);
  const ParamPanel& panel = host.panel();
  ASSERT_EQ(panel.params().size(), 5u);
  ASSERT_EQ(panel.groups().size(), 2u);
  EXPECT_EQ(panel.openGroupDepth(), 0);

  const Param& type = host.param("cutType");
  EXPECT_EQ(type.kind, ParamKind::Choice);
  EXPECT_EQ(type.displayName, "Cut Type");
  EXPECT_EQ(type.choices, (std::vector<std::string>{"Local", "Radial"}));
  EXPECT_EQ(type.defaultValue.integer, 1);
  EXPECT_EQ(panel.groupPath(type), std::vector<std::string>{"Cuts"});

  const Param& direction = host.param("cutDirection_0");
  EXPECT_EQ(direction.extra, 1);
  EXPECT_EQ(direction.flags, 17);
  EXPECT_EQ(direction.valueAt(0).number[0], 225.0f);
  EXPECT_EQ(panel.groupPath(direction), (std::vector<std::string>{"Cuts", "Cut 1"}));

  const Param& scale = host.param("scale");
  EXPECT_EQ(scale.unit, "%");
  EXPECT_EQ(scale.minimum, 1.0);
  EXPECT_EQ(scale.maximum, 1000.0);
  EXPECT_EQ(scale.precision, 1);
  EXPECT_TRUE(panel.groupPath(scale).empty());

  // The flag bit 0x2 starts a parameter disabled; SetParamEnabled then decides.
  EXPECT_FALSE(host.isEnabled("preset"));
  EXPECT_FALSE(host.isEnabled("scale"));
  EXPECT_TRUE(host.isEnabled("inputLayer0"));
  uint8_t on = 1, off = 0;
  host.api().SetParamEnabled(host.handle(), "scale", &on);
  host.api().SetParamEnabled(host.handle(), "inputLayer0", &off);
  EXPECT_TRUE(host.isEnabled("scale"));
  EXPECT_FALSE(host.isEnabled("inputLayer0"));
}

TEST(HostDeclaration, CallLogRecordsEveryCallWithItsArguments) {
  Host host;
  declareSample(host);
  uint8_t off = 0;
  host.api().SetParamEnabled(host.handle(), "cutType", &off);
  const std::vector<std::string> expected = {
      "AddChoiceParam \"Preset\" preset 98 \"N/A\" 1 0",
      "BeginParamGroup \"Cuts\"",
      "AddChoiceParam \"Cut Type\" cutType 0 \"Local|Radial\" 1 0",
      "BeginParamGroup \"Cut 1\"",
      "AddAngleParam \"Direction\" cutDirection_0 17 1 225",
      "EndParamGroup",
      "EndParamGroup",
      "AddFloatParam \"Scale\" \"%\" scale 3 1 1000 100 1",
      "AddLayerParam \"Layer 0\" inputLayer0 1",
      "SetParamEnabled cutType 0",
  };
  EXPECT_EQ(host.callLog(), expected);
  EXPECT_EQ(host.callsTo("EndParamGroup").size(), 2u);
  host.clearCallLog();
  EXPECT_TRUE(host.callLog().empty());
}

TEST(HostDeclaration, RefusesTheKthCallOnly) {
  struct Case {
    int failAt;
    std::size_t params;
    std::size_t groups;
    int openGroups;
  };
  // Calls: 1 preset, 2 Cuts, 3 cutType, 4 Cut 1, 5 direction, 6 end, 7 end, 8 scale, 9 layer.
  const Case cases[] = {{1, 0, 0, 0}, {2, 1, 0, 0}, {3, 1, 1, 1}, {5, 2, 2, 2},
                        {6, 3, 2, 2}, {7, 3, 2, 1}, {9, 4, 2, 0}, {10, 5, 2, 0}};
  for (const Case& c : cases) {
    Host host;
    host.failDeclarationCall(c.failAt);
    int done = declareSample(host);
    EXPECT_EQ(done, std::min(c.failAt - 1, 9)) << "failing call " << c.failAt;
    EXPECT_EQ(host.panel().params().size(), c.params) << "failing call " << c.failAt;
    EXPECT_EQ(host.panel().groups().size(), c.groups) << "failing call " << c.failAt;
    EXPECT_EQ(host.panel().openGroupDepth(), c.openGroups) << "failing call " << c.failAt;
    EXPECT_EQ(host.callLog().size(), static_cast<std::size_t>(std::min(c.failAt, 9)));
  }
  // Counting restarts when the failure is armed, and later calls succeed again.
  Host host;
  declareSample(host);
  host.failDeclarationCall(2);
  EXPECT_EQ(host.api().AddBoolParam(host.handle(), L"A", "a", 0, 0), 0);
  EXPECT_NE(host.api().AddBoolParam(host.handle(), L"B", "b", 0, 0), 0);
  EXPECT_EQ(host.api().AddBoolParam(host.handle(), L"C", "c", 0, 0), 0);
  EXPECT_EQ(host.declarationCallCount(), 3);
  EXPECT_EQ(host.panel().find("b"), nullptr);
}

TEST(HostDeclaration, RejectsDuplicatesAndUnbalancedGroups) {
  Host host;
  tagWispAPI& api = host.api();
  EXPECT_EQ(api.AddIntParam(host.handle(), L"N", L"", "n", 0, 1, 8, 1), 0);
  EXPECT_NE(api.AddIntParam(host.handle(), L"N again", L"", "n", 0, 1, 8, 1), 0);
  EXPECT_NE(api.EndParamGroup(host.handle()), 0);
  EXPECT_NE(api.AddLayerParam(host.handle(), L"No id", nullptr, 0), 0);
  EXPECT_EQ(host.param("n").displayName, "N");
  EXPECT_EQ(host.problems().size(), 3u);
}

}  // namespace
}  // namespace refhost
