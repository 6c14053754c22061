// The call log's queries.
#include "refhost/core/instruments.h"

namespace refhost {

std::vector<std::string> CallLog::callsTo(const std::string& operation) const {
  std::vector<std::string> lines;
  for (const std::string& line : lines_) {
    if (line.compare(0, operation.size(), operation) == 0 &&
        (line.size() == operation.size() || line[operation.size()] == ' '))
      lines.push_back(line);
  }
  return lines;
}

}  // namespace refhost
