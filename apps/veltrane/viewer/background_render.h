// A render of the scene as the viewer shows it, made by a `veltrane render` child process so
// that the window stays responsive: its progress and its last line read back as it runs.
#pragma once

#include <sys/types.h>

#include <string>
#include <vector>

namespace veltrane_viewer {

class BackgroundRender {
 public:
  // Starts `veltrane render` (this program) with the arguments, on a terminal of its own so that
  // it draws its progress bar. Throws std::runtime_error when it cannot be started.
  explicit BackgroundRender(const std::vector<std::string>& renderArguments);
  // Stops a render still running (as Ctrl-C does: nothing is left half-written) and waits.
  ~BackgroundRender();
  BackgroundRender(const BackgroundRender&) = delete;
  BackgroundRender& operator=(const BackgroundRender&) = delete;

  // Reads what the render printed since the last call; true while it runs.
  bool poll();
  // Frames done and to do, from its progress bar (0 of 0 before it draws one).
  int done() const { return done_; }
  int total() const { return total_; }
  // Its last complete line ("wrote ...", or why it failed), and whether it succeeded.
  const std::string& lastLine() const { return lastLine_; }
  bool succeeded() const { return finished_ && status_ == 0; }
  bool finished() const { return finished_; }
  // Asks it to stop; poll() then reports its end.
  void stop();

 private:
  void take(const std::string& text);

  pid_t child_ = -1;
  int terminal_ = -1;  // our side of its terminal
  std::string pending_;
  std::string lastLine_;
  int done_ = 0;
  int total_ = 0;
  int status_ = -1;
  bool finished_ = false;
};

}  // namespace veltrane_viewer
