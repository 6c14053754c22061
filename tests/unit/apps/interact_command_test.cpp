// `veltrane interact` end to end through the real module: a scripted drag moves a cut in one
// undo step, the layer menu assigns the picked layer, and whole numbers may have a fraction.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "cli_runner.h"
#include "host/wisp_protocol.h"
#include "refhost/media/image_files.h"

namespace {

using nlohmann::json;

// 320x180; the default single Local cut runs through the centre at 225 degrees, i.e. along the
// diagonal through corner-space points (160, 90) and (190, 120).
const char kScene[] = R"({
  "width": 320, "height": 180, "fps": 25, "duration": 10,
  "source": {"pattern": "checker"},
  "layers": [{"guid": "aaaaaaaa-0000-4000-8000-000000000001", "name": "A",
              "source": {"pattern": "bars"}}],
  "params": {"borderWidth": 4, "borderColor": [1, 0.5, 0]}
})";

struct Interaction {
  CliRun run;
  json result;
};

Interaction interact(const ScratchDirectory& folder, const json& events,
                     const std::vector<std::string>& more = {}, const std::string& scene = kScene) {
  writeText(folder.file("scene.json"), scene);
  writeText(folder.file("events.json"), events.dump());
  std::vector<std::string> args{"interact", folder.file("scene.json"),
                                "--events", folder.file("events.json"),
                                "-o",       folder.file("result.json")};
  args.insert(args.end(), more.begin(), more.end());
  Interaction interaction{runCli(args), json()};
  if (interaction.run.status == 0)
    interaction.result = json::parse(slurp(folder.file("result.json")));
  return interaction;
}

json message(int number, int result) { return {{"message", number}, {"result", result}}; }

TEST(InteractCommand, DraggingACutLineMovesItInOneUndoStep) {
  const json drag = json::parse(R"([{"move": [190, 120]}, {"press": [190, 120]},
      {"move": [200, 110]}, {"move": [210, 100]}, {"release": [210, 100]}])");
  ScratchDirectory folder;
  Interaction done = interact(folder, {{"events", drag}}, {"--overlay", folder.file("overlay")});
  ASSERT_EQ(done.run.status, 0) << done.run.err;
  const json& result = done.result;
  // Pressed on the line, the position jumps to the pressed point and follows the pointer:
  // it ends under the release point, (210, 100) - (160, 90) in frame space.
  EXPECT_NEAR(result["params"]["cutPosition_0"][0].get<double>(), 50.0, 0.5);
  EXPECT_NEAR(result["params"]["cutPosition_0"][1].get<double>(), 10.0, 0.5);
  EXPECT_EQ(result["params"]["cutDirection_0"], 225);
  EXPECT_EQ(result["undoSteps"], json::array({"Split Screen Cut 1 Position"}));
  EXPECT_EQ(result["cursors"].size(), 5u);
  EXPECT_EQ(result["results"][1][0], message(kMessagePointerPress, kResultDone));
  const json changed = {
      {"message", kMessageParameterChanged}, {"param", "cutPosition_0"}, {"result", kResultDone}};
  EXPECT_EQ(result["results"][2],
            json::array({message(kMessagePointerMove, kResultDone), changed}));
  EXPECT_EQ(result["results"][4][0], message(kMessagePointerRelease, kResultDone));

  // One picture per event, the last showing the cut where it was dragged.
  std::vector<std::string> pictures;
  for (int i = 0; i < 5; ++i) pictures.push_back("event_000" + std::to_string(i) + ".png");
  EXPECT_EQ(folder.entries(),
            (std::vector<std::string>{"events.json", "overlay", "result.json", "scene.json"}));
  std::vector<std::string> written;
  for (const auto& entry : std::filesystem::directory_iterator(folder.file("overlay")))
    written.push_back(entry.path().filename().string());
  std::sort(written.begin(), written.end());
  EXPECT_EQ(written, pictures);
  refhost::RgbaImage first = refhost::readImageFile(folder.file("overlay/" + pictures.front()));
  refhost::RgbaImage last = refhost::readImageFile(folder.file("overlay/" + pictures.back()));
  EXPECT_EQ(first.width, 320);
  EXPECT_NE(first.pixels, last.pixels);

  // Undone, the cut is back and the host reports the change; redo is offered.
  json undone = drag;
  undone.push_back({{"undo", 1}});
  ScratchDirectory again;
  Interaction back = interact(again, {{"events", undone}});
  ASSERT_EQ(back.run.status, 0) << back.run.err;
  EXPECT_EQ(back.result["params"]["cutPosition_0"], json::array({0, 0}));
  EXPECT_EQ(back.result["undoSteps"], json::array());
  EXPECT_EQ(back.result["redoSteps"], json::array({"Split Screen Cut 1 Position"}));
  EXPECT_EQ(back.result["results"][5], json::array({changed}));
}

