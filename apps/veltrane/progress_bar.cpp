// Drawing the progress bar.
#include "progress_bar.h"

#include <algorithm>

namespace veltrane_cli {
namespace {

constexpr int kCells = 30;

}  // namespace

ProgressBar::ProgressBar(std::string label, int total, std::FILE* out)
    : label_(std::move(label)), total_(total), out_(out) {
  update(0);
}

ProgressBar::~ProgressBar() {
  if (drawn_) std::fputc('\n', out_);
}

std::string ProgressBar::line(const std::string& label, int done, int total, int width) {
  done = std::clamp(done, 0, std::max(total, 0));
  int filled = total > 0 ? done * width / total : width;
  std::string digits = std::to_string(total);
  std::string count = std::to_string(done);
  count.insert(0, digits.size() - std::min(digits.size(), count.size()), ' ');
  return label + " [" + std::string(static_cast<std::size_t>(filled), '#') +
         std::string(static_cast<std::size_t>(width - filled), '-') + "] " + count + "/" + digits;
}

void ProgressBar::update(int done) {
  if (total_ <= 1) return;
  int cells = done * kCells / total_;
  // Redrawn only when a cell fills, and at the end, so a log file does not fill up with it.
  if (cells == shownCells_ && done != total_) return;
  shownCells_ = cells;
  std::fprintf(out_, "\r%s", line(label_, done, total_, kCells).c_str());
  std::fflush(out_);
  drawn_ = true;
}

}  // namespace veltrane_cli
