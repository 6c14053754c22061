// `veltrane view` in a real window under Xvfb, driven by xdotool: gestures edit the scene, Ctrl+S
// saves it, and the window shows the render of what it saves with the handles over it.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "refhost/media/image_files.h"
#include "support/files.h"
#include "support/temp_paths.h"
#include "x_session.h"

namespace {

constexpr int kWidth = 320;
constexpr int kHeight = 180;

using testsupport::slurp;
using testsupport::writeText;

// The gradient makes every frame pixel different, so the frame is found on screen unambiguously.
const char kScene[] = R"({
  "width": 320, "height": 180, "fps": 25, "duration": 10,
  "source": {"pattern": "gradient"},
  "layers": [{"guid": "d3e00000-0000-4000-8000-000000000001", "name": "Bars",
              "source": {"pattern": "bars"}}],
  "params": {"cutDirection_0": 0}
})";

class ViewerWindow : public ::testing::Test {
 protected:
  void SetUp() override {
    writeText(scene_, kScene);
    viewer_ = std::make_unique<ChildProcess>(
        std::vector<std::string>{VELTRANE_CLI_PATH, "view", scene_, "--save-as", saved_, "--plugin",
                                 VELTRANE_MODULE_PATH},
        out_, dir_.file("err.txt"));
    x_.run({"xdotool", "search", "--sync", "--onlyvisible", "--name", "veltrane view"});
    // One frame pixel per screen pixel, so screen and render compare exactly.
    x_.run({"xdotool", "mousemove", "20", "10", "key", "1"});
    refhost::RgbaImage frame = render(scene_);
    ASSERT_TRUE(
        waitUntil([&] { return findPicture(x_.screenshot(dir_.path()), frame, 12, x0_, y0_); }, 60))
        << "the frame never showed at one pixel per pixel: " << slurp(dir_.file("err.txt"));
  }
  void TearDown() override {
    if (!viewer_) return;
    x_.run({"xdotool", "key", "ctrl+q"});
    EXPECT_EQ(viewer_->wait(30), 0) << slurp(dir_.file("err.txt"));
  }

  refhost::RgbaImage render(const std::string& scene) {
    std::string png = dir_.file("render.png");
    ChildProcess cli(
        {VELTRANE_CLI_PATH, "render", scene, "-o", png, "-y", "--plugin", VELTRANE_MODULE_PATH});
    EXPECT_EQ(cli.wait(60), 0);
    return refhost::readImageFile(png);
  }
  // Screen coordinates of a corner-space point (origin at the frame's bottom-left, y up).
  std::string sx(double x) const { return std::to_string(x0_ + static_cast<int>(x)); }
  std::string sy(double y) const { return std::to_string(y0_ + kHeight - static_cast<int>(y)); }
  // xdotool: `before`, a drag between two corner-space points through their middle, `after`.
  void drag(const std::vector<std::string>& before, double x, double y, double toX, double toY,
            const std::vector<std::string>& after = {}) {
    std::vector<std::string> args{"xdotool"};
    args.insert(args.end(), before.begin(), before.end());
    args.insert(args.end(),
                {"mousemove", sx(x), sy(y), "mousedown", "1", "mousemove", sx((x + toX) / 2),
                 sy((y + toY) / 2), "mousemove", sx(toX), sy(toY), "mouseup", "1"});
    args.insert(args.end(), after.begin(), after.end());
    x_.run(args);
  }
  void saveAndWait() {
    x_.run({"xdotool", "key", "ctrl+s"});
    ASSERT_TRUE(waitUntil([&] { return slurp(out_).find("saved") != std::string::npos; }, 30))
        << slurp(dir_.file("err.txt"));
  }
  // Whether the window's title is the file's name and, after it, " *" for unsaved changes.
  bool titled(const std::string& file, bool modified) {
    const std::string title = "^veltrane view - " + file + (modified ? " \\*" : "") + "$";
    return waitUntil(
        [&] {
          return ChildProcess({"xdotool", "search", "--name", title}).wait(10) == 0;
        },
        10);
  }

