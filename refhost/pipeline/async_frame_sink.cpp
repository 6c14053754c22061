// The queue, the writer threads and how their first error reaches the caller.
#include "refhost/pipeline/async_frame_sink.h"

#include <algorithm>

namespace refhost {

AsyncFrameSink::AsyncFrameSink(std::unique_ptr<FrameSink> inner, int workers,
                               std::size_t queueFrames, std::size_t queueBytes)
    : inner_(std::move(inner)),
      capacity_(std::max<std::size_t>(queueFrames, 1)),
      capacityBytes_(queueBytes) {
  const int count = inner_->concurrentWrites() ? std::max(workers, 1) : 1;
  for (int i = 0; i < count; ++i) threads_.emplace_back([this] { work(); });
}

AsyncFrameSink::~AsyncFrameSink() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    stopping_ = true;
    queue_.clear();
    queuedBytes_ = 0;
  }
  changed_.notify_all();
  for (std::thread& thread : threads_) thread.join();
}

void AsyncFrameSink::work() {
  std::unique_lock<std::mutex> lock(mutex_);
  for (;;) {
    changed_.wait(lock, [this] { return stopping_ || !queue_.empty(); });
    if (stopping_) return;
    Job job = std::move(queue_.front());
    queue_.pop_front();
    queuedBytes_ -= job.picture.pixels.size();
    ++busy_;
    changed_.notify_all();  // room in the queue
    lock.unlock();
    std::exception_ptr error;
    try {
      inner_->write(job.frame, job.picture);
    } catch (...) {
      error = std::current_exception();
    }
    job.picture = RgbaImage();  // freed outside the lock
    lock.lock();
    --busy_;
    if (error && !error_) {
      error_ = error;
      queue_.clear();  // nothing after a failed frame is worth writing
      queuedBytes_ = 0;
    }
    changed_.notify_all();
  }
}

void AsyncFrameSink::throwIfFailed() {
  if (error_) std::rethrow_exception(error_);
}

void AsyncFrameSink::write(int32_t frame, const RgbaImage& picture) {
  write(frame, RgbaImage(picture));
}

void AsyncFrameSink::write(int32_t frame, RgbaImage&& picture) {
  std::unique_lock<std::mutex> lock(mutex_);
  const std::size_t bytes = picture.pixels.size();
  changed_.wait(lock, [&] {
    return error_ || (queue_.size() < capacity_ &&
                      (queue_.empty() || queuedBytes_ + bytes <= capacityBytes_));
  });
  throwIfFailed();
  queuedBytes_ += bytes;
  queue_.push_back(Job{frame, std::move(picture)});
  changed_.notify_all();
}

std::vector<std::string> AsyncFrameSink::commit() {
  {
    std::unique_lock<std::mutex> lock(mutex_);
    changed_.wait(lock, [this] { return queue_.empty() && busy_ == 0; });
    throwIfFailed();
  }
  return inner_->commit();
}

}  // namespace refhost
