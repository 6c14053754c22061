// `veltrane info` run as a process: it reports the built module's registration and panel, as
// text or as JSON, and its help names every option.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"
#include "host/wisp_protocol.h"

namespace {

TEST(InfoCommand, HelpDescribesCommandsAndOptions) {
  CliRun top = runCli({"--help"});
  EXPECT_EQ(top.status, 0);
  EXPECT_NE(top.out.find("info"), std::string::npos);
  CliRun info = runCli({"info", "--help"});
  EXPECT_EQ(info.status, 0);
  for (const char* option : {"--plugin", "--host-id", "--json", "VELTRANE_PLUGIN"})
    EXPECT_NE(info.out.find(option), std::string::npos) << option;
}

// Every parameter of a panel tree, in declaration order, and the number of groups.
void flatten(const nlohmann::json& items, std::vector<nlohmann::json>& params, int& groups) {
  for (const auto& item : items) {
    if (item.contains("group")) {
      ++groups;
      flatten(item["items"], params, groups);
    } else {
      params.push_back(item);
    }
  }
}

// The panel's content is checked against the module's declaration elsewhere; here its form.
TEST(InfoCommand, ReportsTheDeclaredPanelAsJsonOrText) {
  CliRun run = runCli({"info", "--json", "--plugin", VELTRANE_MODULE_PATH, "--host-id",
                       std::to_string(kHostProductCompositorPreview)});
  ASSERT_EQ(run.status, 0) << run.err;
  nlohmann::json document = nlohmann::json::parse(run.out);
  EXPECT_EQ(document["registration"]["version"], "1.2.0.0");
  std::vector<nlohmann::json> params;
  int groups = 0;
  flatten(document["panel"]["items"], params, groups);
  ASSERT_EQ(params.size(), 69u);
  EXPECT_EQ(groups, 20);
  EXPECT_EQ(document["panel"]["parameterCount"], 69);
  EXPECT_EQ(params[2]["maximum"], 8);
  EXPECT_EQ(params[21]["displayName"], "Layer 0");  // numbered for this host

  // As text, with the module found through the environment.
  CliRun text = runCli({"info"});
  ASSERT_EQ(text.status, 0) << text.err;
  EXPECT_NE(text.out.find("Veltrane {split-screen}"), std::string::npos);
  EXPECT_NE(text.out.find("Parameters: 69 in 20 groups"), std::string::npos);
  EXPECT_NE(text.out.find("[Input Layers/Frames]"), std::string::npos);
  EXPECT_TRUE(text.err.empty()) << text.err;
}

}  // namespace
