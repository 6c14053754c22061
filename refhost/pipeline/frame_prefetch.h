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

// Wraps a source whose frames are asked for in order. The wrapped source is used by the worker
// alone. Frames come out exactly as the wrapped source gives them, and a frame the wrapped
// source fails on throws the same error when it is asked for (never earlier, so a failure past
// the frames a render needs goes unnoticed, as it would without the worker). A request behind
// or far ahead of the worker starts it over there. At most `depth` frames wait, and no more
// than fit in `budgetBytes` (but always one), plus the one
// being prepared.
class PrefetchingSource : public MediaSource {
 public:
  PrefetchingSource(std::shared_ptr<MediaSource> inner, int32_t depth,
                    std::size_t budgetBytes = SIZE_MAX);
  ~PrefetchingSource() override;
  PrefetchingSource(const PrefetchingSource&) = delete;
  PrefetchingSource& operator=(const PrefetchingSource&) = delete;

  RgbaImage frame(int32_t index, int32_t width, int32_t height, PixelFormat format) override;
  std::vector<uint8_t> glRows(int32_t index, int32_t width, int32_t height,
                              PixelFormat format) override;
  int32_t frameCount() const override { return frameCount_; }
  MediaInfo info() const override { return info_; }
  bool changesOverTime() const override { return true; }

 private:
  struct Prepared {
    std::vector<uint8_t> rows;
    std::exception_ptr error;
  };
  void work();
  // Whether the worker is on its way to `index` for pictures of the size.
  bool onCourse(int32_t index, int32_t width, int32_t height, PixelFormat format) const;
  // Starts over at `index` for pictures of the size: what waits is dropped.
  void restart(int32_t index, int32_t width, int32_t height, PixelFormat format);

  std::shared_ptr<MediaSource> inner_;
  // Frames that may wait for pictures of the size and format asked last.
  int32_t waitingLimit() const;

  const int32_t depth_;
  const std::size_t budgetBytes_;
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
