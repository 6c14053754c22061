// The viewer's layout presets and "Fit pictures to regions" frame each picture as `veltrane
// split` does, at the picture's own proportions.
#include "viewer/viewer_session.h"

#include <gtest/gtest.h>

#include "commands/split_scene.h"
#include "refhost/media/image_files.h"
#include "support/temp_paths.h"

namespace veltrane_viewer {
namespace {

using nlohmann::ordered_json;

// The same values, numbers to the 4 decimals a split's scene keeps; a scene may leave the cut
// type at its default "Local" unsaid.
void expectSameValues(ordered_json actual, ordered_json expected) {
  for (ordered_json* params : {&actual, &expected})
    if (params->value("cutType", "Local") == "Local") params->erase("cutType");
  for (const auto& [id, value] : expected.items()) {
    SCOPED_TRACE(id);
    ASSERT_TRUE(actual.contains(id));
    const ordered_json numbers = value.is_array() ? value : ordered_json::array({value});
    const ordered_json got = actual[id].is_array() ? actual[id] : ordered_json::array({actual[id]});
    ASSERT_EQ(got.size(), numbers.size());
    for (std::size_t i = 0; i < numbers.size(); ++i) {
      if (numbers[i].is_number())
        EXPECT_NEAR(got[i].get<double>(), numbers[i].get<double>(), 1e-4);
      else
        EXPECT_EQ(got[i], numbers[i]);
    }
    actual.erase(id);
  }
  EXPECT_TRUE(actual.empty()) << "set besides: " << actual.dump();
}

class ViewerSessionFraming : public ::testing::Test {
 protected:
  void SetUp() override {
    refhost::writeImageFile(refhost::RgbaImage(320, 180, {200, 40, 40, 255}), wide_,
                            refhost::ImageFormat::Png);
    refhost::writeImageFile(refhost::RgbaImage(90, 160, {40, 40, 200, 255}), tall_,
                            refhost::ImageFormat::Png);
  }
  veltrane_cli::SplitScene split(const std::string& layout) const {
    veltrane_cli::SplitRequest request;
    request.clips = {wide_, tall_, wide_};
    request.layout = layout;
    return veltrane_cli::buildSplitScene(request, VELTRANE_MODULE_PATH);
  }

  testsupport::ScratchDirectory folder_;
  std::string wide_ = folder_.file("wide.png");
  std::string tall_ = folder_.file("tall.png");
};

TEST_F(ViewerSessionFraming, PresetsAndFittingFrameEachPictureAsSplitDoes) {
  const veltrane_cli::Scene scene = veltrane_cli::sceneFromJson(
      split("z-3").document, folder_.file("split.json"), folder_.path());
  ViewerSession session(scene, VELTRANE_MODULE_PATH, refhost::GlProfile::Core, nullptr, 0);

  const auto paramsOf = [&] {
    return veltrane_cli::savedScene(scene, session.engine().panel(), folder_.path())["params"];
  };
  // The split framed every picture on its region already: fitting them keeps the framing.
  session.fitPicturesToRegions();
  expectSameValues(paramsOf(), split("z-3").document["params"]);

  for (const char* layout : {"slanted-3", "comic-3", "radial-3"}) {
    SCOPED_TRACE(layout);
    session.applyPreset(*veltrane_cli::findLayout(layout));
    expectSameValues(paramsOf(), split(layout).document["params"]);
  }

  // After the cuts were moved by hand, fitting frames the pictures as a split with those cuts.
  session.editValue("cutDirection_0", refhost::ParamValue::ofFloat(100));
  session.finishEdit();
  session.fitPicturesToRegions();
  EXPECT_EQ(session.engine().undoStepNames().back(), "Fit pictures to regions");
  const ordered_json fitted = paramsOf();
  session.editValue("inputFrameScale1", refhost::ParamValue::ofFloat(100));
  session.finishEdit();
  session.fitPicturesToRegions();
  EXPECT_EQ(paramsOf(), fitted);
}

}  // namespace
}  // namespace veltrane_viewer
