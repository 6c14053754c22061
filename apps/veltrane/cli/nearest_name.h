// "Did you mean": the known name closest to a name someone typed, for messages that refuse an
// unknown layout, option, pattern, codec or command.
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace veltrane_cli {

// The known name closest to `typed` by edits (a letter added, dropped, changed or two swapped,
// letter case ignored), when it is close enough to be a slip: at most a third of the typed
// name's letters, and at least one; or a known name that starts with what was typed (three
// letters or more). Ties go to the first in `known`.
std::optional<std::string> nearestName(const std::string& typed,
                                       const std::vector<std::string>& known);

// "; did you mean 'NAME'?" for the nearest name, or "" when none is near; `prefix` goes before
// the suggested name (e.g. "pattern:").
std::string didYouMean(const std::string& typed, const std::vector<std::string>& known,
                       const std::string& prefix = "");

}  // namespace veltrane_cli
