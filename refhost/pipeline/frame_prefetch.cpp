// The decode-ahead worker and the hand-over of its frames.
#include "refhost/pipeline/frame_prefetch.h"

#include <algorithm>

namespace refhost {

PrefetchingSource::PrefetchingSource(std::shared_ptr<MediaSource> inner, int32_t depth,
                                     std::size_t budgetBytes)
    : inner_(std::move(inner)),
      depth_(std::max(depth, 1)),
      budgetBytes_(budgetBytes),
      frameCount_(inner_->frameCount()),
      info_(inner_->info()),
      worker_([this] { work(); }) {}

PrefetchingSource::~PrefetchingSource() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    stopping_ = true;
  }
  changed_.notify_all();
  worker_.join();
}

void PrefetchingSource::work() {
  std::unique_lock<std::mutex> lock(mutex_);
  for (;;) {
    changed_.wait(lock, [this] {
      return stopping_ ||
             (running_ && !failed_ && ready_.size() < static_cast<size_t>(waitingLimit()));
    });
    if (stopping_) return;
    const int32_t index = next_++;
    preparing_ = index;
    const uint64_t generation = generation_;
    const int32_t width = width_, height = height_;
    const PixelFormat format = format_;
    lock.unlock();
    Prepared prepared;
    try {
      prepared.rows = inner_->glRows(index, width, height, format);
    } catch (...) {
      prepared.error = std::current_exception();
    }
    lock.lock();
    // Dropped when the caller has started over or moved past it meanwhile.
    if (generation != generation_) continue;
    preparing_.reset();
    if (index < wanted_) continue;
    if (prepared.error) {
      failed_ = true;
      failedAt_ = index;
    }
    ready_[index] = std::move(prepared);
    changed_.notify_all();
  }
}

bool PrefetchingSource::onCourse(int32_t index, int32_t width, int32_t height,
                                 PixelFormat format) const {
  if (!running_ || width != width_ || height != height_ || format != format_) return false;
  if (failed_ && failedAt_ < index) return false;
  // The lowest frame still to come: the oldest waiting, the one being prepared or the next.
  int32_t lowest = preparing_.value_or(next_);
  if (!ready_.empty()) lowest = std::min(lowest, ready_.begin()->first);
  return index >= lowest && index < next_ + depth_;
}

int32_t PrefetchingSource::waitingLimit() const {
  const std::size_t frameBytes = static_cast<std::size_t>(std::max(width_, 1)) *
                                 static_cast<std::size_t>(std::max(height_, 1)) *
                                 bytesPerPixel(format_);
  const std::size_t fitting = std::max<std::size_t>(budgetBytes_ / frameBytes, 1);
  return static_cast<int32_t>(std::min<std::size_t>(fitting, static_cast<std::size_t>(depth_)));
}

void PrefetchingSource::restart(int32_t index, int32_t width, int32_t height, PixelFormat format) {
  ready_.clear();
  width_ = width;
  height_ = height;
  format_ = format;
  next_ = index;
  preparing_.reset();  // whatever the worker is on now is dropped
  ++generation_;
  running_ = true;
  failed_ = false;
}

std::vector<uint8_t> PrefetchingSource::glRows(int32_t index, int32_t width, int32_t height,
                                               PixelFormat format) {
  std::unique_lock<std::mutex> lock(mutex_);
  if (!onCourse(index, width, height, format)) restart(index, width, height, format);
  // Frames before this one are not wanted any more; dropping them lets the worker go on, and
  // it skips straight to this one if it is not there yet.
  wanted_ = index;
  ready_.erase(ready_.begin(), ready_.lower_bound(index));
  next_ = std::max(next_, index);
  changed_.notify_all();
  changed_.wait(lock, [&] { return ready_.count(index) > 0; });
  Prepared prepared = std::move(ready_[index]);
  ready_.erase(index);
  changed_.notify_all();
  if (prepared.error) {
    // The worker waits at a failed frame; asked again, it starts over there and fails anew.
    running_ = false;
    std::rethrow_exception(prepared.error);
  }
  return std::move(prepared.rows);
}

RgbaImage PrefetchingSource::frame(int32_t index, int32_t width, int32_t height,
                                   PixelFormat format) {
  RgbaImage image(width, height, format);
  image.pixels = flipRows(glRows(index, width, height, format), image.width, image.height);
  return image;
}

}  // namespace refhost
