// `veltrane render` end to end: frames arrive upright and at the right time in every kind of
// output, bad scenes get one message naming the file, the field and what was expected, and a
// failed render leaves nothing under the output name.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"
#include "refhost/image_files.h"
#include "refhost/test_patterns.h"
#include "refhost/video_reader.h"

namespace {

using nlohmann::json;

const char kLayerA[] = "aaaaaaaa-0000-4000-8000-000000000001";

// 64x36 with one vertical Local cut near the right edge and no border: both regions show the
// own source unmoved, so the output is the source picture.
json smallScene(const char* pattern) {
  return {{"width", 64},
          {"height", 36},
          {"fps", 25},
          {"duration", 10},
          {"source", {{"pattern", pattern}}},
          {"layers", json::array({{{"guid", kLayerA}, {"name", "A"}}})},
          {"params", {{"cutPosition_0", {28, 0}}, {"cutDirection_0", 0}, {"borderWidth", 0}}}};
}

std::string writeScene(const ScratchDirectory& folder, const json& scene) {
  std::string path = folder.file("scene.json");
  writeText(path, scene.dump(2));
  return path;
}

CliRun render(const std::string& scene, const std::vector<std::string>& more) {
  std::vector<std::string> args{"render", scene, "--plugin", VELTRANE_MODULE_PATH};
  args.insert(args.end(), more.begin(), more.end());
  return runCli(args);
}

TEST(RenderCommand, StillsAreUpright) {
  ScratchDirectory folder;
  CliRun run = render(writeScene(folder, smallScene("gradient")), {"-o", folder.file("g.png")});
  ASSERT_EQ(run.status, 0) << run.err;
  EXPECT_NE(run.out.find("wrote " + folder.file("g.png")), std::string::npos) << run.out;
  refhost::RgbaImage image = refhost::readImageFile(folder.file("g.png"));
  refhost::RgbaImage expected = refhost::generatePattern(refhost::Pattern::Gradient, 0, 64, 36);
  ASSERT_EQ(image.pixels.size(), expected.pixels.size());
  int worst = 0;
  for (std::size_t i = 0; i < image.pixels.size(); ++i)
    worst = std::max(worst, std::abs(image.pixels[i] - expected.pixels[i]));
  EXPECT_LE(worst, 1);                    // resampling at texel centres
  EXPECT_GE(image.pixel(10, 0)[1], 254);  // the first row is the top: green is full there
  EXPECT_LE(image.pixel(10, 35)[1], 1);
}

TEST(RenderCommand, EveryOutputKindCarriesTheFramesAsked) {
  ScratchDirectory folder;
  std::string scene = writeScene(folder, smallScene("counter"));
  auto code = [](const refhost::RgbaImage& image) {
    return static_cast<int>(refhost::readCounterCode(image).value_or(9999));
  };
  CliRun still = render(scene, {"-o", folder.file("f.exr"), "--frame", "5"});
  ASSERT_EQ(still.status, 0) << still.err;
  EXPECT_EQ(code(refhost::readImageFile(folder.file("f.exr"))), 5);

  CliRun sequence = render(scene, {"-o", folder.file("s_%04d.png"), "--frames", "2-4"});
  ASSERT_EQ(sequence.status, 0) << sequence.err;
  for (int frame : {2, 3, 4}) {
    std::string name = folder.file("s_000" + std::to_string(frame) + ".png");
    EXPECT_EQ(code(refhost::readImageFile(name)), frame) << name;
  }

  CliRun video = render(scene, {"--output", folder.file("v.mkv")});
  ASSERT_EQ(video.status, 0) << video.err;
  EXPECT_NE(video.err.find("10/10"), std::string::npos);  // the progress bar reached the end
  refhost::VideoReader reader(folder.file("v.mkv"));
  EXPECT_EQ(reader.frameCount(), 10);
  for (int frame : {0, 7, 9, 3}) EXPECT_EQ(code(reader.frame(frame, 64, 36)), frame);
  EXPECT_EQ(folder.entries().size(), 6u);  // scene, still, three frames, video: no leftovers
}

TEST(RenderCommand, BadScenesNameTheFieldAndLeaveNoOutput) {
  struct Case {
    std::function<void(json&)> spoil;
    std::string expected;  // after "<scene file>: "
  };
  const Case cases[] = {
      {[](json& s) { s.erase("width"); },
       "width: expected a whole number from 1 to 16384 (missing)"},
      {[](json& s) { s["height"] = "36"; },
       "height: expected a whole number from 1 to 16384, got \"36\""},
      {[](json& s) { s["fps"] = 0; }, "fps: expected a number from 0.001 to 1000, got 0"},
      {[](json& s) { s["colour"] = 1; }, "colour: expected no such field"},
      {[](json& s) {
         s["source"] = {{"pattern", "zebra"}};
       },
       "source.pattern: expected one of \"bars\", \"checker\", \"gradient\", \"counter\""},
      {[](json& s) {
         s["source"] = {{"color", {1, 0, 0, 2}}};
       },
       "source.color[3]: expected a number from 0 to 1, got 2"},
      {[](json& s) {
         s["source"] = {{"file", "missing.png"}};
       },
       "source.file: expected an image or video file (relative to the scene file"},
      {[](json& s) { s["layers"][0]["guid"] = "A"; }, "layers[0].guid: expected a GUID text"},
      {[](json& s) {
         s["layers"].push_back({{"guid", kLayerA}, {"name", "B"}});
       },
       "layers[1].guid: expected a GUID no other layer"},
      {[](json& s) {
         s["layers"][0]["placement"] = {1, 0, 0, 1};
       },
       "layers[0].placement: expected 16 numbers"},
      {[](json& s) { s["params"]["nope"] = 1; },
       "params.nope: expected the id of a parameter the module declares"},
      {[](json& s) { s["params"]["numberOfCuts"] = 9; },
       "params.numberOfCuts: expected a whole number from 1 to 8, got 9"},
      {[](json& s) { s["params"]["borderWidth"] = -1; },
       "params.borderWidth: expected a number from 0 to 200, got -1"},
      {[](json& s) { s["params"]["cutType"] = "Diagonal"; },
       "params.cutType: expected one of \"Local\", \"Radial\" or an index from 0 to 1"},
      {[](json& s) { s["params"]["cutPosition_0"] = {1}; },
       "params.cutPosition_0: expected a point [x, y] in pixels, got [1]"},
      {[](json& s) { s["params"]["viewCutRegions"] = 1; },
       "params.viewCutRegions: expected true or false, got 1"},
      {[](json& s) { s["params"]["inputLayer1"] = "bbbbbbbb-0000-4000-8000-000000000001"; },
       "params.inputLayer1: expected a layer GUID of the scene or the null GUID"},
      {[](json& s) {
         s["params"]["cutDirection_0"] = {{"keys", {{0, 10}, {0, 20}}}};
       },
       "params.cutDirection_0.keys[1][0]: expected a frame no earlier key has"},
      {[](json& s) {
         s["params"]["inputFrameScale2"] = {{"keys", {{0, 5000}}}};
       },
       "params.inputFrameScale2.keys[0][1]: expected a number from 1 to 1000, got 5000"},
  };
  for (const Case& c : cases) {
    ScratchDirectory folder;
    json scene = smallScene("bars");
    c.spoil(scene);
    std::string path = writeScene(folder, scene);
    CliRun run = render(path, {"-o", folder.file("out.mp4")});
    EXPECT_EQ(run.status, 1) << c.expected;
    EXPECT_EQ(run.err.rfind("veltrane render: " + path + ": " + c.expected, 0), 0u) << run.err;
    EXPECT_EQ(run.err.find('\n'), run.err.size() - 1) << run.err;
    EXPECT_EQ(folder.entries(), std::vector<std::string>{"scene.json"}) << c.expected;
  }

  ScratchDirectory folder;
  writeText(folder.file("broken.json"), "{\"width\": 64,");
  CliRun run = render(folder.file("broken.json"), {"-o", folder.file("out.png")});
  EXPECT_EQ(run.status, 1);
  EXPECT_NE(run.err.find(folder.file("broken.json") + ": not valid JSON"), std::string::npos)
      << run.err;
}

TEST(RenderCommand, BadOptionsAreUsageErrors) {
  ScratchDirectory folder;
  std::string scene = writeScene(folder, smallScene("bars"));
  struct Case {
    std::vector<std::string> args;
    std::string expected;
  };
  const Case cases[] = {
      {{}, "needs -o OUT"},
      {{"-o", folder.file("x.jpg")}, "ends in .png, .exr, .mp4, .mov or .mkv"},
      {{"-o", folder.file("x.png"), "--frames", "0-3"}, "a .png output holds one frame"},
      {{"-o", folder.file("x.mp4"), "--frames", "4-2"}, "expects A <= B"},
      {{"-o", folder.file("x.mp4"), "--frames", "5-10"}, "outside the scene's frames 0-9"},
      {{"-o", folder.file("x.mp4"), "--frame", "1", "--frames", "1-2"}, "not both"},
      {{"-o", folder.file("x.mp4"), "--profile", "es"}, "expects core or compat"},
  };
  for (const Case& c : cases) {
    CliRun run = render(scene, c.args);
    EXPECT_EQ(run.status, 2) << c.expected;
    EXPECT_NE(run.err.find(c.expected), std::string::npos) << run.err;
  }
  EXPECT_EQ(folder.entries(), std::vector<std::string>{"scene.json"});
}

TEST(RenderCommand, TheShippedDemoSceneRenders) {
  ScratchDirectory folder;
  CliRun run = render(std::string(VELTRANE_SOURCE_DIR) + "/docs/examples/demo.json",
                      {"-o", folder.file("demo.png"), "--frame", "40", "--profile", "compat"});
  ASSERT_EQ(run.status, 0) << run.err;
  EXPECT_EQ(refhost::readImageFile(folder.file("demo.png")).width, 640);
}

TEST(BenchCommand, ReportsEveryCase) {
  CliRun run = runCli({"bench", "--plugin", VELTRANE_MODULE_PATH, "--sizes", "64x36,80x45",
                       "--cuts", "1,3", "--repeat", "1", "--warmup", "0", "--json"});
  ASSERT_EQ(run.status, 0) << run.err;
  json document = json::parse(run.out);
  ASSERT_EQ(document["results"].size(), 8u);  // 2 sizes x 2 cut counts x 2 input kinds
  const json& last = document["results"].back();
  EXPECT_EQ(last["width"], 80);
  EXPECT_EQ(last["cuts"], 3);
  EXPECT_EQ(last["inputs"], "layers");
  EXPECT_GT(last["renderMs"].get<double>(), 0.0);
  EXPECT_GT(last["fetchMs"].get<double>(), 0.0);  // nine layers were fetched
}

}  // namespace
