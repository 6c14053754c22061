// What people type for times, frames and names: times as FFmpeg reads them, the frames a render
// takes from them, and the name suggested for a slip.
#include <gtest/gtest.h>

#include "cli/cli_support.h"
#include "cli/nearest_name.h"
#include "cli/time_values.h"
#include "commands/frame_choice.h"

namespace veltrane_cli {
namespace {

TEST(TimeValues, SecondsAndClocksAsFFmpegReadsThem) {
  const std::pair<const char*, double> read[] = {
      {"2.5", 2.5},      {"90", 90}, {".5", 0.5},      {"500ms", 0.5},
      {"250us", 250e-6}, {"3s", 3},  {"1:02.5", 62.5}, {"00:01:02.500", 62.5},
      {"1:00:00", 3600}};
  for (const auto& [text, seconds] : read) EXPECT_DOUBLE_EQ(parseSeconds("--from", text), seconds);
  for (const char* bad : {"", "-1", "1:60", "1.5:00", "1:2:3:4", "2.5.1", "1:02s", "abc", "1e3"})
    EXPECT_THROW(parseSeconds("--from", bad), UsageError) << bad;
}

TEST(FrameChoice, FramesByNumberAndByTime) {
  const refhost::OutputTarget video = refhost::parseOutputTarget("out.mp4");
  const refhost::OutputTarget still = refhost::parseOutputTarget("out.png");
  struct Case {
    std::map<std::string, std::string> options;
    const refhost::OutputTarget& target;
    int32_t first, last;  // at 25 fps in 100 frames
  } const cases[] = {
      {{}, video, 0, 99},
      {{{"--frames", "10-20"}}, video, 10, 20},
      {{{"--frames", "1.0-2.0"}}, video, 25, 49},  // -ss 1 -to 2: frames at 1.00 to 1.96 s
      {{{"--from", "1"}, {"--to", "2"}}, video, 25, 49},
      {{{"--from", "0.99"}}, video, 25, 99},   // the first frame at or after the time
      {{{"--to", "00:00:09"}}, video, 0, 99},  // an end past the scene's stops at its last
      {{{"--frame", "1.5"}}, still, 37, 37},   // the frame shown at the time
      {{{"--from", "2"}}, still, 50, 50},
  };
  for (const Case& c : cases) {
    const FrameRange range = chooseFrames(c.options, c.target, 100, 25);
    EXPECT_EQ(range.first, c.first) << c.options.begin()->second;
    EXPECT_EQ(range.last, c.last) << c.options.begin()->second;
  }
  const std::map<std::string, std::string> refused[] = {{{"--frame", "3"}, {"--from", "1"}},
                                                        {{"--from", "5"}},
                                                        {{"--from", "2"}, {"--to", "1"}},
                                                        {{"--frames", "0-150"}}};
  for (const auto& options : refused)
    EXPECT_THROW(chooseFrames(options, video, 100, 25), UsageError) << options.begin()->second;
}

TEST(NearestName, SuggestsOnlyWhatASlipExplains) {
  const std::vector<std::string> known{"diagonal", "radial", "render", "--overwrite", "--output"};
  const std::pair<const char*, const char*> typed[] = {
      {"diagnal", "diagonal"}, {"Radail", "radial"}, {"rendr", "render"}, {"--over", "--overwrite"},
      {"zigzag", nullptr},     {"r", nullptr},       {"", nullptr}};
  for (const auto& [text, near] : typed) {
    const std::optional<std::string> found = nearestName(text, known);
    EXPECT_EQ(found.value_or("(none)"), near ? near : "(none)") << text;
  }
}

}  // namespace
}  // namespace veltrane_cli
