// Checked writes, temporary names that stay within file-name limits and name their process,
// and rename on commit (all or nothing for a set).
#include "refhost/platform/staged_file.h"

#ifndef _WIN32
#include <unistd.h>
#else
#include <io.h>
#endif

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <stdexcept>
#include <system_error>

#include "refhost/platform/file_system.h"

namespace fs = std::filesystem;

namespace refhost {
namespace {

std::atomic<unsigned> stagedCount{0};

[[noreturn]] void fail(const std::string& shownName, const std::string& what, int error) {
  throw std::runtime_error(shownName + ": " + what + ": " + std::system_category().message(error));
}

// Room for ".", ".partial-", a process id and a count within the 255 bytes most file systems
// allow a name.
constexpr std::size_t kLongestStem = 200;

// The file name a temporary is derived from: a name longer than kLongestStem keeps its start
// (cut between UTF-8 characters) and gets a hash of the whole, so that the same output name
// always gives the same prefix.
std::string stemOf(const std::string& name) {
  if (name.size() <= kLongestStem) return name;
  std::uint64_t hash = 14695981039346656037ull;  // FNV-1a
  for (unsigned char c : name) hash = (hash ^ c) * 1099511628211ull;
  char hex[17];
  std::snprintf(hex, sizeof hex, "%016llx", static_cast<unsigned long long>(hash));
  std::size_t keep = kLongestStem - sizeof hex;
  while (keep > 0 && (static_cast<unsigned char>(name[keep]) & 0xC0) == 0x80) --keep;
  return name.substr(0, keep) + "~" + hex;
}

std::string temporaryPrefix(const fs::path& target) {
  return "." + stemOf(target.filename().string()) + ".partial-";
}

// A hidden name in the same directory, so that the rename stays on one file system.
std::string temporaryPathFor(const std::string& finalPath) {
  fs::path target(finalPath);
  std::string name = temporaryPrefix(target) + std::to_string(files::currentProcessId()) + "-" +
                     std::to_string(stagedCount++);
  return (target.parent_path() / name).string();
}

// The process id in "<pid>-<n>", or 0 when the rest of a name is not of that form.
long ownerOf(const std::string& rest) {
  const char* digits = "0123456789";
  std::size_t dash = rest.find_first_not_of(digits);
  if (dash == 0 || dash > 9 || rest[dash] != '-' || dash + 1 == rest.size() ||
      rest.find_first_not_of(digits, dash + 1) != std::string::npos)
    return 0;
  return std::stol(rest.substr(0, dash));
}

// Writes and closes the file, checking both; with `flush`, the data goes to the disk first.
void writeWhole(const std::string& path, const std::string& shownName, const void* data,
                std::size_t size, bool flush) {
  int file = files::createForWriting(path);
  if (file < 0) fail(shownName, "cannot create the file", errno);
  const char* next = static_cast<const char*>(data);
  while (size > 0) {
    // Pieces of at most 1 GiB: Windows counts a write's bytes in an unsigned int.
    const auto written =
        ::write(file, next, static_cast<unsigned>(std::min<std::size_t>(size, 1u << 30)));
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) {
      int error = written < 0 ? errno : ENOSPC;  // a regular file takes nothing only when full
      ::close(file);
      fail(shownName, "cannot write", error);
    }
    next += written;
    size -= static_cast<std::size_t>(written);
  }
  // Some file systems (network ones, or any on a delayed write-back) report a full disk only
  // when the data goes out; the rename must not replace a good file with one that never arrives.
  if (flush && !files::flushToDisk(file)) {
    int error = errno;
    ::close(file);
    fail(shownName, "cannot write", error);
  }
  if (::close(file) != 0) fail(shownName, "cannot write", errno);
}

// Flushes everything written to the file system of the open folder to the disk, reporting a
// write-back failure that happened on it since the folder was opened.
void flushFileSystem(int folder, const std::string& shownName) {
  if (!files::flushFolder(folder)) fail(shownName, "cannot write", errno);
}

}  // namespace

void writeFileContents(const std::string& path, const std::string& shownName, const void* data,
                       std::size_t size) {
  writeWhole(path, shownName, data, size, true);
}

void syncFile(const std::string& path, const std::string& shownName) {
  int file = files::openForReading(path);
  if (file < 0) fail(shownName, "cannot reopen the written file", errno);
  bool synced = files::flushToDisk(file);
  int error = errno;
  bool closed = ::close(file) == 0;
  if (synced && !closed) error = errno;
  if (!synced || !closed) fail(shownName, "cannot write", error);
}

