// Pictures of a track at other positions than the frame being rendered: finding the producer
// that can be sought for them, and fetching pictures at the render's size.
#pragma once

#include <framework/mlt.h>

#include <cstdint>
#include <vector>

namespace veltrane_mlt {

// A producer whose positions count the frames of one track (or one clip), and where in it the
// frame being rendered lies. No producer: its other frames cannot be had.
struct TrackTime {
  mlt_producer producer = nullptr;
  int32_t position = 0;  // of the frame being rendered
  int32_t length = 0;    // frames the producer plays
};

// The multitrack a transition (or a filter planted in a tractor) draws its frames from, found
// by following the service's inputs; null when there is none.
mlt_multitrack multitrackOf(mlt_service service);

// Track `index` of the multitrack a transition (or a filter planted in a tractor) draws its
// frames from, found by following the service's inputs; null when there is none.
mlt_producer multitrackTrack(mlt_service service, int index);

// False for producers that say they cannot seek (live capture, streams) or play nothing.
bool canSeek(mlt_producer producer);

// False when the clip a frame came from says it cannot seek: its track then has no pictures
// at other positions either.
bool clipCanSeek(mlt_frame frame);

// The producer's picture at `position` as RGBA rows, top row first, stretched to width x
// height; empty when it has none. The producer is sought there and put back where it was, so
// that whatever reads it in order carries on undisturbed. The picture is scaled and
// deinterlaced as the consumer asked for `like` (the frame in hand), so that it matches it.
std::vector<uint8_t> pictureAt(mlt_producer producer, int32_t position, int32_t width,
                               int32_t height, mlt_frame like);

// The frame's picture as RGBA at width x height (stretched into `resized` when it comes at
// another size); null when it has none.
const uint8_t* pictureOf(mlt_frame frame, int32_t width, int32_t height,
                         std::vector<uint8_t>& resized);

}  // namespace veltrane_mlt
