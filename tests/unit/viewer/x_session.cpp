// Xvfb, child processes and screenshots for the window tests.
#include "x_session.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <stdexcept>
#include <thread>

#include "refhost/image_files.h"

extern char** environ;

ChildProcess::ChildProcess(const std::vector<std::string>& argv, const std::string& outPath,
                           const std::string& errPath) {
  std::vector<std::string> args = argv;
  std::vector<char*> argp;
  for (std::string& arg : args) argp.push_back(arg.data());
  argp.push_back(nullptr);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 1, outPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC,
                                   0644);
  posix_spawn_file_actions_addopen(&actions, 2, errPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC,
                                   0644);
  int failed = posix_spawnp(&pid_, argp[0], &actions, nullptr, argp.data(), environ);
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
  bool exited = waitUntil([&] { return waitpid(pid_, &status, WNOHANG) == pid_; }, seconds);
  if (!exited) return -1;
  pid_ = -1;
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

bool waitUntil(const std::function<bool()>& condition, double seconds) {
  auto end = std::chrono::steady_clock::now() + std::chrono::duration<double>(seconds);
  while (!condition()) {
    if (std::chrono::steady_clock::now() > end) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
  }
  return true;
}

XSession::XSession() {
  int pipe_[2];
  if (pipe(pipe_) != 0) throw std::runtime_error("cannot make a pipe for Xvfb");
  // Xvfb picks a free display and writes its number to the pipe once it takes connections.
  server_ = std::make_unique<ChildProcess>(
      std::vector<std::string>{"Xvfb", "-displayfd", std::to_string(pipe_[1]), "-screen", "0",
                               "1600x1000x24", "-nolisten", "tcp"});
  close(pipe_[1]);
  std::string number;
  char c = 0;
  while (read(pipe_[0], &c, 1) == 1 && c != '\n') number += c;
  close(pipe_[0]);
  if (number.empty())
    throw std::runtime_error("Xvfb did not start (is the xvfb package installed?)");
  setenv("DISPLAY", (":" + number).c_str(), 1);
}

void XSession::run(const std::vector<std::string>& argv) const {
  ChildProcess tool(argv);
  if (tool.wait(30) != 0) throw std::runtime_error(argv[0] + " failed");
}

refhost::RgbaImage XSession::screenshot(const std::string& scratchDirectory) const {
  std::string path = scratchDirectory + "/screen.png";
  run({"import", "-window", "root", path});
  return refhost::readImageFile(path);
}

bool findPicture(const refhost::RgbaImage& screen, const refhost::RgbaImage& picture, int margin,
                 int& x, int& y) {
  std::vector<std::pair<int, int>> samples;
  for (int j = 0; j < 5; ++j) {
    for (int i = 0; i < 7; ++i)
      samples.emplace_back(margin + i * (picture.width - 2 * margin) / 6,
                           margin + j * (picture.height - 2 * margin) / 4);
  }
  auto sameRgb = [](const uint8_t* a, const uint8_t* b) { return std::memcmp(a, b, 3) == 0; };
  for (y = 0; y + picture.height <= screen.height; ++y) {
    for (x = 0; x + picture.width <= screen.width; ++x) {
      int misses = 0;  // an overlay handle may cover a sample or two
      for (const auto& [sx, sy] : samples) {
        if (!sameRgb(screen.at(x + sx, y + sy), picture.at(sx, sy)) && ++misses > 2) break;
      }
      if (misses <= 2) return true;
    }
  }
  return false;
}
