// Runs the `veltrane` command line as a separate process and captures what it printed.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "support/temp_paths.h"

using testsupport::ScratchDirectory;

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
