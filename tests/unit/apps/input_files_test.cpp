// Hostile and broken input files for the command line: each is refused with one line naming the
// file, the field where there is one and what was expected, never with a crash; whole numbers
// written with a zero fraction are taken where a whole number is expected.
#include <gtest/gtest.h>
#include <sys/resource.h>

#include <algorithm>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "cli_runner.h"

namespace {

const char kScene[] =
    R"({"width": 64, "height": 36, "fps": 25, "duration": 4, "source": {"pattern": "bars"}, )"
    R"("layers": [{"guid": "aaaaaaaa-0000-4000-8000-000000000001", "name": "A"}], )"
    R"("params": {"numberOfCuts": 2, "borderWidth": 3}})";

// kScene with the first `from` replaced by `to`.
std::string scene(const std::string& from, const std::string& to) {
  std::string text = kScene;
  return text.replace(text.find(from), from.size(), to);
}

std::string repeated(const std::string& text, int count) {
  std::string all;
  for (int i = 0; i < count; ++i) all += text;
  return all;
}

TEST(InputFiles, HostileFilesAreRefusedWithOneLineNamingTheField) {
  ScratchDirectory folder;
  std::filesystem::create_directory(folder.file("media"));
  std::filesystem::create_symlink("b.json", folder.file("a.json"));
  std::filesystem::create_symlink("a.json", folder.file("b.json"));
  writeText(folder.file("good.json"), kScene);
  const std::string deepArrays = repeated("[", 100000) + repeated("]", 100000);
  const std::string deepObjects = repeated("{\"x\": ", 100000) + "1" + repeated("}", 100000);
  struct Case {
    std::string text;  // the scene, or with an events file the events; none: `path` as it is
    std::string path, expected;
    bool events = false;
  };
  const std::string scenePath = folder.file("scene.json");
  const Case cases[] = {
      {scene("3}", "1e400}"), scenePath, "params.borderWidth: expected a number within the range"},
      {scene("\"borderWidth\"", "\"borderWidth\": 1, \"borderWidth\""), scenePath,
       "params.borderWidth: expected each key once in an object"},
      {scene("}],", "}, " + deepArrays + "],"), scenePath,
       "layers[1]" + repeated("[0]", 62) + ": expected at most 64 levels"},
      {scene("{\"numberOfCuts", deepObjects + ", \"numberOfCuts"), scenePath,
       "params" + repeated(".x", 63) + ": expected at most 64 levels"},
      {scene("64", "64.5"), scenePath, "width: expected a whole number from 1 to 16384, got 64.5"},
      {scene("{\"pattern\": \"bars\"}", "{\"file\": \"a\\u0000b.png\"}"), scenePath,
       "source.file: expected a file name without NUL characters"},
      {scene("{\"pattern\": \"bars\"}", "{\"file\": \"media\"}"), scenePath,
       "source.file: expected an image or video file (relative to the scene file; " +
           folder.file("media") + " is a directory)"},
      {kScene + std::string(std::size_t{16} << 20, ' '), scenePath, "is larger than 16 MiB"},
      {"", folder.file("media"), "is a directory; expected a JSON file"},
      {"", folder.file("a.json"), "cannot be read (Too many levels of symbolic links)"},
      {R"({"events": [{"press": [1, 2]}, {"move": [-1e999, 0]}]})", folder.file("events.json"),
       "events[1].move[0]: expected a number within the range of a double", true},
  };
  for (const Case& c : cases) {
    if (!c.text.empty()) writeText(c.path, c.text);
    std::vector<std::string> args =
        c.events
            ? std::vector<std::string>{"interact", folder.file("good.json"), "--events", c.path,
                                       "-o",       folder.file("out.json")}
            : std::vector<std::string>{"render", c.path, "-o", folder.file("out.png")};
    CliRun run = runCli(args, VELTRANE_MODULE_PATH);
    EXPECT_EQ(run.status, 1) << run.err;
    EXPECT_EQ(run.err.rfind("veltrane " + args[0] + ": " + c.path + ": " + c.expected, 0), 0u)
        << run.err;
    EXPECT_EQ(run.err.find('\n'), run.err.size() - 1) << run.err;
  }
}

TEST(InputFiles, WholeNumbersWithAZeroFractionAreTaken) {
  ScratchDirectory folder;
  writeText(folder.file("scene.json"),
            scene("\"numberOfCuts\": 2", "\"numberOfCuts\": 2e0, \"cutType\": 1.0"));
  writeText(folder.file("events.json"), R"({"hostId": 3000.0, "events": [{"keyDown": 65505.0}]})");
  CliRun run = runCli({"interact", folder.file("scene.json"), "--events",
                       folder.file("events.json"), "-o", folder.file("result.json")},
                      VELTRANE_MODULE_PATH);
  ASSERT_EQ(run.status, 0) << run.err;
  nlohmann::json result = nlohmann::json::parse(slurp(folder.file("result.json")));
  EXPECT_EQ(result["params"]["numberOfCuts"], 2);
  EXPECT_EQ(result["params"]["cutType"], "Radial");
  EXPECT_EQ(result["results"][0][0]["message"], 1007);
}

// AddressSanitizer maps terabytes of shadow memory at start-up, so an address-space limit
// cannot apply to a sanitized command line; the sanitized build leaves this case out.
#ifndef __SANITIZE_ADDRESS__
TEST(InputFiles, RunningOutOfMemoryNamesTheSceneAndItsFrameSize) {
  ScratchDirectory folder;
  writeText(folder.file("huge.json"), R"({"width": 16384, "height": 16384, "fps": 25,)"
                                      R"( "duration": 1, "source": {"color": [1, 0, 0]}})");
  // The spawned command line inherits the limit; this process takes its own back at once.
  rlimit saved{};
  getrlimit(RLIMIT_AS, &saved);
  rlimit limited{std::min<rlim_t>(saved.rlim_max, rlim_t{2500} << 20), saved.rlim_max};
  setrlimit(RLIMIT_AS, &limited);
  CliRun run = runCli({"render", folder.file("huge.json"), "-o", folder.file("huge.png")},
                      VELTRANE_MODULE_PATH);
  setrlimit(RLIMIT_AS, &saved);
  EXPECT_EQ(run.status, 1);
  EXPECT_NE(run.err.find("veltrane render: " + folder.file("huge.json") +
                         ": width, height: not enough memory for frames of 16384x16384; "
                         "expected a smaller frame size\n"),
            std::string::npos)
      << run.err;
}
#endif

}  // namespace
