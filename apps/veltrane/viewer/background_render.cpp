// The render child on a pseudo-terminal, and reading its progress bar.
#include "viewer/background_render.h"

#include <fcntl.h>
#include <pty.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <regex>
#include <stdexcept>

#include "refhost/platform/shared_library.h"

namespace veltrane_viewer {

BackgroundRender::BackgroundRender(const std::vector<std::string>& renderArguments) {
  std::vector<std::string> argv{refhost::executablePath(), "render"};
  argv.insert(argv.end(), renderArguments.begin(), renderArguments.end());
  std::vector<char*> pointers;
  for (std::string& argument : argv) pointers.push_back(argument.data());
  pointers.push_back(nullptr);
  child_ = forkpty(&terminal_, nullptr, nullptr, nullptr);
  if (child_ < 0)
    throw std::runtime_error(std::string("cannot start the render: ") + std::strerror(errno));
  if (child_ == 0) {
    execv(pointers[0], pointers.data());
    _exit(127);
  }
  fcntl(terminal_, F_SETFL, fcntl(terminal_, F_GETFL) | O_NONBLOCK);
}

BackgroundRender::~BackgroundRender() {
  if (!finished_) {
    stop();
    waitpid(child_, nullptr, 0);
  }
  if (terminal_ >= 0) close(terminal_);
}

void BackgroundRender::stop() {
  if (!finished_) kill(child_, SIGINT);
}

bool BackgroundRender::poll() {
  if (finished_) return false;
  char buffer[4096];
  for (ssize_t n; (n = read(terminal_, buffer, sizeof buffer)) > 0;)
    take(std::string(buffer, static_cast<std::size_t>(n)));
  int status = 0;
  if (waitpid(child_, &status, WNOHANG) != child_) return true;
  // What it printed last is read once it has ended (its terminal then reports EIO).
  for (ssize_t n; (n = read(terminal_, buffer, sizeof buffer)) > 0;)
    take(std::string(buffer, static_cast<std::size_t>(n)));
  take("\n");
  finished_ = true;
  status_ = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
  return false;
}

// Lines end in "\r\n" on a terminal; the progress bar redraws itself after a "\r".
void BackgroundRender::take(const std::string& text) {
  static const std::regex progress(R"(\[[#-]*\] *([0-9]+)/([0-9]+))");
  pending_ += text;
  std::string::size_type end;
  while ((end = pending_.find_first_of("\r\n")) != std::string::npos) {
    const std::string piece = pending_.substr(0, end);
    pending_.erase(0, end + 1);
    std::smatch found;
    if (std::regex_search(piece, found, progress)) {
      done_ = std::stoi(found[1]);
      total_ = std::stoi(found[2]);
    } else if (!piece.empty()) {
      lastLine_ = piece;
    }
  }
}

}  // namespace veltrane_viewer
