// What `veltrane interact` reports of the viewer after each event: the selected input and
// whether the pointer hovers over its region, and the undo step a script leaves open.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"

TEST(InteractViewerState, SelectionHoverAndTheOpenStepFollowTheEvents) {
  ScratchDirectory folder;
  // The default Local cut runs diagonally through the centre: (40, 150) lies in the region
  // above it, (-50, -50) outside the frame.
  writeText(folder.file("scene.json"), R"({"width": 320, "height": 180, "fps": 25,)"
                                       R"( "duration": 1, "source": {"pattern": "checker"}})");
  writeText(folder.file("events.json"),
            R"({"events": [{"move": [40, 150]}, {"press": [40, 150]}, {"release": [40, 150]},)"
            R"( {"move": [-50, -50]}, {"keyDown": "Escape"}, {"keyUp": "Escape"},)"
            R"( {"press": [40, 150]}]})");
  CliRun run = runCli({"interact", folder.file("scene.json"), "--events",
                       folder.file("events.json"), "-o", folder.file("result.json")},
                      VELTRANE_MODULE_PATH);
  ASSERT_EQ(run.status, 0) << run.err;
  const nlohmann::json result = nlohmann::json::parse(slurp(folder.file("result.json")));
  // The last press opened a move that no release closed; its name numbers the pressed input.
  const std::string open = result["openUndoStep"].get<std::string>();
  ASSERT_EQ(open.rfind("Moved Split Screen Input ", 0), 0u) << open;
  const int input = open.back() - '0';
  EXPECT_EQ(result["selectedInputs"],
            nlohmann::json::array({nullptr, input, input, input, input, nullptr, input}));
  EXPECT_EQ(result["hover"], nlohmann::json::array({false, true, true, false, false, false, true}));
  // The messages that learn this are not among the events' own.
  EXPECT_EQ(result["results"][0].size(), 1u);
}
