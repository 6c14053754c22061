// A file written under a temporary name beside its final name and renamed into place only when
// complete, so that nothing half-written ever appears under the final name.
#pragma once

#include <string>

namespace refhost {

class StagedFile {
 public:
  // Picks a temporary name in the directory of `finalPath`; creates nothing yet.
  explicit StagedFile(std::string finalPath);
  // An uncommitted temporary is deleted.
  ~StagedFile();
  StagedFile(StagedFile&& other) noexcept;
  StagedFile& operator=(StagedFile&&) = delete;
  StagedFile(const StagedFile&) = delete;
  StagedFile& operator=(const StagedFile&) = delete;

  const std::string& temporaryPath() const { return temporaryPath_; }
  const std::string& finalPath() const { return finalPath_; }
  // Renames the temporary onto the final name (replacing what was there). Throws
  // std::runtime_error naming both when the rename fails.
  void commit();

 private:
  std::string finalPath_;
  std::string temporaryPath_;
  bool committed_ = false;
};

}  // namespace refhost
