// The host's file-system calls on Windows.
#include <direct.h>
#include <fcntl.h>
#include <io.h>
#include <process.h>
#include <windows.h>

#include <cerrno>

#include "refhost/platform/file_system.h"

namespace refhost::files {

long currentProcessId() { return static_cast<long>(_getpid()); }

bool processRuns(long pid) {
  HANDLE process = OpenProcess(PROCESS_QUERY_LIMITED_INFORMATION, FALSE, static_cast<DWORD>(pid));
  if (!process) return GetLastError() == ERROR_ACCESS_DENIED;
  DWORD code = 0;
  const bool running = GetExitCodeProcess(process, &code) && code == STILL_ACTIVE;
  CloseHandle(process);
  return running;
}

int createForWriting(const std::string& path) {
  return _open(path.c_str(), _O_WRONLY | _O_CREAT | _O_TRUNC | _O_BINARY | _O_NOINHERIT, 0666);
}

int openForReading(const std::string& path) {
  return _open(path.c_str(), _O_RDONLY | _O_BINARY | _O_NOINHERIT);
}

bool flushToDisk(int file) { return _commit(file) == 0; }

bool flushesFolders() { return false; }

bool makeFolder(const std::string& path) { return _mkdir(path.c_str()) == 0; }

// Folders cannot be opened like files here: each file of a set is flushed as it is written.
int openFolder(const std::string&) { return 0; }

bool flushFolder(int) { return true; }

void closeFolder(int) {}

bool replace(const std::string& from, const std::string& to) {
  if (MoveFileExA(from.c_str(), to.c_str(), MOVEFILE_REPLACE_EXISTING)) return true;
  errno = GetLastError() == ERROR_ACCESS_DENIED ? EACCES : EIO;
  return false;
}

}  // namespace refhost::files
