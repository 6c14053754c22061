// Output files written under hidden temporary names beside their final names and moved into
// place only when complete, so that nothing half-written ever appears under a final name and a
// file already there stays as it was until its replacement is whole.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace refhost {

// Writes the bytes to `path` (created, or emptied), flushes them to the disk and closes the
// file, checking every step. Throws std::runtime_error that starts with `shownName` (the name
// the user knows the file by) and gives the system's reason, e.g. "No space left on device".
void writeFileContents(const std::string& path, const std::string& shownName, const void* data,
                       std::size_t size);

// Flushes a file that someone else (an encoder library) wrote and closed to the disk; throws as
// writeFileContents.
void syncFile(const std::string& path, const std::string& shownName);

// Temporaries carry the process id, ".<name>.partial-<pid>-<n>", so that one left behind by a
// process that was killed outright is recognisable: staging a name first deletes those of
// processes that no longer run. Names too long to take the suffix are shortened with a hash.
void removeStaleTemporaries(const std::string& finalPath);

class StagedFile {
 public:
  // Picks a temporary name in the directory of `finalPath` and deletes stale ones; creates
  // nothing yet.
  explicit StagedFile(std::string finalPath);
  // An uncommitted temporary is deleted.
  ~StagedFile();
  StagedFile(StagedFile&& other) noexcept;
  StagedFile& operator=(StagedFile&&) = delete;
  StagedFile(const StagedFile&) = delete;
  StagedFile& operator=(const StagedFile&) = delete;

  const std::string& temporaryPath() const { return temporaryPath_; }
  const std::string& finalPath() const { return finalPath_; }
  // Writes the whole temporary as writeFileContents does; errors name the final path.
  void write(const void* data, std::size_t size);
  void write(const std::string& text) { write(text.data(), text.size()); }
  // Renames the temporary onto the final name (replacing what was there). Throws
  // std::runtime_error naming the final path when the rename fails.
  void commit();

 private:
  std::string finalPath_;
  std::string temporaryPath_;
  bool committed_ = false;
};

// Replaces `path` by the text in one step: the file holds either what it held before or all
// of the text, never a part. Throws std::runtime_error naming the path and the reason.
void writeFileAtomically(const std::string& path, const std::string& text);

// Several files of one folder (the frames of a sequence) staged in one hidden folder beside
// them and moved into place together: all of them, or none.
class StagedFileSet {
 public:
  // Creates the hidden folder beside `name` (the set's name as the user gave it, a frame-name
  // pattern for a sequence) and deletes stale ones. Throws naming `name` when it cannot.
  explicit StagedFileSet(std::string name);
  // Deletes the hidden folder and all in it unless committed.
  ~StagedFileSet();
  StagedFileSet(const StagedFileSet&) = delete;
  StagedFileSet& operator=(const StagedFileSet&) = delete;

  // Writes the file that will go to `finalPath`, a name in the folder of the set's name; the
  // data goes to the disk, for all files at once, at the commit.
  void write(const std::string& finalPath, const void* data, std::size_t size);
  // Moves every file onto its final name in the order written. When one cannot be moved (a
  // folder has its name, the disk is full), those already moved are taken back out and the
  // files they replaced restored, and std::runtime_error names the file. Returns the names.
  std::vector<std::string> commit();

 private:
  struct Entry {
    std::string finalPath;
    std::string stagedPath;
    std::string previousPath;  // where the file it replaces is kept until the commit is whole
    bool replaced = false;     // a file had the final name and was set aside
  };
  void place(Entry& entry);
  static void restore(const Entry& entry);

  std::string name_;
  std::string folder_;
  int folderHandle_ = -1;  // open from the start, so the flush at the commit reports any
                           // write-back failure since then
  std::vector<Entry> entries_;
  bool committed_ = false;
};

}  // namespace refhost
