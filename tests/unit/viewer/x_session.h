// Real windows for tests: a private Xvfb server, programs started on it (the viewer, xdotool,
// ImageMagick's import) and screenshots of its root window.
#pragma once

#include <sys/types.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "refhost/rgba_image.h"

// A program run with posix_spawn, its output going to files; killed if still running at the end.
class ChildProcess {
 public:
  explicit ChildProcess(const std::vector<std::string>& argv,
                        const std::string& outPath = "/dev/null",
                        const std::string& errPath = "/dev/null");
  ~ChildProcess();
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;
  // The exit status, or -1 when it did not exit normally within the time.
  int wait(double seconds);

 private:
  pid_t pid_ = -1;
};

// Starts Xvfb on a free display, 1600x1000x24, and makes it this process's DISPLAY, so that
// every program started afterwards shows its windows there.
class XSession {
 public:
  XSession();
  // Runs the tool and waits; throws when it fails.
  void run(const std::vector<std::string>& argv) const;
  refhost::RgbaImage screenshot(const std::string& scratchDirectory) const;

 private:
  std::unique_ptr<ChildProcess> server_;
};

// Polls until the condition holds; false after `seconds`.
bool waitUntil(const std::function<bool()>& condition, double seconds);

// Where `picture` appears pixel for pixel in `screen` (its top-left corner), judged on a grid of
// pixels at least `margin` from the picture's edges; false when it does not.
bool findPicture(const refhost::RgbaImage& screen, const refhost::RgbaImage& picture, int margin,
                 int& x, int& y);
