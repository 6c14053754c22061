// Media files whose pictures move, told from stills by their content: videos and animated GIFs
// and PNGs through FFmpeg, animated WebP through libwebp.
#pragma once

#include <memory>

#include "refhost/media/frame_rate.h"
#include "refhost/media/media_source.h"

namespace refhost {

// The source of a file spec whose pictures move (see MediaSource for the rate); null when the
// file holds a still, for the image reader (damage FFmpeg found in a still picture is
// recorded in the spec's damage). A spec whose info is known is taken at its word instead of
// probed again. Throws std::runtime_error naming the file in one line when it cannot be read.
std::shared_ptr<MediaSource> openMovingPictures(const MediaSpec& spec, FrameRate compositionRate);

}  // namespace refhost
