// Which frames of a scene a render writes: all of them, one (--frame N or a time), a range of
// frame numbers or times (--frames A-B), or the span between two times (--from T, --to T) as
// FFmpeg's -ss and -to take them.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "refhost/pipeline/frame_output.h"

namespace veltrane_cli {

struct FrameRange {
  int32_t first = 0;
  int32_t last = 0;
  int32_t count() const { return last - first + 1; }
};

// The frames the options name, in a scene of `duration` frames at `rate`. A start time takes
// the first frame at or after it, an end time the frames before it (as -ss and -to do; an end
// past the scene's stops at its last frame), and a time alone the frame shown at it. Whole
// numbers in --frame and --frames are frame numbers. Throws UsageError for options given
// together, an empty range, frames outside the scene, or more than one frame for a still.
FrameRange chooseFrames(const std::map<std::string, std::string>& options,
                        const refhost::OutputTarget& target, int32_t duration, double rate);

// The frame a --frame value names: a whole number, or the frame shown at a time.
int32_t frameShownAt(const std::string& option, const std::string& text, double rate);

// The files a render of the frames writes: the still's or the video's one name, or a
// sequence's name for each frame.
std::vector<std::string> outputFileNames(const refhost::OutputTarget& target,
                                         const FrameRange& frames);

}  // namespace veltrane_cli
