// The Windows host reads no moving pictures: FFmpeg's libraries are not built for Windows, so
// every file is a still for the image reader (stb), which says what it cannot read.
#include "refhost/media/moving_pictures.h"

namespace refhost {

std::shared_ptr<MediaSource> openMovingPictures(const MediaSpec&, FrameRate) { return nullptr; }

}  // namespace refhost
