// Projects laid out as Kdenlive and Shotcut save them, rendered by melt as both editors
// render, against `veltrane split` of the same clips: the layouts, their framing and the
// tracks a composition shows are the ones split uses.
#include <gtest/gtest.h>

#include <fstream>
#include <regex>
#include <sstream>

#include "melt_runs.h"

namespace mlttest {
namespace {

constexpr int kTolerance = 2;

std::string readFile(const std::string& path) {
  std::ifstream file(path);
  std::stringstream text;
  text << file.rdbuf();
  return text.str();
}

// A 2x2 grid of four tracks from one composition whose layout turns from 0 to 30 degrees over
// the 20 frames. Split numbers the grid's pictures from its last region: the upper track (the
// own source), the lower, then the tracks Kdenlive calls V2 and V1.
TEST(EditorProjects, KdenliveGridOfFourTracksWithATurningLayout) {
  MeltRun melt = runMelt(document("kdenlive_grid.kdenlive"));
  EXPECT_TRUE(melt.bridgeLines().empty()) << melt.log;
  ASSERT_EQ(melt.frames.size(), std::size_t(kFrames));
  const Clips& c = clips();
  for (int frame : {0, 10, kFrames - 1}) {
    SCOPED_TRACE("frame " + std::to_string(frame));
    const double angle = 30.0 * frame / (kFrames - 1);
    std::vector<refhost::RgbaImage> reference = renderScene(splitScene(
        {c.upper, c.lower, c.third, c.fourth},
        {"--layout", "grid-2x2", "--angle", std::to_string(angle), "--border", "3,white"}));
    ASSERT_EQ(reference.size(), std::size_t(kFrames));
    EXPECT_LE(largestDifference(melt.frames[frame], reference[frame]), kTolerance);
  }
}

// The filter on Shotcut's Output track with every setting its panel gives a new filter: the
// first two tracks split along the diagonal, each framed on its region.
TEST(EditorProjects, ShotcutOutputFilterSplitsTwoTracksFromThePanelsSettings) {
  const std::string panel = readFile(VELTRANE_MLT_DATA "/veltrane/ui.qml");
  const std::regex setting(R"(\{name: '(\w+)'.*?fallback: '([^']*)')");
  std::string properties;
  int settings = 0;
  for (std::sregex_iterator at(panel.begin(), panel.end(), setting), end; at != end; ++at) {
    properties += "<property name=\"" + (*at)[1].str() + "\">" + (*at)[2].str() + "</property>";
    ++settings;
  }
  ASSERT_GT(settings, 60);
  MeltRun melt = runMelt(document("shotcut_split.mlt", {{"@PROPERTIES@", properties}}));
  EXPECT_TRUE(melt.bridgeLines().empty()) << melt.log;
  const Clips& c = clips();
  std::vector<refhost::RgbaImage> reference = renderScene(
      splitScene({c.upper, c.lower}, {"--layout", "diagonal-2", "--border", "2,black"}));
  ASSERT_EQ(melt.frames.size(), reference.size());
  for (std::size_t frame = 0; frame < reference.size(); ++frame)
    EXPECT_LE(largestDifference(melt.frames[frame], reference[frame]), kTolerance)
        << "frame " << frame;
}

}  // namespace
}  // namespace mlttest