void removeStaleTemporaries(const std::string& finalPath) {
  fs::path target(finalPath);
  std::string prefix = temporaryPrefix(target);
  fs::path folder = target.parent_path().empty() ? fs::path(".") : target.parent_path();
  std::vector<fs::path> stale;
  std::error_code error;
  for (fs::directory_iterator it(folder, error), end; !error && it != end; it.increment(error)) {
    std::string name = it->path().filename().string();
    if (name.compare(0, prefix.size(), prefix) != 0) continue;
    long owner = ownerOf(name.substr(prefix.size()));
    if (owner > 0 && !files::processRuns(owner)) stale.push_back(it->path());
  }
  for (const fs::path& path : stale) fs::remove_all(path, error);  // best effort
}

StagedFile::StagedFile(std::string finalPath) : finalPath_(std::move(finalPath)) {
  removeStaleTemporaries(finalPath_);
  temporaryPath_ = temporaryPathFor(finalPath_);
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
  fs::remove(temporaryPath_, ignored);
}

void StagedFile::write(const void* data, std::size_t size) {
  writeFileContents(temporaryPath_, finalPath_, data, size);
}

void StagedFile::commit() {
  if (!files::replace(temporaryPath_, finalPath_))
    fail(finalPath_, "cannot move the finished file into place", errno);
  committed_ = true;
}

void writeFileAtomically(const std::string& path, const std::string& text) {
  StagedFile file(path);
  file.write(text);
  file.commit();
}

StagedFileSet::StagedFileSet(std::string name) : name_(std::move(name)) {
  removeStaleTemporaries(name_);
  folder_ = temporaryPathFor(name_);
  if (!files::makeFolder(folder_)) fail(name_, "cannot create files here", errno);
  folderHandle_ = files::openFolder(folder_);
  if (folderHandle_ < 0) {
    int error = errno;
    std::error_code ignored;
    fs::remove(folder_, ignored);
    fail(name_, "cannot open the folder of files", error);
  }
}

StagedFileSet::~StagedFileSet() {
  files::closeFolder(folderHandle_);
  if (committed_) return;
  std::error_code ignored;
  fs::remove_all(folder_, ignored);
}

void StagedFileSet::write(const std::string& finalPath, const void* data, std::size_t size) {
  // Short names inside the hidden folder: a final name may already be near the length limit.
  std::string staged = folder_ + "/" + std::to_string(entries_.size());
  entries_.push_back({finalPath, staged, staged + "-previous"});
  // Flushed together at the commit where the file system allows: one flush of it costs what one
  // file's does, and a sequence has hundreds.
  writeWhole(staged, finalPath, data, size, !files::flushesFolders());
}

void StagedFileSet::place(Entry& entry) {
  // Setting a folder aside would move it into the hidden folder that the commit deletes.
  if (fs::is_directory(fs::symlink_status(entry.finalPath)))
    fail(entry.finalPath, "cannot replace it", EISDIR);
  // The file being replaced is kept (by a rename, which costs no space) until every file of the
  // set is in place.
  if (std::rename(entry.finalPath.c_str(), entry.previousPath.c_str()) == 0)
    entry.replaced = true;
  else if (errno != ENOENT)
    fail(entry.finalPath, "cannot move the previous file aside", errno);
  if (std::rename(entry.stagedPath.c_str(), entry.finalPath.c_str()) != 0) {
    int error = errno;
    if (entry.replaced) std::rename(entry.previousPath.c_str(), entry.finalPath.c_str());
    fail(entry.finalPath, "cannot move the finished file into place", error);
  }
}

void StagedFileSet::restore(const Entry& entry) {
  if (entry.replaced)
    std::rename(entry.previousPath.c_str(), entry.finalPath.c_str());
  else
    std::remove(entry.finalPath.c_str());
}

std::vector<std::string> StagedFileSet::commit() {
  flushFileSystem(folderHandle_, name_);
  std::size_t placed = 0;
  try {
    for (; placed < entries_.size(); ++placed) place(entries_[placed]);
  } catch (...) {
    while (placed > 0) restore(entries_[--placed]);
    throw;
  }
  committed_ = true;
  std::error_code ignored;
  fs::remove_all(folder_, ignored);  // the replaced files
  std::vector<std::string> names;
  for (const Entry& entry : entries_) names.push_back(entry.finalPath);
  return names;
}

}  // namespace refhost
