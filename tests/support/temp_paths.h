// Unique scratch files and folders under the system's temporary directory, for tests.
#pragma once

#include <string>
#include <vector>

namespace testsupport {

// Creates an empty file or folder whose name starts with `prefix`; returns its path.
std::string makeTempFile(const std::string& prefix);
std::string makeTempDirectory(const std::string& prefix);

// A scratch folder that removes itself with everything in it.
class ScratchDirectory {
 public:
  ScratchDirectory();
  ~ScratchDirectory();
  ScratchDirectory(const ScratchDirectory&) = delete;
  ScratchDirectory& operator=(const ScratchDirectory&) = delete;

  const std::string& path() const { return path_; }
  std::string file(const std::string& name) const { return path_ + "/" + name; }
  // Names of the entries, hidden ones included, sorted.
  std::vector<std::string> entries() const;

 private:
  std::string path_;
};

}  // namespace testsupport
