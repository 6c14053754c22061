// The host's file-system calls on POSIX systems.
#include <fcntl.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>

#include "refhost/platform/file_system.h"

namespace refhost::files {

long currentProcessId() { return static_cast<long>(getpid()); }

bool processRuns(long pid) { return kill(static_cast<pid_t>(pid), 0) == 0 || errno == EPERM; }

int createForWriting(const std::string& path) {
  return ::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
}

int openForReading(const std::string& path) { return ::open(path.c_str(), O_RDONLY | O_CLOEXEC); }

bool flushToDisk(int file) { return ::fsync(file) == 0; }

bool flushesFolders() { return true; }

bool makeFolder(const std::string& path) { return ::mkdir(path.c_str(), 0777) == 0; }

int openFolder(const std::string& path) {
  return ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
}

// One flush of the file system costs what one file's does, and a set may hold hundreds.
bool flushFolder(int folder) { return ::syncfs(folder) == 0; }

void closeFolder(int folder) { ::close(folder); }

bool replace(const std::string& from, const std::string& to) {
  return std::rename(from.c_str(), to.c_str()) == 0;
}

}  // namespace refhost::files
