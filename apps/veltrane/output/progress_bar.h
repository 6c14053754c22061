// Progress on stderr for work of several steps, with the rate so far and the time it leaves to
// go: on a terminal one line redrawn in place; into a log (not a terminal) a plain line every
// few seconds and one at the end, so the log holds no carriage returns; nothing when quiet.
#pragma once

#include <chrono>
#include <cstdio>
#include <string>

namespace veltrane_cli {

class ProgressBar {
 public:
  enum class Style { Auto, Terminal, Log, Quiet };
  // Shows nothing when `total` is 1 or less. Auto is Terminal when `out` is one, else Log.
  ProgressBar(std::string label, int total, std::FILE* out = stderr, Style style = Style::Auto);
  // Ends the line if anything was drawn.
  ~ProgressBar();
  ProgressBar(const ProgressBar&) = delete;
  ProgressBar& operator=(const ProgressBar&) = delete;

  // `done` steps of `total` are complete.
  void update(int done);

  // "label [#####-----]  5/10" for a bar of `width` cells; after `seconds` of work (when
  // positive and something is done) followed by "     2.5 fps      2 s left".
  static std::string line(const std::string& label, int done, int total, int width,
                          double seconds = 0);

 private:
  std::string label_;
  int total_;
  std::FILE* out_;
  Style style_;
  int shownCells_ = -1;
  bool drawn_ = false;
  std::chrono::steady_clock::time_point started_ = std::chrono::steady_clock::now();
  std::chrono::steady_clock::time_point shownAt_ = started_;
};

}  // namespace veltrane_cli
