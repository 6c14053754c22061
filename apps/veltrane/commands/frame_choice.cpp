// Frame numbers from the frame and time options.
#include "commands/frame_choice.h"

#include <cmath>

#include "cli/cli_support.h"
#include "cli/time_values.h"
#include "scene/json_fields.h"

namespace veltrane_cli {
namespace {

// Rounding slack: 2.0 s at 25 fps is frame 50, not 49.99999.
constexpr double kSlack = 1e-6;

// The first frame at or after a time (or numbered).
int32_t firstFrom(const std::string& option, const std::string& text, double rate) {
  if (!looksLikeTime(text) && option == "--frames") return parseInt32(option, text);
  return static_cast<int32_t>(std::min(std::ceil(parseSeconds(option, text) * rate - kSlack), 2e9));
}

// The last frame before a time (or the numbered one).
int32_t lastBefore(const std::string& option, const std::string& text, double rate) {
  return firstFrom(option, text, rate) - (looksLikeTime(text) || option == "--to" ? 1 : 0);
}

std::string kindOf(const refhost::OutputTarget& target) {
  return target.imageFormat == refhost::ImageFormat::Png ? "png" : "exr";
}

}  // namespace

int32_t frameShownAt(const std::string& option, const std::string& text, double rate) {
  if (!looksLikeTime(text)) return parseInt32(option, text);
  return static_cast<int32_t>(
      std::min(std::floor(parseSeconds(option, text) * rate + kSlack), 2e9));
}

FrameRange chooseFrames(const std::map<std::string, std::string>& options,
                        const refhost::OutputTarget& target, int32_t duration, double rate) {
  const bool still = target.kind == refhost::OutputKind::Still;
  const int named = static_cast<int>(options.count("--frame")) +
                    static_cast<int>(options.count("--frames")) +
                    static_cast<int>(options.count("--from") || options.count("--to"));
  if (named > 1) throw UsageError("give --frame, --frames or --from/--to, not more than one");
  FrameRange range{0, still ? 0 : duration - 1};
  bool endByTime = false;  // an end time past the scene stops at its last frame
  if (options.count("--frame")) {
    range.first = range.last = frameShownAt("--frame", options.at("--frame"), rate);
  } else if (options.count("--frames")) {
    const std::string& text = options.at("--frames");
    const std::string::size_type dash = text.find('-', 1);
    if (dash == std::string::npos) {
      range.first = range.last = frameShownAt("--frames", text, rate);
    } else {
      range = {firstFrom("--frames", text.substr(0, dash), rate),
               lastBefore("--frames", text.substr(dash + 1), rate)};
      endByTime = looksLikeTime(text.substr(dash + 1));
    }
    if (range.last < range.first)
      throw UsageError("option '--frames' expects A <= B, got '" + text + "'");
  } else if (named) {
    if (options.count("--from")) range.first = firstFrom("--from", options.at("--from"), rate);
    if (still) range.last = range.first;  // a still shows the frame it starts at
    if (options.count("--to")) {
      range.last = lastBefore("--to", options.at("--to"), rate);
      endByTime = true;
    }
    if (range.first >= duration)
      throw UsageError("option '--from': " + options.at("--from") + " lies past the scene's " +
                       std::to_string(duration) + " frames (" + numberText(duration / rate) +
                       " s)");
    if (range.last < range.first)
      throw UsageError("option '--to': " + options.at("--to") + " comes before the first frame " +
                       "rendered, so no frame is left");
  }
  if (endByTime && range.last >= duration) range.last = std::max(range.first, duration - 1);
  if (still && range.count() != 1)
    throw UsageError("a ." + kindOf(target) +
                     " output holds one frame; use a %04d pattern or a video for " +
                     std::to_string(range.count()) + " frames");
  if (range.first < 0 || range.last >= duration)
    throw UsageError("frames " + std::to_string(range.first) + "-" + std::to_string(range.last) +
                     " lie outside the scene's frames 0-" + std::to_string(duration - 1));
  return range;
}

std::vector<std::string> outputFileNames(const refhost::OutputTarget& target,
                                         const FrameRange& frames) {
  if (target.kind != refhost::OutputKind::Sequence) return {target.path};
  std::vector<std::string> names;
  for (int32_t frame = frames.first; frame <= frames.last; ++frame)
    names.push_back(target.frameName(frame));
  return names;
}

}  // namespace veltrane_cli
