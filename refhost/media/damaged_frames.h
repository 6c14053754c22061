// The damaged frames of one media file: each counted once, whichever of the file's readers (a
// render opens several, one decoding ahead, one per time shift) decoded it, so that the
// command that ran the job can say what was concealed, or refuse it.
#pragma once

#include <cstdint>
#include <mutex>
#include <set>
#include <string>

namespace refhost {

class DamagedFrames {
 public:
  // Frame `frame` (the file's own frames counted from 0; 0 for a still) was damaged, for the
  // reason (what the decoder found); the reason of the first one recorded is kept. Safe to
  // call from several threads.
  void record(int32_t frame, const std::string& reason);

  int32_t count() const;
  // The lowest frame recorded, and the reason of the first; -1 and empty when none was.
  int32_t first() const;
  std::string reason() const;

 private:
  mutable std::mutex mutex_;
  std::set<int32_t> frames_;
  std::string reason_;
};

}  // namespace refhost
