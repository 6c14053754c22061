// What a media file holds, decided by its content as FFmpeg's probe finds it (and the image
// reader after it), never by its name: moving pictures, or one picture.
#pragma once

#include <string>

#include "refhost/media/damaged_frames.h"

namespace refhost {

enum class FileContent {
  Video,          // frames FFmpeg decodes: a video file, an animated GIF or PNG
  Still,          // one picture, for the image reader; also whatever FFmpeg does not know
  WebpAnimation,  // an animated WebP, which FFmpeg does not decode
};

// Throws std::runtime_error in one line naming the file when it holds sound but no picture, or
// one picture (PNG, JPEG, GIF, BMP, WebP) whose data FFmpeg's decoder finds damaged beyond use.
// A picture the decoder recovers only in part (a JPEG cut short) is recorded in `damage` as
// frame 0 with the decoder's reason.
FileContent probeFile(const std::string& path, DamagedFrames* damage);

}  // namespace refhost
