// A one-line progress bar on stderr for work of several steps, redrawn in place.
#pragma once

#include <cstdio>
#include <string>

namespace veltrane_cli {

class ProgressBar {
 public:
  // Shows nothing when `total` is 1 or less.
  ProgressBar(std::string label, int total, std::FILE* out = stderr);
  // Ends the line if anything was drawn.
  ~ProgressBar();
  ProgressBar(const ProgressBar&) = delete;
  ProgressBar& operator=(const ProgressBar&) = delete;

  // `done` steps of `total` are complete.
  void update(int done);

  // "label [#####-----]  5/10" for a bar of `width` cells.
  static std::string line(const std::string& label, int done, int total, int width);

 private:
  std::string label_;
  int total_;
  std::FILE* out_;
  int shownCells_ = -1;
  bool drawn_ = false;
};

}  // namespace veltrane_cli
