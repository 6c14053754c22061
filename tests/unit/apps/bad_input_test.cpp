// Bad input to every command, from a wrong option to a hostile file: one line naming the file,
// the field and what was expected, a failing status, nothing on stdout or disk; never a crash.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <link.h>
#include <sys/resource.h>

#include <algorithm>
#include <filesystem>

#include "cli_runner.h"

namespace {

std::string mathLibraryPath() {
  void* handle = dlopen("libm.so.6", RTLD_NOW);
  link_map* map = nullptr;
  if (!handle || dlinfo(handle, RTLD_DI_LINKMAP, &map) != 0 || !map) return "";
  return map->l_name;
}

std::string repeated(const std::string& text, int count) {
  std::string all;
  for (int i = 0; i < count; ++i) all += text;
  return all;
}

// The small scene's text with the first `from` replaced by `to`.
std::string spoiled(const std::string& from, const std::string& to) {
  std::string text = smallScene("bars").dump();
  return text.replace(text.find(from), from.size(), to);
}

std::string withParam(const std::string& field) {
  return spoiled("\"params\":{", "\"params\":{" + field + ",");
}

TEST(CommandLine, RefusesBadInputWithOneLineAndWritesNothing) {
  ScratchDirectory folder;
  std::filesystem::create_directory(folder.file("media"));
  std::filesystem::create_symlink("b.json", folder.file("a.json"));
  std::filesystem::create_symlink("a.json", folder.file("b.json"));
  writeText(folder.file("f"), "");
  const std::string scene = writeScene(folder, smallScene("bars"));
  writeText(folder.file("events.json"), R"({"events": []})");
  const std::string bad = folder.file("bad.json"), out = folder.file("out.mp4");
  const std::string deepArrays = repeated("[", 100000) + repeated("]", 100000);
  const std::string deepObjects = repeated("{\"x\": ", 100000) + "1" + repeated("}", 100000);
  const std::string notALibrary = std::string(VELTRANE_SOURCE_DIR) + "/CMakeLists.txt";
  struct Case {
    std::vector<std::string> args;
    int status;
    std::string line;          // how the one line on stderr starts
    std::string badText = "";  // written to bad.json first, when not empty
    const char* plugin = VELTRANE_MODULE_PATH;
  };
  // The line names the command first.
  auto refused = [&](const std::vector<std::string>& args, int status, const std::string& expected,
                     const std::string& badText = "", const char* plugin = VELTRANE_MODULE_PATH) {
    return Case{args, status, "veltrane " + args[0] + ": " + expected, badText, plugin};
  };
  auto badScene = [&](const std::string& text, const std::string& expected) {
    return refused({"render", bad, "-o", out}, 1, bad + ": " + expected, text);
  };
  auto badScript = [&](const std::string& text, const std::string& expected) {
    return refused({"interact", scene, "--events", bad, "-o", folder.file("r.json")}, 1,
                   bad + ": " + expected, text);
  };
  auto badRender = [&](const std::vector<std::string>& options, const std::string& expected) {
    std::vector<std::string> args{"render", scene};
    args.insert(args.end(), options.begin(), options.end());
    return refused(args, 2, expected);
  };
  const std::string unloadable = "cannot load plug-in module '";
  const std::string patterns = R"(expected one of "bars", "checker", "gradient", "counter")";
  const Case cases[] = {
      refused({"info", "--plugin", "/nonexistent/veltrane.so"}, 1,
              unloadable + "/nonexistent/veltrane.so': No such file or directory"),
      refused({"info", "--plugin", notALibrary}, 1, unloadable + notALibrary + "': not a loadable"),
      refused({"info", "--plugin", mathLibraryPath()}, 1,
              unloadable + mathLibraryPath() + "': it does not export PluginInfo"),
      refused({"info"}, 1, unloadable + "/nonexistent/from-env.so'", "",
              "/nonexistent/from-env.so"),
      refused({"info", "--frobnicate"}, 2, "unknown option '--frobnicate'"),
      refused({"info", "--host-id", "12x"}, 2,
              "option '--host-id' expects a whole number (32-bit), got '12x'"),
      refused({"info", "--host-id", "4294967296"}, 2,
              "option '--host-id' expects a whole number (32-bit), got '4294967296'"),
      refused({"info", "--host-id"}, 2, "option '--host-id' needs a value"),
      refused({"info", "stray"}, 2, "unexpected argument 'stray'"),
      {{"render-everything"}, 2, "veltrane: unknown command 'render-everything'"},
      badRender({}, "needs -o OUT"),
      badRender({"-o", folder.file("x.jpg")},
                "the output name ends in .png, .exr, .mp4, .mov, .mkv or .webm, or is a pattern "
                "with %04d ending in .png or .exr; got '" +
                    folder.file("x.jpg") + "'"),
      badRender({"-o", folder.file("x.png"), "--frames", "0-3"}, "a .png output holds one frame"),
      badRender({"-o", out, "--frames", "4-2"}, "option '--frames' expects A <= B, got '4-2'"),
      badRender({"-o", out, "--frames", "5-10"}, "frames 5-10 lie outside the scene's frames 0-9"),
      badRender({"-o", out, "--frame", "1", "--frames", "1-2"},
                "give --frame, --frames or --from/--to, not more than one"),
      badRender({"-o", out, "--profile", "es"},
                "option '--profile' expects core or compat, got 'es'"),
      refused({"interact", scene, "--events", folder.file("events.json"), "-o",
               folder.file("r.json"), "--overlay", folder.file("f")},
              2,
              "option '--overlay' expects a folder, '" + folder.file("f") +
                  "' is a file (see 'veltrane interact --help')"),
      badScene(spoiled(",\"width\":64", ""),
               "width: expected a whole number from 1 to 16384 (missing)"),
      badScene(spoiled("\"height\":36", "\"height\":\"36\""),
               "height: expected a whole number from 1 to 16384, got \"36\""),
      badScene(spoiled("\"width\":64", "\"width\":64.5"),
               "width: expected a whole number from 1 to 16384, got 64.5"),
      badScene(spoiled("\"fps\":25", "\"fps\":0"),
               "fps: expected a number from 0.001 to 1000, got 0"),
      badScene(spoiled("\"fps\":25", "\"fps\":25,\"colour\":1"), "colour: expected no such field"),
      badScene(spoiled("bars", "zebra"), "source.pattern: " + patterns),
      badScene(spoiled("{\"pattern\":\"bars\"}", "{\"color\":[1,0,0,2]}"),
               "source.color[3]: expected a number from 0 to 1, got 2"),
      badScene(spoiled("{\"pattern\":\"bars\"}", "{\"file\":\"missing.png\"}"),
               "source.file: expected an image or video file (relative to the scene file"),
      badScene(spoiled("{\"pattern\":\"bars\"}", "{\"file\":\"media\"}"),
               "source.file: expected an image or video file (relative to the scene file; " +
                   folder.file("media") + " is a directory)"),
      badScene(spoiled("{\"pattern\":\"bars\"}", "{\"file\":\"a\\u0000b.png\"}"),
               "source.file: expected a file name without NUL characters"),
      badScene(spoiled(kLayerA, "A"), "layers[0].guid: expected a GUID text"),
      badScene(
          spoiled("\"A\"}", "\"A\"},{\"guid\":\"" + std::string(kLayerA) + "\",\"name\":\"B\"}"),
          "layers[1].guid: expected a GUID no other layer"),
      badScene(spoiled("\"A\"}", "\"A\",\"placement\":[1,0,0,1]}"),
               "layers[0].placement: expected 16 numbers"),
      badScene(spoiled("\"A\"}", "\"A\"}," + deepArrays),
               "layers[1]" + repeated("[0]", 62) + ": expected at most 64 levels"),
      badScene(withParam("\"x\":" + deepObjects),
               "params" + repeated(".x", 63) + ": expected at most 64 levels"),
      badScene(withParam("\"nope\":1"),
               "params.nope: expected the id of a parameter the module declares"),
      badScene(withParam("\"numberOfCuts\":9"),
               "params.numberOfCuts: expected a whole number from 1 to 8, got 9"),
      badScene(spoiled("\"borderWidth\":0", "\"borderWidth\":-1"),
               "params.borderWidth: expected a number from 0 to 200, got -1"),
      badScene(spoiled("\"borderWidth\":0", "\"borderWidth\":1e400"),
               "params.borderWidth: expected a number within the range"),
      badScene(withParam("\"borderWidth\":1"),
               "params.borderWidth: expected each key once in an object"),
      badScene(withParam("\"cutType\":\"Diagonal\""),
               "params.cutType: expected one of \"Local\", \"Radial\" or an index from 0 to 1"),
      badScene(spoiled("[28,0]", "[1]"),
               "params.cutPosition_0: expected a point [x, y] in pixels, got [1]"),
      badScene(withParam("\"viewCutRegions\":1"),
               "params.viewCutRegions: expected true or false, got 1"),
      badScene(withParam("\"inputLayer1\":\"bbbbbbbb-0000-4000-8000-000000000001\""),
               "params.inputLayer1: expected a layer GUID of the scene or the null GUID"),
      badScene(spoiled("\"cutDirection_0\":0", "\"cutDirection_0\":{\"keys\":[[0,10],[0,20]]}"),
               "params.cutDirection_0.keys[1][0]: expected a frame no earlier key has"),
      badScene(withParam("\"inputFrameScale2\":{\"keys\":[[0,5000]]}"),
               "params.inputFrameScale2.keys[0][1]: expected a number from 1 to 1000, got 5000"),
      badScene("{\"width\": 64,", "not valid JSON"),
      badScene(smallScene("bars").dump() + std::string(std::size_t{16} << 20, ' '),
               "is larger than 16 MiB"),
      refused({"render", folder.file("media"), "-o", out}, 1,
              folder.file("media") + ": is a directory; expected a JSON file"),
      refused({"render", folder.file("a.json"), "-o", out}, 1,
              folder.file("a.json") + ": cannot be read (Too many levels of symbolic links)"),
      badScript(R"({"events": [{"poke": [1, 2]}]})", "events[0]: expected one event"),
      badScript(R"({"events": [{"press": [1.5, 3]}]})",
                "events[0].press[0]: expected a whole number"),
      badScript(R"({"events": [{"keyDown": "Ctrl"}]})",
                "events[0].keyDown: expected \"Shift\", \"Escape\" or a key number"),
      badScript(R"({"viewScale": [1], "events": []})", "viewScale: expected [sx, sy]"),
      badScript(R"({"view": 1, "events": []})", "view: expected no such field"),
      // The viewer reads its scene as render does, before it looks for a display.
      refused({"view", bad}, 1, bad + ": source.pattern: " + patterns, spoiled("bars", "zebra")),
      refused({"view", scene}, 1,
              "cannot open a window: no display (DISPLAY is not set); run it under a virtual X "
              "server, e.g. xvfb-run -a veltrane view SCENE.json\n"),
  };
  for (const Case& c : cases) {
    if (!c.badText.empty()) writeText(bad, c.badText);
    const std::vector<std::string> before = folder.entries();
    CliRun run = runCli(c.args, c.plugin);
    EXPECT_EQ(run.status, c.status) << c.line;
    EXPECT_EQ(run.err.rfind(c.line, 0), 0u) << run.err;
    EXPECT_EQ(run.err.find('\n'), run.err.size() - 1) << run.err;
    EXPECT_TRUE(run.out.empty()) << run.out;
    EXPECT_EQ(folder.entries(), before) << c.line;
  }
}

// AddressSanitizer maps terabytes of shadow memory at start-up, so an address-space limit
// cannot apply to a sanitized command line; the sanitized build leaves this case out.
#ifndef __SANITIZE_ADDRESS__
TEST(CommandLine, RunningOutOfMemoryNamesTheSceneAndItsFrameSize) {
  ScratchDirectory folder;
  writeText(folder.file("huge.json"), R"({"width": 16384, "height": 16384, "fps": 25,)"
                                      R"( "duration": 1, "source": {"color": [1, 0, 0]}})");
  // The spawned command line inherits the limit; this process takes its own back at once.
  rlimit saved{};
  getrlimit(RLIMIT_AS, &saved);
  rlimit limited{std::min<rlim_t>(saved.rlim_max, rlim_t{2500} << 20), saved.rlim_max};
  setrlimit(RLIMIT_AS, &limited);
  CliRun run = runCli({"render", folder.file("huge.json"), "-o", folder.file("huge.png")});
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
