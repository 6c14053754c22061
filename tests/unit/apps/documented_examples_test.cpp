// The examples the documentation shows are what the commands give: the event script's result in
// docs/events-format.md and the file scripts/examples writes for it.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "cli_runner.h"

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

}  // namespace
