// The examples the documentation shows are what the commands give: the event script's result and
// every layout's preset scene.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <nlohmann/json.hpp>
#include <regex>
#include <string>
#include <vector>

#include "cli_runner.h"
#include "commands/split_scene.h"
#include "layouts/layouts.h"

namespace {

using nlohmann::json;

const std::string kDocs = std::string(VELTRANE_SOURCE_DIR) + "/docs/";

// The ```json blocks of a Markdown file, in order.
std::vector<std::string> jsonBlocks(const std::string& markdown) {
  std::vector<std::string> blocks;
  const std::string open = "```json\n";
  for (std::size_t at = markdown.find(open); at != std::string::npos;
       at = markdown.find(open, at)) {
    at += open.size();
    const std::size_t end = markdown.find("```", at);
    blocks.push_back(markdown.substr(at, end - at));
    at = end;
  }
  return blocks;
}

TEST(DocumentedExamples, TheEventScriptsResultIsWhatInteractGives) {
  ScratchDirectory folder;
  const std::string script = kDocs + "examples/events/move-input.json";
  CliRun run = runCli({"interact", kDocs + "examples/demo.json", "--events", script, "-o",
                       folder.file("result.json")});
  ASSERT_EQ(run.status, 0) << run.err;
  json result = json::parse(slurp(folder.file("result.json")));
  EXPECT_EQ(result, json::parse(slurp(kDocs + "examples/events/move-input.result.json")))
      << "run scripts/examples to write the example's result anew";

  const std::vector<std::string> blocks = jsonBlocks(slurp(kDocs + "events-format.md"));
  ASSERT_GE(blocks.size(), 2u);
  EXPECT_EQ(json::parse(blocks[0]), json::parse(slurp(script)));
  result.erase("params");
  EXPECT_EQ(json::parse(blocks[1]), result);
}

// Each preset scene is what split makes now of the generated pictures scripts/examples gives it
// (its description names the layout and the number of pictures), and there is one for every
// layout, so that the documented scenes cannot fall behind the layouts.
TEST(DocumentedExamples, EveryLayoutsPresetSceneIsWhatSplitMakes) {
  const std::vector<std::string> pictures{"pattern:counter",  "pattern:bars", "pattern:checker",
                                          "pattern:gradient", "color:1a8c99", "color:f2a626",
                                          "color:80408c",     "color:668c33", "color:4d5973"};
  std::vector<std::string> presets;
  for (const auto& entry : std::filesystem::directory_iterator(kDocs + "examples/presets")) {
    presets.push_back(entry.path().stem().string());
    SCOPED_TRACE(entry.path().string());
    const json saved = json::parse(slurp(entry.path().string()));
    std::smatch made;
    const std::string description = saved.at("description");
    ASSERT_TRUE(std::regex_match(description, made,
                                 std::regex("veltrane split of ([0-9]) clips, layout (.+)")));
    EXPECT_EQ(made[2], presets.back());

    veltrane_cli::SplitRequest request;
    request.clips.assign(pictures.begin(), pictures.begin() + std::stoi(made[1]));
    request.layout = made[2];
    request.size = std::array<int32_t, 2>{640, 360};
    request.fps = refhost::FrameRate{25, 1};
    request.border = veltrane_cli::BorderSetting{4, {1, 1, 1}, 1};
    const json fresh =
        json::parse(veltrane_cli::buildSplitScene(request, VELTRANE_MODULE_PATH).document.dump());
    EXPECT_EQ(saved, fresh) << "run scripts/examples to make the presets anew";
  }
  std::sort(presets.begin(), presets.end());
  std::vector<std::string> layouts;
  for (const veltrane_cli::LayoutInfo& layout : veltrane_cli::layouts()) {
    layouts.push_back(layout.name);
  }
  std::sort(layouts.begin(), layouts.end());
  EXPECT_EQ(presets, layouts);
}

}  // namespace
