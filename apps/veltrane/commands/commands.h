// The subcommands of `veltrane`: each takes the arguments after its name and returns the exit
// status. Errors leave as exceptions; the dispatcher turns them into one line on stderr.
#pragma once

#include <string>
#include <vector>

namespace veltrane_cli {

struct Command {
  const char* name;
  const char* summary;
  int (*run)(const std::vector<std::string>& args);
};

int runInfo(const std::vector<std::string>& args);
int runRender(const std::vector<std::string>& args);
int runSplit(const std::vector<std::string>& args);
int runInteract(const std::vector<std::string>& args);
int runBench(const std::vector<std::string>& args);
int runSoak(const std::vector<std::string>& args);
int runView(const std::vector<std::string>& args);
int runPlan(const std::vector<std::string>& args);
int runAssemble(const std::vector<std::string>& args);

}  // namespace veltrane_cli
