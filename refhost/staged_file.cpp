// Temporary names beside the final one, rename on commit, delete otherwise.
#include "refhost/staged_file.h"

#include <unistd.h>

#include <atomic>
#include <filesystem>
#include <stdexcept>
#include <system_error>

namespace refhost {
namespace {

std::atomic<unsigned> stagedCount{0};

}  // namespace

StagedFile::StagedFile(std::string finalPath) : finalPath_(std::move(finalPath)) {
  std::filesystem::path target(finalPath_);
  // A hidden name in the same directory: the rename stays on one file system.
  std::string name = "." + target.filename().string() + ".partial-" + std::to_string(getpid()) +
                     "-" + std::to_string(stagedCount++);
  temporaryPath_ = (target.parent_path() / name).string();
}

StagedFile::StagedFile(StagedFile&& other) noexcept
    : finalPath_(std::move(other.finalPath_)),
      temporaryPath_(std::move(other.temporaryPath_)),
      committed_(other.committed_) {
  other.committed_ = true;  // the moved-from object no longer owns a temporary
}

StagedFile::~StagedFile() {
  if (committed_) return;
  std::error_code ignored;
  std::filesystem::remove(temporaryPath_, ignored);
}

void StagedFile::commit() {
  std::error_code error;
  std::filesystem::rename(temporaryPath_, finalPath_, error);
  if (error)
    throw std::runtime_error(finalPath_ + ": cannot move the finished file into place from " +
                             temporaryPath_ + ": " + error.message());
  committed_ = true;
}

}  // namespace refhost
