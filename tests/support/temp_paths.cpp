// mkstemp/mkdtemp templates built on the temporary directory the environment names.
#include "support/temp_paths.h"

#include <stdlib.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <stdexcept>
#include <vector>

namespace testsupport {
namespace {

std::vector<char> pattern(const std::string& prefix) {
  const std::string text = (std::filesystem::temp_directory_path() / (prefix + "XXXXXX")).string();
  return std::vector<char>(text.begin(), text.end() + 1);  // with the terminator
}

}  // namespace

std::string makeTempFile(const std::string& prefix) {
  std::vector<char> path = pattern(prefix);
  const int descriptor = mkstemp(path.data());
  if (descriptor < 0) throw std::runtime_error("cannot create a temporary file");
  close(descriptor);
  return path.data();
}

std::string makeTempDirectory(const std::string& prefix) {
  std::vector<char> path = pattern(prefix);
  if (!mkdtemp(path.data())) throw std::runtime_error("cannot create a temporary folder");
  return path.data();
}

ScratchDirectory::ScratchDirectory() : path_(makeTempDirectory("veltrane_test_")) {}

ScratchDirectory::~ScratchDirectory() {
  std::error_code ignored;
  std::filesystem::remove_all(path_, ignored);
}

std::vector<std::string> ScratchDirectory::entries() const {
  std::vector<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(path_))
    names.push_back(entry.path().filename().string());
  std::sort(names.begin(), names.end());
  return names;
}

}  // namespace testsupport
