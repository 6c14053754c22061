// A folder made for an output where it is missing (and the folders above it that are missing
// too), taken away again unless the command that needed it succeeds.
#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace veltrane_cli {

class MadeFolder {
 public:
  // Makes `path` and whatever is missing above it. Throws UsageError naming `option` when the
  // path is a file, std::runtime_error naming the folder when it cannot be made.
  MadeFolder(const std::string& path, const std::string& option);
  // Removes the folders it made unless kept.
  ~MadeFolder();
  MadeFolder(const MadeFolder&) = delete;
  MadeFolder& operator=(const MadeFolder&) = delete;
  void keep() { kept_ = true; }

 private:
  std::vector<std::filesystem::path> made_;  // deepest first
  bool kept_ = false;
};

}  // namespace veltrane_cli
