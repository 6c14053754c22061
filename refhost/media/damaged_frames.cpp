// Counting a media file's damaged frames across its readers.
#include "refhost/media/damaged_frames.h"

namespace refhost {

void DamagedFrames::record(int32_t frame, const std::string& reason) {
  std::lock_guard<std::mutex> lock(mutex_);
  frames_.insert(frame);
  if (reason_.empty()) reason_ = reason;
}

int32_t DamagedFrames::count() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return static_cast<int32_t>(frames_.size());
}

int32_t DamagedFrames::first() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return frames_.empty() ? -1 : *frames_.begin();
}

std::string DamagedFrames::reason() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return reason_;
}

}  // namespace refhost
