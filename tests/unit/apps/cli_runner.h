// Runs the `veltrane` command line as a separate process and captures what it printed; plus a
// scratch directory that removes itself.
#pragma once

#include <functional>
#include <string>
#include <vector>

struct CliRun {
  int status = -1;  // exit status; -1 when the process did not exit normally
  std::string out;
  std::string err;
};

// Runs the command line with the arguments; `plugin` sets VELTRANE_PLUGIN when not null (it is
// unset otherwise). `whileRunning`, when given, gets the process id before the wait.
CliRun runCli(const std::vector<std::string>& args, const char* plugin = nullptr,
              const std::function<void(int)>& whileRunning = nullptr);

std::string slurp(const std::string& path);
void writeText(const std::string& path, const std::string& text);

class ScratchDirectory {
 public:
  ScratchDirectory();
  ~ScratchDirectory();
  ScratchDirectory(const ScratchDirectory&) = delete;
  ScratchDirectory& operator=(const ScratchDirectory&) = delete;

  const std::string& path() const { return path_; }
  std::string file(const std::string& name) const { return path_ + "/" + name; }
  // Names of the entries, hidden ones included, sorted.
  std::vector<std::string> entries() const;

 private:
  std::string path_;
};
