// How the module reacts to parameter changes (which parameters the host shows as usable) and
// which frames it asks the host to prepare before a render.
#include "loaded_plugin.h"

namespace {

using refhost::ParamValue;

const std::string kLayerA = "aaaaaaaa-0000-4000-8000-000000000001";
const std::string kLayerB = "bbbbbbbb-0000-4000-8000-000000000002";

// The enabled-state lines the host must see after a qualifying change, in order.
std::vector<std::string> expectedEnabledCalls(int cuts, bool radial) {
  auto line = [](const std::string& id, bool on) {
    return "SetParamEnabled " + id + (on ? " 1" : " 0");
  };
  std::vector<std::string> lines = {line("cutPosition_global", radial)};
  for (int i = 0; i < 8; ++i) {
    lines.push_back(line("cutPosition_" + std::to_string(i), i < cuts && !radial));
    lines.push_back(line("cutDirection_" + std::to_string(i), i < cuts));
  }
  for (int j = 0; j < 9; ++j) {
    const bool used = j <= cuts && !(radial && j == 0);
    for (const char* prefix : {"inputLayer", "inputFrameShift", "inputFrameTranslation",
                               "inputFrameScale", "inputFrameRotation"})
      lines.push_back(line(prefix + std::to_string(j), used));
  }
  return lines;
}

TEST_F(LoadedPlugin, CutCountAndTypeChangesSetEveryEnabledState) {
  const struct {
    int cuts;
    bool radial;
    const char* changed;
  } table[] = {{1, false, "numberOfCuts"},
               {3, true, "cutType"},
               {8, false, "cutType"},
               {8, true, "numberOfCuts"},
               {0, false, "numberOfCuts"}};
  for (const auto& row : table) {
    SCOPED_TRACE(std::to_string(row.cuts) + (row.radial ? " radial" : " local"));
    host().setValue("numberOfCuts", ParamValue::ofInt(row.cuts));
    host().setValue("cutType", ParamValue::ofInt(row.radial ? 1 : 0));
    host().clearCallLog();
    EXPECT_EQ(sendParamEvent(kMessageParameterChanged, row.changed), 1);
    const std::vector<std::string> calls = host().callsTo("SetParamEnabled");
    ASSERT_EQ(calls.size(), 62u);
    EXPECT_EQ(calls, expectedEnabledCalls(row.cuts, row.radial));
    // The panel follows what it was told.
    EXPECT_EQ(host().isEnabled("cutPosition_global"), row.radial);
    EXPECT_EQ(host().isEnabled("inputLayer0"), !row.radial);
  }
}

TEST_F(LoadedPlugin, OtherChangesCallNothing) {
  for (const char* id : {"borderWidth", "cutTypeX", "numberOfCutsY", "cutPosition_0", ""}) {
    host().clearCallLog();
    EXPECT_EQ(sendParamEvent(kMessageParameterChanged, id), 1) << id;
    EXPECT_TRUE(host().callLog().empty()) << id;
  }
  host().setEvent(nullptr);
  EXPECT_EQ(host().send(kMessageParameterChanged), 1);
  EXPECT_TRUE(host().callLog().empty());
}

TEST_F(LoadedPlugin, FrameRequestsNameTheCurrentFrameOfEveryLayerInUse) {
  const struct {
    const char* name;
    int cuts;
    bool radial;
    std::vector<std::string> layers;  // inputLayer0.. values; missing ones stay unset
    std::vector<std::string> requested;
  } table[] = {{"one local cut, input 0 set", 1, false, {kLayerA}, {kLayerA}},
               {"radial skips input 0", 2, true, {kLayerA, kLayerB, kLayerA}, {kLayerB, kLayerA}},
               {"same layer twice", 2, false, {kLayerA, kLayerA}, {kLayerA, kLayerA}},
               {"inputs past the cut count", 1, false, {"", "", kLayerB}, {}},
               {"nothing set", 8, false, {}, {}}};
  for (const auto& row : table) {
    SCOPED_TRACE(row.name);
    host().setValue("numberOfCuts", ParamValue::ofInt(row.cuts));
    host().setValue("cutType", ParamValue::ofInt(row.radial ? 1 : 0));
    for (int j = 0; j < 9; ++j) {
      const std::string guid = j < static_cast<int>(row.layers.size()) && !row.layers[j].empty()
                                   ? row.layers[j]
                                   : refhost::kNoLayer;
      host().setValue("inputLayer" + std::to_string(j), ParamValue::ofLayer(guid));
    }
    host().clearViewerRecords();
    WispRenderContext context{};
    context.frameNumber = 42;
    context.time = 42;
    host().setRenderContext(&context);
    EXPECT_EQ(host().send(kMessageRequestFrames), 1);
    host().setRenderContext(nullptr);

    const std::vector<refhost::FrameRequest>& requests = host().frameRequests();
    ASSERT_EQ(requests.size(), 1 + row.requested.size());
    EXPECT_EQ(requests[0].layerGuid, "");
    for (size_t k = 0; k < requests.size(); ++k) {
      EXPECT_EQ(requests[k].frames, (std::vector<uint32_t>{42, 42}));
      if (k > 0) {
        EXPECT_EQ(requests[k].layerGuid, row.requested[k - 1]);
      }
    }
  }
}

}  // namespace
