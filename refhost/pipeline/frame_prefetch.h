// A media source that decodes ahead: a worker thread prepares the frames after the last one
// asked for, so that a render going forward through time finds each frame ready.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <exception>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>
#include <vector>

#include "refhost/media/media_source.h"

namespace refhost {

// The bytes that frames decoded ahead of their request may take, shared by the sources of one
// render, so that many large media (nine 4K videos in half floats are 600 MB a frame) do not
// each hold frames of their own. A frame being asked for needs none of it.
class DecodeAheadBudget {
 public:
  explicit DecodeAheadBudget(std::size_t bytes) : capacity_(bytes) {}
  // Takes the bytes when they fit; false when they do not.
  bool take(std::size_t bytes);
  void giveBack(std::size_t bytes);
  std::size_t inUse() const;

 private:
  mutable std::mutex mutex_;
  const std::size_t capacity_;
  std::size_t used_ = 0;
};

// Wraps a source whose frames are asked for in order. The wrapped source is used by the worker
// alone. Frames come out exactly as the wrapped source gives them, and a frame the wrapped
// source fails on throws the same error when it is asked for (never earlier, so a failure past
// the frames a render needs goes unnoticed, as it would without the worker). A request behind
// or far ahead of the worker starts it over there. At most `depth` frames wait; each frame
// prepared before it is asked for holds its bytes in `budget` (when one is given) until it is
// handed over or dropped, and the worker waits while they do not fit.
class PrefetchingSource : public GlRowsSource {
 public:
  PrefetchingSource(std::shared_ptr<MediaSource> inner, int32_t depth,
                    std::shared_ptr<DecodeAheadBudget> budget = nullptr);
  ~PrefetchingSource() override;
  PrefetchingSource(const PrefetchingSource&) = delete;
  PrefetchingSource& operator=(const PrefetchingSource&) = delete;

  std::vector<uint8_t> glRows(int32_t index, int32_t width, int32_t height,
                              PixelFormat format) override;
  int32_t frameCount() const override { return frameCount_; }
  MediaInfo info() const override { return info_; }
  bool changesOverTime() const override { return true; }

 private:
  struct Prepared {
    std::vector<uint8_t> rows;
    std::exception_ptr error;
    std::size_t budgeted = 0;  // bytes it holds in the budget
  };
  void work();
  // Whether the worker is on its way to `index` for pictures of the size.
  bool onCourse(int32_t index, int32_t width, int32_t height, PixelFormat format) const;
  // Starts over at `index` for pictures of the size: what waits is dropped.
  void restart(int32_t index, int32_t width, int32_t height, PixelFormat format);

  // Gives the budget back for the waiting frames from `from` on, and drops them.
  void dropWaiting(std::map<int32_t, Prepared>::iterator from,
                   std::map<int32_t, Prepared>::iterator to);
  std::size_t frameBytes() const;

  std::shared_ptr<MediaSource> inner_;
  const int32_t depth_;
  const std::shared_ptr<DecodeAheadBudget> budget_;
  const int32_t frameCount_;
  const MediaInfo info_;

  std::mutex mutex_;
  std::condition_variable changed_;
  int32_t width_ = -1, height_ = -1;
  PixelFormat format_ = PixelFormat::Rgba8;
  int32_t next_ = 0;                  // the next frame the worker prepares
  int32_t wanted_ = 0;                // the frame last asked for; those before it are not kept
  std::optional<int32_t> preparing_;  // the frame the worker is on, when it counts
  uint64_t generation_ = 0;  // counts restarts, so the worker drops a frame begun before one
  bool running_ = false;     // a first request came
  bool failed_ = false;      // the worker stopped at frame failedAt_, which failed
  bool stopping_ = false;
  int32_t failedAt_ = 0;
  std::map<int32_t, Prepared> ready_;
  std::thread worker_;
};

}  // namespace refhost
