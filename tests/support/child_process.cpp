#include "support/child_process.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <stdexcept>
#include <thread>

extern char** environ;

namespace testsupport {

namespace {

std::vector<char*> pointers(std::vector<std::string>& texts) {
  std::vector<char*> result;
  for (std::string& text : texts) result.push_back(text.data());
  result.push_back(nullptr);
  return result;
}

}  // namespace

ChildProcess::ChildProcess(const std::vector<std::string>& argv, const std::string& outPath,
                           const std::string& errPath,
                           const std::vector<std::string>* environment) {
  std::vector<std::string> args = argv, variables;
  if (environment) variables = *environment;
  std::vector<char*> argp = pointers(args), envp = pointers(variables);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  const int flags = O_WRONLY | O_CREAT | O_TRUNC;
  posix_spawn_file_actions_addopen(&actions, 1, outPath.c_str(), flags, 0644);
  posix_spawn_file_actions_addopen(&actions, 2, errPath.c_str(), flags, 0644);
  const int failed = posix_spawnp(&pid_, argp[0], &actions, nullptr, argp.data(),
                                  environment ? envp.data() : environ);
  posix_spawn_file_actions_destroy(&actions);
  if (failed) throw std::runtime_error("cannot start " + argv[0] + ": " + std::strerror(failed));
}

ChildProcess::~ChildProcess() {
  if (pid_ <= 0) return;
  kill(pid_, SIGTERM);
  if (wait(5) == -1 && pid_ > 0) {
    kill(pid_, SIGKILL);
    waitpid(pid_, nullptr, 0);
  }
}

int ChildProcess::wait(double seconds) {
  int status = 0;
  if (!waitUntil([&] { return waitpid(pid_, &status, WNOHANG) == pid_; }, seconds)) return -1;
  pid_ = -1;
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

std::vector<std::string> environmentWithout(std::initializer_list<std::string> names) {
  std::vector<std::string> kept;
  for (char** entry = environ; *entry; ++entry) {
    const std::string text = *entry;
    if (std::find(names.begin(), names.end(), text.substr(0, text.find('='))) == names.end())
      kept.push_back(text);
  }
  return kept;
}

bool waitUntil(const std::function<bool()>& condition, double seconds) {
  const auto end = std::chrono::steady_clock::now() + std::chrono::duration<double>(seconds);
  while (!condition()) {
    if (std::chrono::steady_clock::now() > end) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  return true;
}

}  // namespace testsupport
