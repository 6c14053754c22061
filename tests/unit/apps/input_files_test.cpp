// Hostile and broken input files for the command line: each is refused with one line naming the
// file, the field where there is one and what was expected, never with a crash; whole numbers
// written with a zero fraction are taken where a whole number is expected.
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "cli_runner.h"

namespace {

using nlohmann::json;

// 64x36, two Local cuts, one extra layer; dumped on one line so cases can edit its text.
const char kScene[] =
    R"({"width": 64, "height": 36, "fps": 25, "duration": 4, "source": {"pattern": "bars"}, )"
    R"("layers": [{"guid": "aaaaaaaa-0000-4000-8000-000000000001", "name": "A"}], )"
    R"("params": {"numberOfCuts": 2, "borderWidth": 3}})";

std::string replaced(std::string text, const std::string& from, const std::string& to) {
  std::string::size_type at = text.find(from);
  EXPECT_NE(at, std::string::npos) << from;
  return at == std::string::npos ? text : text.replace(at, from.size(), to);
}

std::string nested(const std::string& open, const std::string& inner, const std::string& close,
                   int depth) {
  std::string text;
  for (int i = 0; i < depth; ++i) text += open;
  text += inner;
  for (int i = 0; i < depth; ++i) text += close;
  return text;
}

TEST(InputFiles, HostileFilesAreRefusedWithOneLineNamingTheField) {
  ScratchDirectory folder;
  std::filesystem::create_directory(folder.file("media"));
  std::filesystem::create_symlink("loop_b.json", folder.file("loop_a.json"));
  std::filesystem::create_symlink("loop_a.json", folder.file("loop_b.json"));
  writeText(folder.file("good.json"), kScene);
  const std::string big(std::size_t{16} << 20, ' ');
  struct Case {
    const char* name;
    std::string sceneText;   // written to the scene file unless empty
    std::string eventsText;  // written to an events file (and interact run) unless empty
    std::string path;        // the file the message names
    std::string expected;    // after "<path>: "
  };
  const std::string scene = folder.file("scene.json");
  const std::string events = folder.file("events.json");
  const Case cases[] = {
      {"overflow", replaced(kScene, "3}", "1e400}"), "", scene,
       "params.borderWidth: expected a number within the range of a double (magnitude below "
       "1.8e308), got 1e400"},
      {"duplicate key", replaced(kScene, "\"borderWidth\"", "\"borderWidth\": 1, \"borderWidth\""),
       "", scene, "params.borderWidth: expected each key once in an object"},
      {"duplicate in a layer", replaced(kScene, "\"name\": \"A\"", "\"name\": \"A\", \"name\": 1"),
       "", scene, "layers[0].name: expected each key once in an object"},
      {"deep arrays", replaced(kScene, "}], ", "}, " + nested("[", "", "]", 100000) + "], "), "",
       scene, "layers[1]" + nested("", "", "[0]", 62) + ": expected at most 64 levels"},
      {"deep objects",
       replaced(kScene, "{\"numberOfCuts",
                nested("{\"x\": ", "1", "}", 100000) + ", \"numberOfCuts"),
       "", scene, "params" + nested("", "", ".x", 63) + ": expected at most 64 levels"},
      {"fraction", replaced(kScene, "\"width\": 64", "\"width\": 64.5"), "", scene,
       "width: expected a whole number from 1 to 16384, got 64.5"},
      {"NUL in a path",
       replaced(kScene, "{\"pattern\": \"bars\"}", "{\"file\": \"a\\u0000b.png\"}"), "", scene,
       "source.file: expected a file name without NUL characters"},
      {"media directory", replaced(kScene, "{\"pattern\": \"bars\"}", "{\"file\": \"media\"}"), "",
       scene,
       "source.file: expected an image or video file (relative to the scene file; " +
           folder.file("media") + " is a directory)"},
      {"too large", kScene + big, "", scene, "is larger than 16 MiB"},
      {"scene is a directory", "", "", folder.file("media"),
       "is a directory; expected a JSON file"},
      {"symlink loop", "", "", folder.file("loop_a.json"),
       "cannot be read (Too many levels of symbolic links)"},
      {"events overflow", "", R"({"events": [{"press": [1, 2]}, {"move": [-1e999, 0]}]})", events,
       "events[1].move[0]: expected a number within the range of a double"},
      {"events file is a directory", "", "", folder.file("media"),
       "is a directory; expected a JSON file"},
  };
  for (const Case& c : cases) {
    bool interact = !c.eventsText.empty() || c.name == std::string("events file is a directory");
    if (!c.sceneText.empty()) writeText(scene, c.sceneText);
    if (!c.eventsText.empty()) writeText(events, c.eventsText);
    std::vector<std::string> args =
        interact
            ? std::vector<std::string>{"interact", folder.file("good.json"), "--events", c.path,
                                       "-o",       folder.file("out.json")}
            : std::vector<std::string>{"render", c.path, "-o", folder.file("out.png")};
    args.insert(args.end(), {"--plugin", VELTRANE_MODULE_PATH});
    CliRun run = runCli(args);
    std::string prefix = std::string("veltrane ") + args[0] + ": " + c.path + ": ";
    EXPECT_EQ(run.status, 1) << c.name << ": " << run.err;
    EXPECT_EQ(run.err.rfind(prefix + c.expected, 0), 0u) << c.name << ": " << run.err;
    EXPECT_EQ(run.err.find('\n'), run.err.size() - 1) << c.name << ": " << run.err;
  }
}

TEST(InputFiles, WholeNumbersWithAZeroFractionAreTaken) {
  ScratchDirectory folder;
  std::string scene = replaced(replaced(kScene, "\"width\": 64", "\"width\": 64.0"),
                               "\"numberOfCuts\": 2", "\"numberOfCuts\": 2e0, \"cutType\": 1.0");
  writeText(folder.file("scene.json"), scene);
  writeText(folder.file("events.json"),
            R"({"hostId": 3000.0, "events": [{"move": [10.0, 20]}, {"keyDown": 65505.0}]})");
  CliRun run =
      runCli({"interact", folder.file("scene.json"), "--events", folder.file("events.json"), "-o",
              folder.file("result.json"), "--plugin", VELTRANE_MODULE_PATH});
  ASSERT_EQ(run.status, 0) << run.err;
  json result = json::parse(slurp(folder.file("result.json")));
  EXPECT_EQ(result["params"]["numberOfCuts"], 2);
  EXPECT_EQ(result["params"]["cutType"], "Radial");
  EXPECT_EQ(result["results"][1][0], (json{{"message", 1007}, {"result", 0}}));
}

// AddressSanitizer maps terabytes of shadow memory at start-up, so an address-space limit
// cannot apply to a sanitized command line; the sanitized build leaves this case out.
#ifndef __SANITIZE_ADDRESS__
TEST(InputFiles, RunningOutOfMemoryNamesTheSceneAndItsFrameSize) {
  ScratchDirectory folder;
  writeText(folder.file("huge.json"),
            R"({"width": 16384, "height": 16384, "fps": 25, "duration": 1,)"
            R"( "source": {"color": [1, 0, 0]}})");
  rlimit saved{};
  getrlimit(RLIMIT_AS, &saved);
  rlimit limited = saved;
  limited.rlim_cur = std::min<rlim_t>(saved.rlim_max, rlim_t{2500} << 20);
  // The spawned command line inherits the limit; this process gets its own back at once.
  setrlimit(RLIMIT_AS, &limited);
  CliRun run = runCli({"render", folder.file("huge.json"), "-o", folder.file("huge.png"),
                       "--plugin", VELTRANE_MODULE_PATH});
  setrlimit(RLIMIT_AS, &saved);
  EXPECT_EQ(run.status, 1);
  EXPECT_EQ(run.err.substr(run.err.rfind("veltrane render: ")),
            "veltrane render: " + folder.file("huge.json") +
                ": width, height: not enough memory for frames of 16384x16384; expected a smaller "
                "frame size\n");
}
#endif

}  // namespace
