// The decode-ahead worker and the hand-over of its frames.
#include "refhost/pipeline/frame_prefetch.h"

#include <algorithm>
#include <chrono>

namespace refhost {

bool DecodeAheadBudget::take(std::size_t bytes) {
  std::lock_guard<std::mutex> lock(mutex_);
  if (bytes > capacity_ - used_) return false;
  used_ += bytes;
  return true;
}

void DecodeAheadBudget::giveBack(std::size_t bytes) {
  std::lock_guard<std::mutex> lock(mutex_);
  used_ -= std::min(bytes, used_);
}

std::size_t DecodeAheadBudget::inUse() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return used_;
}

PrefetchingSource::PrefetchingSource(std::shared_ptr<MediaSource> inner, int32_t depth,
                                     std::shared_ptr<DecodeAheadBudget> budget)
    : inner_(std::move(inner)),
      depth_(std::max(depth, 1)),
      budget_(std::move(budget)),
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
  dropWaiting(ready_.begin(), ready_.end());
}

std::size_t PrefetchingSource::frameBytes() const {
  return static_cast<std::size_t>(std::max(width_, 0)) *
         static_cast<std::size_t>(std::max(height_, 0)) * bytesPerPixel(format_);
}

void PrefetchingSource::dropWaiting(std::map<int32_t, Prepared>::iterator from,
                                    std::map<int32_t, Prepared>::iterator to) {
  if (budget_)
    for (auto it = from; it != to; ++it) budget_->giveBack(it->second.budgeted);
  ready_.erase(from, to);
}

void PrefetchingSource::work() {
  std::unique_lock<std::mutex> lock(mutex_);
  for (;;) {
    changed_.wait(lock, [this] {
      return stopping_ || (running_ && !failed_ && ready_.size() < static_cast<size_t>(depth_));
    });
    if (stopping_) return;
    Prepared prepared;
    // A frame before it is asked for needs room in the budget; without it the worker looks
    // again shortly (the room is made by other sources' frames being taken) or as soon as
    // this source is asked for a frame.
    if (budget_ && next_ > wanted_) {
      if (!budget_->take(frameBytes())) {
        changed_.wait_for(lock, std::chrono::milliseconds(5));
        continue;
      }
      prepared.budgeted = frameBytes();
    }
    const int32_t index = next_++;
    preparing_ = index;
    const uint64_t generation = generation_;
    const int32_t width = width_, height = height_;
    const PixelFormat format = format_;
    lock.unlock();
    try {
      prepared.rows = inner_->glRows(index, width, height, format);
    } catch (...) {
      prepared.error = std::current_exception();
    }
    lock.lock();
    // Dropped when the caller has started over or moved past it meanwhile.
    if (generation != generation_ || index < wanted_) {
      if (budget_) budget_->giveBack(prepared.budgeted);
      if (generation == generation_) preparing_.reset();
      continue;
    }
    preparing_.reset();
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

void PrefetchingSource::restart(int32_t index, int32_t width, int32_t height, PixelFormat format) {
  dropWaiting(ready_.begin(), ready_.end());
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
  dropWaiting(ready_.begin(), ready_.lower_bound(index));
  next_ = std::max(next_, index);
  changed_.notify_all();
  changed_.wait(lock, [&] { return ready_.count(index) > 0; });
  Prepared prepared = std::move(ready_[index]);
  ready_.erase(index);
  // Handed over, the frame is the caller's and leaves the budget.
  if (budget_) budget_->giveBack(prepared.budgeted);
  changed_.notify_all();
  if (prepared.error) {
    // The worker waits at a failed frame; asked again, it starts over there and fails anew.
    running_ = false;
    std::rethrow_exception(prepared.error);
  }
  return std::move(prepared.rows);
}

}  // namespace refhost
