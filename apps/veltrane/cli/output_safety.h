// What a command checks before it writes anything: that no output takes the place of one of its
// inputs, that a file already there is replaced only when the person says so (FFmpeg's -y and
// -n; asked on a terminal, refused without one), and that the output's place takes files.
#pragma once

#include <map>
#include <stdexcept>
#include <string>
#include <vector>

#include "cli/cli_support.h"

namespace veltrane_cli {

// An output the file system or the person's answer refuses; the dispatcher prints it as one line
// and exits with status 1.
class OutputRefused : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

enum class Replacing { Ask, Yes, No };

// Which of -y / --overwrite and -n / --no-overwrite was given; UsageError when both were.
Replacing replacingChoice(const std::map<std::string, std::string>& options);

// Refuses an output that is one of the inputs, before any input is read: the same file through
// any path, link or hard link; for a frame-number pattern ("f%04d.png"), any input in the same
// folder whose name the pattern makes. UsageError naming both (and the option, when not "").
void refuseInputAsOutput(const std::string& option, const std::string& output,
                         const std::vector<std::string>& inputs);

// Before the first frame is made: refuses names that a folder holds and a place that takes no
// new file (read-only, no permission; where folders are missing, the nearest one above that is
// there), and, for names that hold files already, asks or refuses as `choice` says. `shown` is
// the output as the person named it (a sequence's pattern).
void checkOutputNames(const std::string& option, const std::string& shown,
                      const std::vector<std::string>& names, Replacing choice);

}  // namespace veltrane_cli
