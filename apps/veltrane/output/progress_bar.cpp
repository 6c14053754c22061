// Drawing the progress bar.
#include "output/progress_bar.h"

#include <unistd.h>

#include <algorithm>
#include <cmath>

namespace veltrane_cli {
namespace {

constexpr int kCells = 30;
// Seconds between the lines written into a log.
constexpr int kLogInterval = 5;

}  // namespace

ProgressBar::ProgressBar(std::string label, int total, std::FILE* out, Style style)
    : label_(std::move(label)), total_(total), out_(out), style_(style) {
  if (style_ == Style::Auto) style_ = isatty(fileno(out_)) ? Style::Terminal : Style::Log;
  update(0);
}

ProgressBar::~ProgressBar() {
  if (drawn_ && style_ == Style::Terminal) std::fputc('\n', out_);
}

std::string ProgressBar::line(const std::string& label, int done, int total, int width,
                              double seconds) {
  done = std::clamp(done, 0, std::max(total, 0));
  int filled = total > 0 ? done * width / total : width;
  std::string digits = std::to_string(total);
  std::string count = std::to_string(done);
  count.insert(0, digits.size() - std::min(digits.size(), count.size()), ' ');
  std::string text = label + " [" + std::string(static_cast<std::size_t>(filled), '#') +
                     std::string(static_cast<std::size_t>(width - filled), '-') + "] " + count +
                     "/" + digits;
  if (seconds <= 0 || done <= 0) return text;
  const double rate = done / seconds;
  char tail[64];
  // Fixed widths, so a shorter figure never leaves characters of a longer one behind.
  std::snprintf(tail, sizeof tail, "  %6.1f fps  %5.0f s left", rate,
                std::ceil(std::max(total - done, 0) / rate));
  return text + tail;
}

void ProgressBar::update(int done) {
  if (total_ <= 1 || style_ == Style::Quiet) return;
  auto now = std::chrono::steady_clock::now();
  if (style_ == Style::Log) {
    // The start says nothing a log needs; then every few seconds, and the end.
    if (done == 0 || (done != total_ && now - shownAt_ < std::chrono::seconds(kLogInterval)))
      return;
    shownAt_ = now;
    const double seconds = std::chrono::duration<double>(now - started_).count();
    std::fprintf(out_, "%s\n", line(label_, done, total_, kCells, seconds).c_str());
    std::fflush(out_);
    return;
  }
  int cells = done * kCells / total_;
  // Redrawn when a cell fills, at the end and at most once a second for the rate, so a log
  // file does not fill up with it.
  if (cells == shownCells_ && done != total_ && now - shownAt_ < std::chrono::seconds(1)) return;
  shownCells_ = cells;
  shownAt_ = now;
  const double seconds = std::chrono::duration<double>(now - started_).count();
  std::fprintf(out_, "\r%s", line(label_, done, total_, kCells, seconds).c_str());
  std::fflush(out_);
  drawn_ = true;
}

}  // namespace veltrane_cli
