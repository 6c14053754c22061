// The `veltrane` command line run as a process: bad input gives one clear stderr line and a
// non-zero status; `info` reports the built module's registration and panel.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <link.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"

namespace {

std::string mathLibraryPath() {
  void* handle = dlopen("libm.so.6", RTLD_NOW);
  link_map* map = nullptr;
  if (!handle || dlinfo(handle, RTLD_DI_LINKMAP, &map) != 0 || !map) return "";
  return map->l_name;
}

TEST(InfoCommand, BadInputGivesOneLineAndAFailingStatus) {
  const std::string notALibrary = std::string(VELTRANE_SOURCE_DIR) + "/CMakeLists.txt";
  const std::string libm = mathLibraryPath();
  struct Case {
    std::vector<std::string> args;
    const char* plugin;
    std::string expected;  // part of the one stderr line
  };
  const Case cases[] = {
      {{"info", "--plugin", "/nonexistent/veltrane.so"},
       nullptr,
       "'/nonexistent/veltrane.so': No such file"},
      {{"info", "--plugin", notALibrary}, nullptr, "not a loadable shared library"},
      {{"info", "--plugin", libm}, nullptr, "does not export PluginInfo"},
      {{"info"}, "/nonexistent/from-env.so", "'/nonexistent/from-env.so'"},
      {{"info", "--frobnicate"}, nullptr, "unknown option '--frobnicate'"},
      {{"info", "--host-id", "12x"},
       nullptr,
       "'--host-id' expects a whole number (32-bit), got '12x'"},
      {{"info", "--host-id", "4294967296"}, nullptr, "got '4294967296'"},
      {{"info", "--host-id"}, nullptr, "'--host-id' needs a value"},
      {{"info", "stray"}, nullptr, "unexpected argument 'stray'"},
      {{"render-everything"}, nullptr, "unknown command 'render-everything'"},
  };
  for (const Case& c : cases) {
    CliRun run = runCli(c.args, c.plugin);
    std::string where = c.args.back();
    EXPECT_GT(run.status, 0) << where;  // exited by itself, with failure
    EXPECT_TRUE(run.out.empty()) << where;
    EXPECT_NE(run.err.find(c.expected), std::string::npos) << where << ": " << run.err;
    EXPECT_EQ(run.err.find('\n'), run.err.size() - 1) << where << ": " << run.err;
  }
}

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
TEST(InfoCommand, JsonReportsTheDeclaredPanel) {
  CliRun run = runCli({"info", "--json", "--plugin", VELTRANE_MODULE_PATH, "--host-id", "6001"});
  ASSERT_EQ(run.status, 0) << run.err;
  nlohmann::json document = nlohmann::json::parse(run.out);
  EXPECT_EQ(document["registration"]["version"], "1.2.0.0");
  std::vector<nlohmann::json> params;
  int groups = 0;
  flatten(document["panel"]["items"], params, groups);
  ASSERT_EQ(params.size(), 69u);
  EXPECT_EQ(groups, 20);
  EXPECT_EQ(document["panel"]["parameterCount"], 69);
  EXPECT_EQ(params[2]["id"], "numberOfCuts");
  EXPECT_EQ(params[2]["minimum"], 1);
  EXPECT_EQ(params[2]["maximum"], 8);
  EXPECT_EQ(params[21]["displayName"], "Layer 0");  // numbered for this host
}

TEST(InfoCommand, TextFindsTheModuleFromTheEnvironment) {
  CliRun run = runCli({"info"}, VELTRANE_MODULE_PATH);
  ASSERT_EQ(run.status, 0) << run.err;
  EXPECT_NE(run.out.find("Veltrane {split-screen}"), std::string::npos);
  EXPECT_NE(run.out.find("Parameters: 69 in 20 groups"), std::string::npos);
  EXPECT_NE(run.out.find("[Input Layers/Frames]"), std::string::npos);
  EXPECT_TRUE(run.err.empty()) << run.err;
}

}  // namespace
