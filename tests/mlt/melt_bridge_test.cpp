// The transition and the filter as melt renders them, against `veltrane render` of the same
// scene. melt writes raw RGBA (no YUV step on this path), and both sides decode the same
// lossless clips, so every channel must agree within 2 levels of 255: MLT may round a level in
// its own conversions (a colour property is 8-bit where a scene's is not), while a cut or an
// input misplaced by one pixel, or a wrong frame, differs by far more.
#include <gtest/gtest.h>

#include <algorithm>

#include "melt_runs.h"

namespace mlttest {
namespace {

constexpr int kTolerance = 2;

struct Case {
  const char* name;
  std::string document;
  std::string params;  // of the equal scene
};

TEST(MeltBridge, RendersWhatTheReferenceHostRenders) {
  const std::string lower = std::string("\"") + kLowerGuid + "\"";
  const Case cases[] = {
      {"a tractor with the transition",
       tractorDocument({{"numberOfCuts", "2"},
                        {"cutPosition_1", "30 20"},
                        {"cutDirection_1", "100"},
                        {"inputLayer1", "lower"},
                        {"inputFrameShift1", "2"},
                        {"inputFrameShift0", "-2"},
                        {"inputLayer2", "lower"},
                        {"borderWidth", "3"},
                        {"borderColor", "#ff8000"}}),
       "\"numberOfCuts\": 2, \"cutPosition_1\": [30, 20], \"cutDirection_1\": 100, "
       "\"inputLayer1\": " +
           lower +
           ", \"inputFrameShift1\": 2, \"inputFrameShift0\": -2, "
           "\"inputLayer2\": " +
           lower + ", \"borderWidth\": 3, \"borderColor\": [1, 0.50196, 0]"},
      {"one track with the filter",
       filterDocument({{"cutType", "Radial"},
                       {"numberOfCuts", "3"},
                       {"cutPosition_global", "10 -5"},
                       {"cutDirection_0", "30"},
                       {"cutDirection_1", "150"},
                       {"cutDirection_2", "270"},
                       {"inputFrameShift2", "-3"},
                       {"inputFrameShift3", "4"},
                       {"inputLayer1", "lower"}}),
       "\"cutType\": \"Radial\", \"numberOfCuts\": 3, \"cutPosition_global\": [10, -5], "
       "\"cutDirection_0\": 30, \"cutDirection_1\": 150, \"cutDirection_2\": 270, "
       "\"inputFrameShift2\": -3, \"inputFrameShift3\": 4"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    MeltRun melt = runMelt(c.document);
    std::vector<refhost::RgbaImage> reference = renderScene(scene(c.params));
    EXPECT_TRUE(melt.bridgeLines().empty()) << melt.log;
    ASSERT_EQ(melt.frames.size(), reference.size());
    for (std::size_t frame = 0; frame < reference.size(); ++frame)
      EXPECT_LE(largestDifference(melt.frames[frame], reference[frame]), kTolerance)
          << "frame " << frame;
  }
}

TEST(MeltBridge, KeyframedAngleFollowsTheReferenceKeys) {
  MeltRun melt =
      runMelt(tractorDocument({{"cutDirection_0", "0=15;19=75"}, {"inputLayer1", "lower"}}));
  std::vector<refhost::RgbaImage> reference =
      renderScene(scene("\"cutDirection_0\": {\"keys\": [[0, 15], [19, 75]]}, \"inputLayer1\": \"" +
                        std::string(kLowerGuid) + "\""));
  ASSERT_EQ(melt.frames.size(), std::size_t(kFrames));
  for (int frame : {0, kFrames / 2, kFrames - 1}) {
    EXPECT_LE(largestDifference(melt.frames[frame], reference[frame]), kTolerance)
        << "frame " << frame;
  }
  // The cut turned: the halves differ between the first, middle and last frames.
  const auto& frames = melt.frames;
  EXPECT_GT(largestDifference(frames[0], frames[kFrames / 2]), 100);
  EXPECT_GT(largestDifference(frames[kFrames / 2], frames[kFrames - 1]), 100);
}

TEST(MeltBridge, RefusedValuesLogOnceAndRenderWithTheDefault) {
  struct Bad {
    const char* property;
    const char* value;
    const char* reason;
  };
  const Bad bad[] = {
      {"borderWidth", "300", "expected a number from 0 to 200"},
      {"numberOfCuts", "two", "expected a whole number from 1 to 8"},
      {"cutType", "Diagonal", "expected one of Local, Radial"},
      {"inputLayer1", "upper", "expected own, lower, track:K"},
      {"cutDirection_0", "0=15;19=steep", "expected an angle in degrees"},
      {"borderColor", "pink", "expected a colour"},
      {"cutPosition_0", "10", "expected a point"},
  };
  std::map<std::string, std::string> properties{{"inputLayer2", "lower"}};
  for (const Bad& value : bad) properties[value.property] = value.value;
  MeltRun melt = runMelt(tractorDocument(properties));
  const std::vector<std::string> lines = melt.bridgeLines();
  EXPECT_EQ(lines.size(), std::size(bad)) << melt.log;
  for (const Bad& value : bad) {
    SCOPED_TRACE(value.property);
    EXPECT_EQ(std::count_if(lines.begin(), lines.end(),
                            [&](const std::string& line) {
                              return line.find(std::string(value.property) + ": \"" + value.value +
                                               "\"") != std::string::npos &&
                                     line.find(value.reason) != std::string::npos;
                            }),
              1);
  }
  // Each refused property takes its default; the good one still counts.
  std::vector<refhost::RgbaImage> reference =
      renderScene(scene("\"inputLayer2\": \"" + std::string(kLowerGuid) + "\""));
  ASSERT_EQ(melt.frames.size(), reference.size());
  for (std::size_t frame = 0; frame < reference.size(); frame += 9)
    EXPECT_LE(largestDifference(melt.frames[frame], reference[frame]), kTolerance);
}

// The module is found through the `plugin` property, then $VELTRANE_PLUGIN, then beside the
// bridge; when it cannot be loaded or drawn with, one line says why and the upper track shows.
TEST(MeltBridge, FindsTheModuleOrPassesTheUpperTrackThrough) {
  struct Naming {
    const char* name;
    std::map<std::string, std::string> properties;
    std::vector<std::string> environment;
    const char* line;  // null: the effect renders
  };
  const Naming namings[] = {
      {"the plugin property", {{"plugin", VELTRANE_MODULE_PATH}}, {}, nullptr},
      {"$VELTRANE_PLUGIN", {}, {std::string("VELTRANE_PLUGIN=") + VELTRANE_MODULE_PATH}, nullptr},
      {"the installed place beside the bridge", {}, {}, nullptr},
      {"a plugin property leading nowhere",
       {{"plugin", "/nonexistent/veltrane.so"}},
       {std::string("VELTRANE_PLUGIN=") + VELTRANE_MODULE_PATH},
       "cannot load plug-in module '/nonexistent/veltrane.so'"},
      {"$VELTRANE_PLUGIN leading nowhere",
       {},
       {"VELTRANE_PLUGIN=/nonexistent/other.so"},
       "cannot load plug-in module '/nonexistent/other.so'"},
      // Mesa capped below OpenGL 4.1 (and chosen even where another driver is installed).
      {"no OpenGL 4.1",
       {},
       {"__EGL_VENDOR_LIBRARY_FILENAMES=/usr/share/glvnd/egl_vendor.d/50_mesa.json",
        "MESA_GL_VERSION_OVERRIDE=3.3"},
       "no OpenGL 4.1 context can be made"},
  };
  const std::vector<refhost::RgbaImage> rendered =
      renderScene(scene(std::string("\"inputLayer1\": \"") + kLowerGuid + "\""));
  // The upper clip as it is: one cut, both sides its own picture, no border.
  const std::vector<refhost::RgbaImage> upper = renderScene(scene("\"borderWidth\": 0"));
  for (const Naming& naming : namings) {
    SCOPED_TRACE(naming.name);
    std::map<std::string, std::string> properties = naming.properties;
    properties["inputLayer1"] = "lower";
    MeltRun melt = runMelt(tractorDocument(properties), naming.environment);
    const std::vector<std::string> lines = melt.bridgeLines();
    if (naming.line) {
      ASSERT_EQ(lines.size(), 1u) << melt.log;
      EXPECT_NE(lines[0].find(naming.line), std::string::npos) << melt.log;
      EXPECT_NE(lines[0].find("the upper track is passed through"), std::string::npos);
    } else {
      EXPECT_TRUE(lines.empty()) << melt.log;
    }
    const std::vector<refhost::RgbaImage>& expected = naming.line ? upper : rendered;
    ASSERT_EQ(melt.frames.size(), expected.size());
    for (std::size_t frame = 0; frame < expected.size(); frame += 6)
      EXPECT_LE(largestDifference(melt.frames[frame], expected[frame]), kTolerance);
  }
}

// A track that cannot be sought (live capture) still shows, shifted back, the pictures it
// played; ahead of them it has none, and the effect shows what it shows for a missing frame.
TEST(MeltBridge, ATrackThatCannotSeekShowsWhatItPlayedAndNothingAhead) {
  const std::pair<const char*, const char*> shifts[] = {{"-2", "-2"}, {"2", "-100000"}};
  for (const auto& [shift, shown] : shifts) {
    SCOPED_TRACE(std::string("shift ") + shift);
    MeltRun melt = runMelt(
        tractorDocument({{"inputFrameShift1", shift}}, "<property name=\"seekable\">0</property>"));
    std::vector<refhost::RgbaImage> reference =
        renderScene(scene(std::string("\"inputFrameShift1\": ") + shown));
    ASSERT_EQ(melt.frames.size(), reference.size());
    for (std::size_t frame = 0; frame < reference.size(); frame += 3)
      EXPECT_LE(largestDifference(melt.frames[frame], reference[frame]), kTolerance)
          << "frame " << frame;
  }
}

// Two pairs of tracks split, then joined by a composition whose every picture is its lower
// input shifted: it shows the first pair's split, composited, three frames late or early
// (kept pictures back, a copy of what lies below ahead), and nothing of the tracks it
// consumed.
TEST(MeltBridge, AShiftedLowerInputInAChainShowsWhatLiesBelowComposited) {
  for (int shift : {-3, 3}) {
    SCOPED_TRACE("shift " + std::to_string(shift));
    const std::string upperTracks =
        "<track producer=\"track2\"/><track producer=\"track3\"/>"
        "<transition><property name=\"mlt_service\">veltrane</property>"
        "<property name=\"a_track\">2</property><property name=\"b_track\">3</property>"
        "<property name=\"layout\">horizontal-2</property>"
        "<property name=\"inputLayer1\">lower</property></transition>";
    const std::string joined =
        "<transition><property name=\"mlt_service\">veltrane</property>"
        "<property name=\"a_track\">0</property><property name=\"b_track\">2</property>"
        "<property name=\"inputLayer0\">lower</property><property "
        "name=\"inputLayer1\">lower</property>"
        "<property name=\"inputFrameShift0\">" +
        std::to_string(shift) +
        "</property>"
        "<property name=\"inputFrameShift1\">" +
        std::to_string(shift) +
        "</property>"
        "<property name=\"borderWidth\">0</property></transition>";
    MeltRun chain =
        runMelt(document("chain.mlt", {{"@UPPER_TRACKS@", upperTracks}, {"@JOINED@", joined}}));
    MeltRun below = runMelt(document("chain.mlt", {{"@UPPER_TRACKS@", ""}, {"@JOINED@", ""}}));
    ASSERT_EQ(chain.frames.size(), std::size_t(kFrames));
    ASSERT_EQ(below.frames.size(), std::size_t(kFrames));
    for (int frame = std::max(0, -shift); frame < std::min(kFrames, kFrames - shift); ++frame)
      EXPECT_LE(largestDifference(chain.frames[frame], below.frames[frame + shift]), kTolerance)
          << "frame " << frame;
  }
}

// The encoder melt renders with starting late, its starting thread held up as a busy machine
// can hold it up: melts at once with the transition, the filter and the transition whose module
// cannot be loaded each end by themselves with every frame written.
TEST(MeltBridge, EveryFrameIsWrittenWhenTheEncoderStartsLate) {
  const std::vector<std::string> late{std::string("LD_PRELOAD=") + VELTRANE_LATE_ENCODER_START};
  MeltJob transition(tractorDocument({{"inputLayer1", "lower"}}), late);
  MeltJob filter(filterDocument({{"cutDirection_0", "90"}, {"inputFrameShift1", "2"}}), late);
  MeltJob withoutModule(tractorDocument({{"plugin", "/nonexistent/veltrane.so"}}), late);
  for (MeltJob* job : {&transition, &filter, &withoutModule})
    EXPECT_EQ(job->finish().frames.size(), std::size_t(kFrames));
}

}  // namespace
}  // namespace mlttest
