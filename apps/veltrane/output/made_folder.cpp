// Making and taking away an output's folders.
#include "output/made_folder.h"

#include <stdexcept>

#include "cli/cli_support.h"

namespace veltrane_cli {

namespace fs = std::filesystem;

MadeFolder::MadeFolder(const std::string& path, const std::string& option) {
  if (path.empty()) return;
  std::error_code error;
  if (fs::exists(path, error) && !fs::is_directory(path, error))
    throw UsageError("option '" + option + "' expects a folder, '" + path + "' is a file");
  for (fs::path missing = path; !missing.empty() && !fs::exists(missing, error);
       missing = missing.parent_path())
    made_.push_back(missing);
  fs::create_directories(path, error);
  if (error) throw std::runtime_error(path + ": cannot create the folder: " + error.message());
}

MadeFolder::~MadeFolder() {
  std::error_code ignored;
  if (!kept_)
    for (const fs::path& folder : made_) fs::remove(folder, ignored);
}

}  // namespace veltrane_cli
