// Each layout preset, read back through the plug-in's own cut model and partition, divides the
// frame into the regions it promises, each showing a different picture.
#include "viewer/layout_presets.h"

#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <set>

#include "geometry/cut_model.h"
#include "geometry/region_partition.h"
#include "scene/scene_document.h"
#include "scene/scene_engine.h"
#include "support/in_memory_host.h"

namespace veltrane_viewer {
namespace {

constexpr float kWidth = 1920;
constexpr float kHeight = 1080;

// Area of each input's region as a fraction of the frame.
std::map<int32_t, double> regionAreas(testsupport::InMemoryHost& host) {
  plugin_glsl_types::genVec2 frame{kWidth, kHeight};
  veltrane::CutList cuts = veltrane::readCutList(host.handle(), host.record(), 0, frame, false, 1);
  std::map<int32_t, double> areas;
  for (const veltrane::Region& region :
       veltrane::partitionFrame(cuts, frame, host.integer("cutType"))) {
    for (const veltrane::RegionTriangle& t : region.triangles) {
      const auto& [a, b, c] = t.vertices;
      double area = ((b.x - a.x) * (c.y - a.y) - (b.y - a.y) * (c.x - a.x)) / 2;
      areas[region.id] += area / (kWidth * kHeight);
    }
  }
  for (auto it = areas.begin(); it != areas.end();) it = it->second > 1e-6 ? ++it : areas.erase(it);
  return areas;
}

constexpr double kAny = -1;  // a region of its own, of whatever size its angle gives it

// Inputs `first` to `last`, each with that share of the frame.
std::map<int32_t, double> shares(int32_t first, int32_t last, double share) {
  std::map<int32_t, double> each;
  for (int32_t input = first; input <= last; ++input) each[input] = share;
  return each;
}

TEST(LayoutPresets, EachDividesTheFrameAsNamedWithADifferentPictureInEveryRegion) {
  const std::map<std::string, std::map<int32_t, double>> expected = {
      {"diagonal-2", shares(0, 1, 0.5)}, {"comic-3", shares(0, 2, kAny)},
      {"grid-2x2", shares(0, 3, 0.25)},  {"grid-3x3", shares(0, 8, 1. / 9)},
      {"radial-3", shares(1, 3, kAny)},  {"radial-4", shares(1, 4, kAny)},
      {"radial-6", shares(1, 6, kAny)},  {"picture-in-picture", {{1, 8. / 9}, {2, 1. / 9}}},
  };
  std::vector<std::string> sources{refhost::kNoLayer};
  for (int i = 1; i <= 8; ++i)
    sources.push_back("d3e00000-0000-4000-8000-00000000000" + std::to_string(i));
  ASSERT_EQ(layoutPresets().size(), expected.size());
  for (std::size_t index = 0; index < layoutPresets().size(); ++index) {
    const std::string stem = layoutPresets()[index].fileStem;
    testsupport::InMemoryHost host;
    for (const ParamEdit& edit : presetEdits(index, kWidth, kHeight, sources))
      host.setValue(edit.id, edit.value);
    std::map<int32_t, double> areas = regionAreas(host);
    const std::map<int32_t, double>& want = expected.at(stem);
    std::set<std::string> shown;
    ASSERT_EQ(areas.size(), want.size()) << stem;
    for (const auto& [input, area] : want) {
      ASSERT_TRUE(areas.count(input)) << stem << " shows no input " << input;
      if (area != kAny) {
        EXPECT_NEAR(areas[input], area, 1e-4) << stem << " " << input;
      }
      EXPECT_GT(areas[input], 0.05) << stem << " input " << input;
      shown.insert(host.valueAt("inputLayer" + std::to_string(input), 0).layer);
    }
    EXPECT_EQ(shown.size(), want.size()) << stem << ": two regions show the same picture";
  }
  // The inset's picture, scaled and moved, covers exactly its corner region.
  testsupport::InMemoryHost pip;
  for (const ParamEdit& edit : presetEdits(7, kWidth, kHeight, sources))
    pip.setValue(edit.id, edit.value);
  const float half = pip.number("inputFrameScale2") / 100 / 2;
  EXPECT_NEAR(pip.number("inputFrameTranslation2", 0) - half * kWidth, kWidth / 6, 0.01);
  EXPECT_NEAR(pip.number("inputFrameTranslation2", 1) + half * kHeight, kHeight / 2, 0.01);
  EXPECT_THROW(presetEdits(layoutPresets().size(), kWidth, kHeight, sources), std::out_of_range);
}

// The example scenes are what the Presets menu makes of their composition.
TEST(LayoutPresets, ExampleScenesHoldThePresets) {
  for (std::size_t index = 0; index < layoutPresets().size(); ++index) {
    std::string path = std::string(VELTRANE_SOURCE_DIR) + "/docs/examples/presets/" +
                       layoutPresets()[index].fileStem + ".json";
    veltrane_cli::Scene scene = veltrane_cli::loadScene(path);
    std::vector<std::string> sources{refhost::kNoLayer};
    for (const refhost::CompositionLayer& layer : scene.composition.layers)
      sources.push_back(layer.layer.guid);
    veltrane_cli::SceneEngineOptions options;
    options.modulePath = VELTRANE_MODULE_PATH;
    std::unique_ptr<refhost::Engine> engine = veltrane_cli::startScene(scene, std::move(options));
    for (const ParamEdit& edit :
         presetEdits(index, scene.composition.width, scene.composition.height, sources))
      EXPECT_TRUE(engine->valueAt(edit.id, 0) == edit.value) << path << ": " << edit.id;
    engine->finish();
  }
}

}  // namespace
}  // namespace veltrane_viewer
