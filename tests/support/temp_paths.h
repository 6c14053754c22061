// Unique scratch files and folders under the system's temporary directory, for tests.
#pragma once

#include <string>

namespace testsupport {

// Creates an empty file or folder whose name starts with `prefix`; returns its path.
std::string makeTempFile(const std::string& prefix);
std::string makeTempDirectory(const std::string& prefix);

}  // namespace testsupport
