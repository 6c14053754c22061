// The file-system calls of the host's checked outputs whose POSIX and Windows forms differ. Each
// reports failure as the POSIX call does: -1 or false, with errno set to the reason.
#pragma once

#include <string>

namespace refhost::files {

long currentProcessId();
// Whether a process of that id runs (or runs as someone else and refuses the probe).
bool processRuns(long pid);
// Binary files: created (or truncated) for writing, or opened for reading; -1 on failure.
int createForWriting(const std::string& path);
int openForReading(const std::string& path);
// Sends what was written to the file to the disk.
bool flushToDisk(int file);
bool makeFolder(const std::string& path);
// A handle that flushFolder sends every file of the folder's file system to the disk through;
// -1 on failure. Where folders cannot be flushed (flushesFolders() is false) the handle is a
// placeholder and each file must be flushed as it is written.
bool flushesFolders();
int openFolder(const std::string& path);
bool flushFolder(int folder);
void closeFolder(int folder);
// Renames `from` onto `to`, replacing a file there.
bool replace(const std::string& from, const std::string& to);

}  // namespace refhost::files