  testsupport::ScratchDirectory dir_;
  std::string scene_ = dir_.file("scene.json");
  std::string saved_ = dir_.file("saved.json");
  std::string out_ = dir_.file("out.txt");
  XSession x_;
  std::unique_ptr<ChildProcess> viewer_;
  int x0_ = 0;  // the frame's top-left corner on screen
  int y0_ = 0;
};

TEST_F(ViewerWindow, GesturesEditTheSceneAndCtrlSSavesItWithItsUndoHistory) {
  drag({}, 160, 60, 200, 60);                                            // the cut's line, sideways
  drag({"keydown", "Shift_L"}, 80, 150, 40, 150, {"keyup", "Shift_L"});  // insert a cut
  drag({}, 260, 120, 280, 100);                                          // input 0's picture
  // The layer picker: the menu opens at the pointer; its second item is the Bars layer.
  x_.run({"xdotool", "mousemove", sx(270), sy(40), "click", "3"});
  ASSERT_TRUE(waitUntil(
      [&] {
        refhost::Rgba8 p = x_.screenshot(dir_.path()).pixel(x0_ + 275, y0_ + kHeight - 40 + 5);
        return p[0] < 60 && p[1] < 60 && p[2] < 60;  // the menu's dark background
      },
      30));
  x_.run({"xdotool", "mousemove", sx(290), sy(40 - 31), "mousedown", "1", "sleep", "0.2", "mouseup",
          "1", "sleep", "0.2", "key", "ctrl+z"});
  saveAndWait();

  nlohmann::json params = nlohmann::json::parse(slurp(saved_))["params"];
  EXPECT_EQ(params, nlohmann::json::parse(R"({
      "numberOfCuts": 2, "cutPosition_0": [40, -30], "cutDirection_0": 0,
      "cutPosition_1": [-80, 60], "cutDirection_1": -90,
      "inputLayer0": "d3e00000-0000-4000-8000-000000000001"})"));
  EXPECT_NE(slurp(out_).find("undo history: \"Split Screen Cut 1 Position\", \"Inserting Cut\"; "
                             "undone: \"Moved Split Screen Input 0\""),
            std::string::npos)
      << slurp(out_);
}

TEST_F(ViewerWindow, ShowsTheRenderOfWhatItSavesWithTheHandlesOverIt) {
  drag({}, 160, 60, 200, 60);
  // Selecting input 0 shows its rectangle (the frame's edges) and its rotation handle above.
  x_.run({"xdotool", "mousemove", sx(260), sy(120), "click", "1", "mousemove",
          std::to_string(x0_ - 40), sy(90)});
  saveAndWait();
  refhost::RgbaImage expected = render(saved_);
  // Differing pixels by where they lie: at the cut's direction handle, at the input's rotation
  // handle (above the frame), along the frame's edges (the input's rectangle), elsewhere.
  int counts[4] = {};
  auto handlesWhereTheyAre = [&](const refhost::RgbaImage& screen) {
    std::fill(counts, counts + 4, 0);
    for (int y = 0; y < kHeight; ++y) {
      for (int x = 0; x < kWidth; ++x) {
        if (std::memcmp(screen.at(x0_ + x, y0_ + y), expected.at(x, y), 3) == 0) continue;
        double cx = x + 0.5, cy = kHeight - y - 0.5;
        ++counts[std::hypot(cx - 219, cy - 60) < 18                      ? 0
                 : std::hypot(cx - 160, cy - 190) < 18                   ? 1
                 : std::min({x, y, kWidth - 1 - x, kHeight - 1 - y}) < 5 ? 2
                                                                         : 3];
      }
    }
    return counts[3] == 0 && counts[0] > 20 && counts[2] > 200;
  };
  EXPECT_TRUE(waitUntil([&] { return handlesWhereTheyAre(x_.screenshot(dir_.path())); }, 30))
      << "direction handle " << counts[0] << ", rotation handle " << counts[1]
      << ", rectangle edges " << counts[2] << ", elsewhere " << counts[3];
}

