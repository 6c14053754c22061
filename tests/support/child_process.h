// Programs started by tests (the command line, Xvfb, xdotool), their output going to files.
#pragma once

#include <sys/types.h>

#include <functional>
#include <initializer_list>
#include <string>
#include <vector>

namespace testsupport {

// A program started with posix_spawnp; killed if still running when the object goes.
class ChildProcess {
 public:
  // `environment` is the child's whole environment ("NAME=value"); none given: this process's.
  explicit ChildProcess(const std::vector<std::string>& argv,
                        const std::string& outPath = "/dev/null",
                        const std::string& errPath = "/dev/null",
                        const std::vector<std::string>* environment = nullptr);
  ~ChildProcess();
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  pid_t pid() const { return pid_; }
  // The exit status, or -1 when it did not exit normally within the time.
  int wait(double seconds);

 private:
  pid_t pid_ = -1;
};

// This process's environment ("NAME=value") without the variables named.
std::vector<std::string> environmentWithout(std::initializer_list<std::string> names);

// Polls until the condition holds; false after `seconds`.
bool waitUntil(const std::function<bool()>& condition, double seconds);

}  // namespace testsupport
