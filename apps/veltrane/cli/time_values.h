// Times as people type them on a command line, the way FFmpeg's -ss and -to read them: seconds
// ("2.5", "90"), with a unit ("2.5s", "500ms", "250us") or as a clock ("1:02.5",
// "00:01:02.500").
#pragma once

#include <string>

namespace veltrane_cli {

// The time in seconds, 0 or more; throws UsageError naming the option and the forms it takes.
double parseSeconds(const std::string& option, const std::string& text);

// Whether the text reads as a time rather than a whole frame number: it holds a decimal point,
// a colon or a unit.
bool looksLikeTime(const std::string& text);

}  // namespace veltrane_cli
