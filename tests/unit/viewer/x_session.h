// Real windows for tests: a private Xvfb server, programs started on it (the viewer, xdotool,
// ImageMagick's import) and screenshots of its root window.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "refhost/media/rgba_image.h"
#include "support/child_process.h"

using testsupport::ChildProcess;
using testsupport::waitUntil;

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

// Where `picture` appears pixel for pixel in `screen` (its top-left corner), judged on a grid of
// pixels at least `margin` from the picture's edges; false when it does not.
bool findPicture(const refhost::RgbaImage& screen, const refhost::RgbaImage& picture, int margin,
                 int& x, int& y);
