// The split layouts: each layout's pictures land on the regions the module reports, framed at
// the smallest scale that covers them, and the names people give are understood.
#include "layouts/layouts.h"

#include <gtest/gtest.h>

#include <map>
#include <tuple>

#include "refhost/pipeline/frame_readback.h"
#include "scene/scene_document.h"
#include "scene/scene_engine.h"
#include "support/engine_fixture.h"

namespace veltrane_cli {
namespace {

constexpr int32_t kWidth = 320;
constexpr int32_t kHeight = 180;

std::string layerGuid(int input) {
  return "1a000000-0000-4000-8000-00000000000" + std::to_string(input + 1);
}

// Layer j is a solid colour of its own: red 20 * (j + 1).
uint8_t redOf(int input) { return static_cast<uint8_t>(20 * (input + 1)); }

// The module with nine solid layers, one per input, and no border.
std::unique_ptr<refhost::Engine> solidLayers() {
  auto engine = testsupport::startEngine({kWidth, kHeight, 25.0, 1.0f, 1, ""}, [](auto& engine) {
    for (int j = 0; j < 9; ++j)
      engine.addLayer(
          testsupport::solidLayer(layerGuid(j), kWidth, kHeight, {redOf(j), 0, 0, 255}));
  });
  engine->setParam("borderWidth", refhost::ParamValue::ofFloat(0));
  return engine;
}

refhost::RgbaImage rendered(refhost::Engine& engine, const std::vector<ParamEdit>& edits) {
  for (const ParamEdit& edit : edits) engine.setParam(edit.id, edit.value);
  std::unique_ptr<refhost::RenderFrame> frame = engine.render(0);
  return refhost::readBack(frame->context().output.id, kWidth, kHeight);
}

std::vector<std::pair<std::string, refhost::ParamValue>> settings(
    const std::vector<ParamEdit>& edits) {
  std::vector<std::pair<std::string, refhost::ParamValue>> values;
  for (const ParamEdit& edit : edits) values.emplace_back(edit.id, edit.value);
  return values;
}

// Every layout's pictures land on the regions the module reports, pixel for pixel, in the
// plan's order, and together they cover the frame.
TEST(Layouts, EachPictureCoversExactlyItsOwnRegion) {
  std::unique_ptr<refhost::Engine> engine = solidLayers();
  std::vector<std::string> sources;
  for (int j = 0; j < 9; ++j) sources.push_back(layerGuid(j));
  for (std::size_t index = 0; index < layouts().size(); ++index) {
    const LayoutInfo& layout = layouts()[index];
    SCOPED_TRACE(layout.name);
    const LayoutPlan plan = planLayout(index, kWidth, kHeight);
    const refhost::RegionMap map =
        engine->mapRegions(0, settings(cutEdits(plan, engine->vocabulary())));
    EXPECT_EQ(regionExtents(map).size(), static_cast<std::size_t>(layout.regions));
    const refhost::RgbaImage picture = rendered(*engine, layoutEdits(*engine, plan, sources));

    // The k-th input the plan shows takes layer k.
    std::map<int32_t, uint8_t> shows;
    for (std::size_t k = 0; k < plan.inputs.size(); ++k)
      shows[plan.inputs[k]] = redOf(static_cast<int>(k));
    int misplaced = 0;
    for (int y = 0; y < kHeight; ++y) {
      for (int x = 0; x < kWidth; ++x) {
        const int8_t input = map.inputs[static_cast<std::size_t>(y) * kWidth + x];
        ASSERT_GE(input, 0) << "the regions tile the frame: " << x << "," << y;
        const refhost::Rgba8 pixel = picture.pixel(x, y);
        misplaced += pixel[0] != shows[input] || pixel[3] != 255 ? 1 : 0;
      }
    }
    EXPECT_EQ(misplaced, 0);
  }
}

// The framing is the smallest that covers: the same pictures 3 % smaller leave part of a region
// uncovered (transparent black) in every layout but those whose pictures fill the frame anyway.
TEST(Layouts, FramingIsTheSmallestScaleThatCoversTheRegion) {
  std::unique_ptr<refhost::Engine> engine = solidLayers();
  const refhost::EffectVocabulary& roles = engine->vocabulary();
  std::vector<std::string> sources;
  for (int j = 0; j < 9; ++j) sources.push_back(layerGuid(j));
  for (const char* name : {"diagonal-2", "comic-3", "z-3", "grid-3x3", "radial-5"}) {
    SCOPED_TRACE(name);
    const LayoutPlan plan = planLayout(*findLayout(name), kWidth, kHeight);
    std::vector<ParamEdit> edits = layoutEdits(*engine, plan, sources);
    for (ParamEdit& edit : edits) {
      const auto input = roles.inputOf(edit.id);
      if (input && input->first == refhost::InputParam::Scale) edit.value.number[0] *= 0.97f;
    }
    const refhost::RgbaImage picture = rendered(*engine, edits);
    int uncovered = 0;
    for (int y = 0; y < kHeight; ++y)
      for (int x = 0; x < kWidth; ++x) uncovered += picture.pixel(x, y)[3] == 0 ? 1 : 0;
    EXPECT_GT(uncovered, 0);
  }
  // A picture narrower than the frame (its own proportions kept) is scaled up to cover as well.
  const LayoutPlan halves = planLayout(*findLayout("vertical-2"), kWidth, kHeight);
  const std::vector<RegionExtent> regions =
      regionExtents(engine->mapRegions(0, settings(cutEdits(halves, roles))));
  ASSERT_EQ(regions.size(), 2u);
  const RegionExtent& left = regions[0].centroid[0] < 0 ? regions[0] : regions[1];
  const Framing framing = frameOnRegion(left, {kHeight * 9.0 / 16, kHeight});  // portrait
  const double covering = 100.0 * (kWidth / 2.0) / (kHeight * 9.0 / 16);
  EXPECT_NEAR(framing.translation[0], -kWidth / 4.0, 1e-4);
  EXPECT_GE(framing.scale, covering);  // kept to 4 decimals, rounded up to still cover
  EXPECT_NEAR(framing.scale, covering, 1e-4);
}

TEST(Layouts, NamesOptionsAndRefusals) {
  const std::pair<int, const char*> defaults[] = {
      {1, "diagonal-2"}, {2, "diagonal-2"}, {3, "comic-3"}, {4, "grid-2x2"},
      {5, "radial-5"},   {8, "radial-8"},   {9, "grid-3x3"}};
  for (const auto& [inputs, name] : defaults) {
    EXPECT_EQ(defaultLayoutFor(inputs), name) << inputs;
    EXPECT_TRUE(findLayout(name)) << name;
  }
  // A family's name without its count takes the layout for the number of pictures.
  const std::tuple<const char*, int, const char*> families[] = {
      {"diagonal", 2, "diagonal-2"}, {"radial", 5, "radial-5"},
      {"radial", 2, "radial-3"},     {"radial", 9, "radial-8"},
      {"slanted", 3, "slanted-3"},   {"grid", 3, "grid-2x2"},
      {"grid", 5, "grid-3x3"},       {"z", 3, "z-3"}};
  for (const auto& [family, pictures, name] : families)
    EXPECT_EQ(layouts()[findLayout(family, pictures).value()].name, std::string(name)) << family;
  EXPECT_FALSE(findLayout("zigzag", 2));
  EXPECT_THROW(planLayout(*findLayout("diagonal-2"), 320, 180, {0, 20.0, std::nullopt}),
               std::invalid_argument);
  EXPECT_THROW(planLayout(*findLayout("slanted-4"), 320, 180, {0, 200.0, std::nullopt}),
               std::invalid_argument);  // three columns of 200 do not fit across 320
  EXPECT_THROW(planLayout(*findLayout("grid-2x2"), 320, 180, {0, std::nullopt, Point{5, 5}}),
               std::invalid_argument);
  // A gap moves side-by-side cuts apart; an angle turns every cut about the centre.
  const LayoutPlan z = planLayout(*findLayout("z-3"), 320, 180, {0, 100.0, std::nullopt});
  EXPECT_NEAR(z.cuts[0].y - z.cuts[1].y, 100, 1e-9);
  const LayoutPlan turned =
      planLayout(*findLayout("vertical-2"), 320, 180, {30, std::nullopt, std::nullopt});
  EXPECT_DOUBLE_EQ(turned.cuts[0].degrees, 30);
  const LayoutPlan moved =
      planLayout(*findLayout("radial-3"), 320, 180, {0, std::nullopt, Point{40, -20}});
  EXPECT_EQ(moved.centre, (Point{40, -20}));
}

}  // namespace
}  // namespace veltrane_cli
