// A frame sink that writes behind the caller's back: frames wait in a queue bounded in frames
// and in bytes, and worker threads hand them to the sink underneath, so encoding or image writing
// overlaps the render of the frames after them.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <exception>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "refhost/pipeline/frame_output.h"

namespace refhost {

class AsyncFrameSink : public FrameSink {
 public:
  // `workers` threads write (one when the sink underneath cannot take concurrent writes);
  // write() blocks while `queueFrames` frames wait, or while the waiting frames and the new one
  // would hold more than `queueBytes` (one frame may always wait).
  AsyncFrameSink(std::unique_ptr<FrameSink> inner, int workers, std::size_t queueFrames,
                 std::size_t queueBytes = SIZE_MAX);
  // Stops the workers, dropping what waits, then lets the sink underneath delete what it wrote.
  ~AsyncFrameSink() override;
  AsyncFrameSink(const AsyncFrameSink&) = delete;
  AsyncFrameSink& operator=(const AsyncFrameSink&) = delete;

  // Queues a copy of the picture. The first error a worker met is thrown here (the same
  // exception the sink underneath threw), and by every later call.
  void write(int32_t frame, const RgbaImage& picture) override;
  // The same without the copy.
  void write(int32_t frame, RgbaImage&& picture) override;
  // Waits until every frame is written, throws the first error if there was one, then commits
  // the sink underneath.
  std::vector<std::string> commit() override;
  std::string note() const override { return inner_->note(); }
  int workers() const { return static_cast<int>(threads_.size()); }

 private:
  struct Job {
    int32_t frame;
    RgbaImage picture;
  };
  void work();
  void throwIfFailed();

  std::unique_ptr<FrameSink> inner_;
  const std::size_t capacity_;
  const std::size_t capacityBytes_;
  std::size_t queuedBytes_ = 0;
  std::mutex mutex_;
  std::condition_variable changed_;
  std::deque<Job> queue_;
  int busy_ = 0;  // workers writing a frame now
  bool stopping_ = false;
  std::exception_ptr error_;
  std::vector<std::thread> threads_;
};

}  // namespace refhost
