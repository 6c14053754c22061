// Pictures of the tracks an effect shows at positions other than the frame in hand (its time
// shifts): the pictures it was handed lately, kept up to a number of bytes, and for positions
// ahead of them a reader of its own for each track, a copy of the track's producer that reads
// on in order, so that neither seeks the track the editor plays nor decodes from a keyframe
// for every frame.
#pragma once

#include <framework/mlt.h>

#include <cstdint>
#include <deque>
#include <map>
#include <memory>
#include <mutex>
#include <vector>

#include "below_copy.h"

namespace veltrane_mlt {

// A picture: RGBA rows, top row first.
struct Picture {
  int32_t width = 0;
  int32_t height = 0;
  std::vector<uint8_t> pixels;
};

class TrackHistory {
 public:
  // Pictures kept for all tracks together; the oldest go first.
  explicit TrackHistory(std::size_t byteBudget);
  ~TrackHistory();
  TrackHistory(const TrackHistory&) = delete;
  TrackHistory& operator=(const TrackHistory&) = delete;

  // Keeps a copy of track `track`'s picture at `position` (a key of the caller's: the track's
  // index, or -1 for a filter's own clip), and at most `depth` of that track's pictures, the
  // latest (the frames the longest shift back reaches; 0 keeps nothing).
  void keep(int track, int32_t position, const uint8_t* rgba, int32_t width, int32_t height,
            int32_t depth);

  // The picture of `track` at `position` at width x height: a kept one, else one read from
  // `producer` (the track's, whose positions are the caller's) by a copy of it made for this
  // track, which reads on from there. Empty when neither has one (the producer cannot be
  // copied or sought, or plays nothing there). `like` is the frame in hand, whose scaling and
  // deinterlacing the read picture follows.
  std::vector<uint8_t> find(int track, int32_t position, int32_t width, int32_t height,
                            mlt_producer producer, mlt_frame like);

  // Read pictures through a copy of what lies below `below` (a transition's input) rather
  // than copies of the tracks alone, so that they come out composited; null: tracks alone.
  void readThrough(mlt_service below);

  std::size_t keptBytes() const;

 private:
  struct Kept {
    int track;
    int32_t position;
    Picture picture;
  };
  struct Reader;

  std::size_t budget_;
  std::size_t bytes_ = 0;
  mutable std::mutex mutex_;
  std::deque<Kept> kept_;
  std::map<int, std::unique_ptr<Reader>> readers_;
  mlt_service below_ = nullptr;
  std::unique_ptr<BelowCopy> belowCopy_;
};

// A producer of its own that plays what `producer` plays (MLT's XML written and read back), or
// null when it cannot be copied.
mlt_producer copyOfProducer(mlt_producer producer);

}  // namespace veltrane_mlt
