// A video file as a media source: composition frames at the composition's rate shown through a
// VideoReader, whichever decoder stands behind it (FFmpeg's here, the browser's in the page).
#pragma once

#include <memory>
#include <string>

#include "refhost/media/damaged_frames.h"
#include "refhost/media/frame_rate.h"
#include "refhost/media/media_source.h"

namespace refhost {

// Composition frame n shows the picture the reader shows at n / compositionRate (25 frames a
// second when the rate is none); the source covers the video's duration at that rate. Throws
// what the reader throws.
std::shared_ptr<MediaSource> openVideoSource(const std::string& path, FrameRate compositionRate,
                                             std::shared_ptr<DamagedFrames> damage);

}  // namespace refhost
