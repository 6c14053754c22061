// What `veltrane interact` reports of the viewer after each event: the selected input and
// whether the pointer hovers over its region, and the undo step a script leaves open.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"

namespace {

using nlohmann::json;

TEST(InteractViewerState, SelectionHoverAndTheOpenStepFollowTheEvents) {
  ScratchDirectory folder;
  // The default single Local cut runs diagonally through the centre; (40, 150) lies in the
  // region above it, (-50, -50) outside the frame.
  writeText(folder.file("scene.json"), R"({"width": 320, "height": 180, "fps": 25, "duration": 1,)"
                                       R"( "source": {"pattern": "checker"}})");
  const json events = json::array({{{"move", {40, 150}}},
                                   {{"press", {40, 150}}},
                                   {{"release", {40, 150}}},
                                   {{"move", {-50, -50}}},
                                   {{"keyDown", "Escape"}},
                                   {{"keyUp", "Escape"}},
                                   {{"press", {40, 150}}}});
  writeText(folder.file("events.json"), json{{"events", events}}.dump());
  CliRun run =
      runCli({"interact", folder.file("scene.json"), "--events", folder.file("events.json"), "-o",
              folder.file("result.json"), "--plugin", VELTRANE_MODULE_PATH});
  ASSERT_EQ(run.status, 0) << run.err;
  json result = json::parse(slurp(folder.file("result.json")));

  // The last press opened a move that no release closed; its name numbers the pressed input.
  const std::string open = result["openUndoStep"].get<std::string>();
  ASSERT_EQ(open.rfind("Moved Split Screen Input ", 0), 0u) << open;
  const int input = open.back() - '0';
  EXPECT_EQ(result["selectedInputs"],
            json::array({nullptr, input, input, input, input, nullptr, input}));
  EXPECT_EQ(result["hover"], json::array({false, true, true, false, false, false, true}));
  // The probes that learn this are not among the events' messages.
  EXPECT_EQ(result["results"][0], json::array({{{"message", 1004}, {"result", 1}}}));
}

}  // namespace
