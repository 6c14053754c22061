// The scene `veltrane split` makes of a few clips: the first the effect's own source, the rest
// layers, the composition sized and timed from the first, a layout's cuts, and each clip's
// picture framed on its region at its own proportions.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <vector>

#include "cli/cli_support.h"
#include "layouts/layouts.h"
#include "refhost/media/frame_rate.h"

namespace veltrane_cli {

// A nudge of one clip's framing, as `--frame N:X,Y[,SCALE[,ROTATION]]` gives it.
struct FrameNudge {
  int32_t input = 1;    // the clip's place on the command line, from 1
  Point offset{0, 0};   // frame pixels, x to the right, y up
  double scale = 100;   // percent of the framed size
  double rotation = 0;  // degrees
};

struct BorderSetting {
  double width = 0;
  std::array<double, 3> colour{0, 0, 0};
  double opacity = 1;
};

struct SplitRequest {
  // Video or still image files; also "pattern:NAME" (bars, checker, gradient, counter) and
  // "color:RRGGBB" for generated pictures.
  std::vector<std::string> clips;
  std::optional<std::array<int32_t, 2>> size;
  std::optional<refhost::FrameRate> fps;
  enum class Length { First, Longest, Shortest } length = Length::First;
  std::optional<std::string> layout;
  LayoutOptions layoutOptions;
  std::optional<BorderSetting> border;
  std::vector<FrameNudge> nudges;
};

struct SplitScene {
  nlohmann::ordered_json document;  // a scene file's document
  // What the user should know: clips shown again, the rate taken when the first clip has none.
  std::vector<std::string> notes;
};

// Reads each clip to learn its size, rate, length and colour, and asks the module at
// `modulePath` where its regions lie to frame each picture. Throws UsageError naming the
// argument and what was expected: a missing or unreadable clip, one without a picture, more
// than 9 clips, more clips than the layout has regions, an unknown layout (listing the known
// ones), a --frame index out of range, a gap or centre the layout does not take.
SplitScene buildSplitScene(const SplitRequest& request, const std::string& modulePath);

// The options that shape a split, as `split` and `view` take them.
extern const std::vector<OptionDefinition> kSplitOptions;
// The request of the clips and the options (--size, --fps, --duration, --layout, --angle, --gap,
// --radial-centre, --border, and the nudges among the --frame values: those of the form N:X,Y,
// the values of a repeated --frame joined by ';').
SplitRequest splitRequestFrom(const std::vector<std::string>& clips,
                              const std::map<std::string, std::string>& options);

// The parsers of split's options; each throws UsageError naming `option`.
std::array<int32_t, 2> parseFrameSize(const std::string& option, const std::string& text);
double parseNumber(const std::string& option, const std::string& text);
// A rate as a whole number, a decimal or a fraction, from 0.001 to 1000 (see
// refhost::frameRateFromText).
refhost::FrameRate parseFrameRate(const std::string& option, const std::string& text);
Point parsePoint(const std::string& option, const std::string& text);
BorderSetting parseBorder(const std::string& option, const std::string& text);
FrameNudge parseNudge(const std::string& option, const std::string& text);
SplitRequest::Length parseLength(const std::string& option, const std::string& text);

}  // namespace veltrane_cli