// Unsaved changes are never closed without asking: Quit waits for the answer (Escape goes back),
// the title and status follow every save and edit, Save As moves where Save writes, and
// Discard closes without writing.
TEST_F(ViewerWindow, AsksBeforeClosingUnsavedChangesAndSaveAsMovesTheFile) {
  drag({}, 160, 60, 200, 60);
  EXPECT_TRUE(titled("saved.json", true));
  x_.run({"xdotool", "key", "ctrl+q", "sleep", "1", "key", "Escape"});
  EXPECT_EQ(viewer_->wait(1), -1) << "closed before the question was answered";
  const std::string other = dir_.file("other.json");
  x_.run({"xdotool", "key", "ctrl+shift+s", "sleep", "0.5", "type", other});
  x_.run({"xdotool", "key", "Return"});
  ASSERT_TRUE(waitUntil([&] { return slurp(out_).find("saved " + other) == 0; }, 30))
      << slurp(out_) << slurp(dir_.file("err.txt"));
  EXPECT_TRUE(titled("other.json", false));
  drag({}, 200, 60, 120, 60);
  EXPECT_TRUE(titled("other.json", true)) << "an edit after a save is unsaved again";
  x_.run({"xdotool", "key", "ctrl+q", "sleep", "1", "key", "d"});
  EXPECT_EQ(viewer_->wait(30), 0) << slurp(dir_.file("err.txt"));
  viewer_.reset();
  EXPECT_FALSE(std::filesystem::exists(saved_));
  EXPECT_EQ(nlohmann::json::parse(slurp(other))["params"]["cutPosition_0"],
            nlohmann::json::parse("[40, -30]"))
      << "the discarded edit is not in the file";
}

// A cut's direction handle can be grabbed at every zoom: a quarter turn dragged on the handle
// the overlay draws, at 50 %, 100 % and 200 % in turn, turns the cut three quarters and leaves
// its position where it was (a press the position control took would have moved the line).
TEST_F(ViewerWindow, DirectionHandlesCanBeGrabbedAtEveryZoom) {
  const int cx = x0_ + kWidth / 2, cy = y0_ + kHeight / 2;  // the cut's position on screen
  // The handle sits at a quarter turn from the cut's direction (at first 0, up the frame).
  double handle = 90;
  auto onScreen = [&](double degrees, double radius, std::vector<std::string>& args) {
    const double a = degrees * 3.14159265 / 180;
    args.insert(args.end(), {"mousemove", std::to_string(cx + std::lround(radius * std::sin(a))),
                             std::to_string(cy - std::lround(radius * std::cos(a)))});
  };
  for (const auto& [keys, zoom] : std::vector<std::pair<std::vector<std::string>, double>>{
           {{"1", "minus"}, 0.5}, {{"1"}, 1.0}, {{"1", "equal"}, 2.0}}) {
    std::vector<std::string> args{"xdotool", "mousemove", std::to_string(x0_ + 5),
                                  std::to_string(y0_ + 5)};
    for (const std::string& key : keys) args.insert(args.end(), {"key", key});
    args.insert(args.end(), {"sleep", "0.3"});
    // Where the handle is drawn: the UI scale the viewer hands the plug-in at this zoom.
    const double ui = std::max(1.0, (15.0 * zoom * zoom + 4.0) / 10.0);
    onScreen(handle, 10 * ui, args);
    args.insert(args.end(), {"mousedown", "1"});
    for (int step = 1; step <= 6; ++step) onScreen(handle - 15.0 * step, 10 * ui, args);
    args.insert(args.end(), {"mouseup", "1"});
    x_.run(args);
    handle -= 90;
  }
  saveAndWait();
  nlohmann::json params = nlohmann::json::parse(slurp(saved_))["params"];
  ASSERT_TRUE(params.contains("cutDirection_0")) << params;
  const double turned =
      std::fmod(std::fmod(params["cutDirection_0"].get<double>(), 360) + 360, 360);
  EXPECT_NEAR(turned, 90, 3) << params;
  EXPECT_FALSE(params.contains("cutPosition_0")) << params;
}

}  // namespace