// Also what the result says of the viewer after each event: the selected input, whether the
// pointer hovers over its region, and the undo step a script leaves open.
TEST(InteractCommand, LayerMenuAssignsThePickedLayerToTheSelectedInput) {
  const json events = json::parse(R"([{"press": [40, 150]}, {"release": [40, 150]}, {"pick": 1},
      {"layerMenu": true}, {"keyDown": "Escape"}, {"keyUp": "Escape"}, {"layerMenu": true},
      {"move": [-50, -50]}, {"press": [40, 150]}])");
  ScratchDirectory folder;
  Interaction done = interact(folder, {{"events", events}});
  ASSERT_EQ(done.run.status, 0) << done.run.err;
  const json& result = done.result;
  // The own layer comes first, so item 1 is layer A; it lands on the pressed region's input.
  EXPECT_EQ(result["popupMenus"], json::array({"Split Screen|A"}));
  // The last press was never released: its move is the step left open. The first click moved
  // nothing, so it left no step.
  const std::string moved = result["openUndoStep"].get<std::string>();
  ASSERT_EQ(moved.rfind("Moved Split Screen Input ", 0), 0u) << moved;
  EXPECT_EQ(result["undoSteps"], json::array());
  const std::string input = moved.substr(moved.size() - 1);
  for (int j = 0; j < 9; ++j) {
    std::string id = "inputLayer" + std::to_string(j);
    EXPECT_EQ(result["params"][id],
              std::to_string(j) == input ? kLayerA : "00000000-0000-0000-0000-000000000000")
        << id;
  }
  EXPECT_EQ(result["results"][2], json::array());  // a pick sends nothing
  EXPECT_EQ(result["results"][3][0], message(kMessagePointerOverSelection, kResultDone));
  EXPECT_EQ(result["results"][3][1], message(kMessagePickLayer, kResultDone));
  EXPECT_EQ(result["results"][4], json::array({message(kMessageKeyDown, kResultDone)}));
  EXPECT_EQ(result["results"][5], json::array({message(kMessageKeyUp, kResultDone)}));
  // Escape deselected the input: the host no longer offers the menu.
  EXPECT_EQ(result["results"][6],
            json::array({message(kMessagePointerOverSelection, kResultNotDone)}));
  const int n = std::stoi(input);
  EXPECT_EQ(result["selectedInputs"], json::array({n, n, n, n, n, nullptr, nullptr, nullptr, n}));
  EXPECT_EQ(result["hover"],
            json::array({true, true, true, true, true, false, false, false, true}));
}

// Whole numbers may have a zero fraction; a Radial layout never shows input 0, and a scene that
// sets it is told so once, and still runs.
TEST(InteractCommand, WholeNumbersMayHaveAFractionAndInputZeroOfARadialSceneIsNoted) {
  json scene = json::parse(kScene);
  scene["params"]["numberOfCuts"] = 2.0;
  scene["params"]["cutType"] = 1.0;
  scene["params"]["inputFrameScale0"] = 50;
  const json events = {
      {"hostId", static_cast<double>(kHostProductTouch)},
      {"events", json::array({{{"keyDown", static_cast<double>(kKeyLeftShift)}}})}};
  ScratchDirectory folder;
  Interaction done = interact(folder, events, {}, scene.dump());
  ASSERT_EQ(done.run.status, 0) << done.run.err;
  EXPECT_EQ(done.result["params"]["numberOfCuts"], 2);
  EXPECT_EQ(done.result["params"]["cutType"], "Radial");
  EXPECT_EQ(done.result["results"][0][0]["message"], kMessageKeyDown);
  const std::string note = "params.inputFrameScale0: a Radial layout never shows input 0";
  EXPECT_NE(done.run.err.find(note), std::string::npos) << done.run.err;
  scene["params"]["cutType"] = "Local";
  ScratchDirectory again;
  Interaction local = interact(again, {{"events", json::array()}}, {}, scene.dump());
  ASSERT_EQ(local.run.status, 0) << local.run.err;
  EXPECT_EQ(local.run.err.find(note), std::string::npos) << local.run.err;
}

}  // namespace
