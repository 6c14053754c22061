// Edit distance between names, and the suggestion made of it.
#include "cli/nearest_name.h"

#include <algorithm>
#include <cctype>

namespace veltrane_cli {
namespace {

std::string lowered(std::string text) {
  for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return text;
}

// Edits between the two texts: insertions, deletions, substitutions and swaps of neighbours.
std::size_t editsBetween(const std::string& a, const std::string& b) {
  std::vector<std::vector<std::size_t>> d(a.size() + 1, std::vector<std::size_t>(b.size() + 1));
  for (std::size_t i = 0; i <= a.size(); ++i) d[i][0] = i;
  for (std::size_t j = 0; j <= b.size(); ++j) d[0][j] = j;
  for (std::size_t i = 1; i <= a.size(); ++i) {
    for (std::size_t j = 1; j <= b.size(); ++j) {
      const std::size_t changed = a[i - 1] == b[j - 1] ? 0 : 1;
      d[i][j] = std::min({d[i - 1][j] + 1, d[i][j - 1] + 1, d[i - 1][j - 1] + changed});
      if (i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1])
        d[i][j] = std::min(d[i][j], d[i - 2][j - 2] + 1);
    }
  }
  return d[a.size()][b.size()];
}

}  // namespace

std::optional<std::string> nearestName(const std::string& typed,
                                       const std::vector<std::string>& known) {
  const std::string given = lowered(typed);
  if (given.empty()) return std::nullopt;
  // Names people type are short; a slip is one or two letters in a word.
  const std::size_t allowed = std::max<std::size_t>(1, given.size() / 3);
  std::optional<std::string> best;
  std::size_t bestEdits = allowed + 1;
  for (const std::string& name : known) {
    const std::string candidate = lowered(name);
    // A name cut short ("diag", "--over") counts as near whatever its length; a letter or two
    // begins too many names to say which.
    const bool cutShort = given.size() >= 3 && candidate.rfind(given, 0) == 0;
    const std::size_t edits = cutShort ? 1 : editsBetween(given, candidate);
    if (edits < bestEdits) {
      best = name;
      bestEdits = edits;
    }
  }
  return best;
}

std::string didYouMean(const std::string& typed, const std::vector<std::string>& known,
                       const std::string& prefix) {
  const std::optional<std::string> near = nearestName(typed, known);
  return near ? "; did you mean '" + prefix + *near + "'?" : "";
}

}  // namespace veltrane_cli
