// Whether the current GL context lists an extension, with the list reading separated from the
// GL queries so the rule can be checked against any version and extension strings.
#pragma once

#include <functional>
#include <string>

namespace veltrane {

bool isExtensionSupported(const std::string& name);

// What the answer depends on: the version string (null when absent), the indexed extension
// list (read only for GL 3 and later) and the space-separated one (read only before GL 3;
// null when absent).
struct ExtensionQueries {
  std::function<const char*()> version;
  std::function<int()> count;
  std::function<const char*(int)> indexed;
  std::function<const char*()> spaceSeparated;
};

bool isExtensionListed(const std::string& name, const ExtensionQueries& queries);

}  // namespace veltrane
