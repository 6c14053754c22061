// A copy of what lies below a transition in a tractor: every track's producer copied and the
// filters and transitions planted below it planted again over the copies, so that a track's
// picture at another position comes out composited as the transition sees it, read on in order
// without seeking the tracks the editor plays.
#pragma once

#include <framework/mlt.h>

#include <cstdint>
#include <vector>

namespace veltrane_mlt {

class BelowCopy {
 public:
  // `below` is the service a transition takes its frames from. The copy is empty (ready()
  // false) when a track cannot be copied or a service below is neither a filter nor a
  // transition.
  explicit BelowCopy(mlt_service below);
  ~BelowCopy();
  BelowCopy(const BelowCopy&) = delete;
  BelowCopy& operator=(const BelowCopy&) = delete;

  bool ready() const { return tractor_ != nullptr; }
  mlt_service source() const { return source_; }

  // Track `track`'s picture at `position` as RGBA rows, top row first, at width x height,
  // scaled as `like` (the frame in hand) asks; empty when there is none.
  std::vector<uint8_t> pictureAt(int track, int32_t position, int32_t width, int32_t height,
                                 mlt_frame like);

 private:
  mlt_service source_;
  mlt_tractor tractor_ = nullptr;
};

}  // namespace veltrane_mlt
