// Choosing a file's reader by what FFmpeg's probe finds in it.
#include "refhost/media/moving_pictures.h"

#include "refhost/media/animated_webp.h"
#include "refhost/media/media_probe.h"
#include "refhost/media/video_source.h"

namespace refhost {

std::shared_ptr<MediaSource> openMovingPictures(const MediaSpec& spec, FrameRate compositionRate) {
  FileContent content = FileContent::Still;
  if (!spec.info) {
    content = probeFile(spec.path, spec.damage.get());
  } else if (spec.info->video) {
    content = isAnimatedWebp(spec.path) ? FileContent::WebpAnimation : FileContent::Video;
  }
  switch (content) {
    case FileContent::Video:
      return openVideoSource(spec.path, compositionRate, spec.damage);
    case FileContent::WebpAnimation:
      return std::make_shared<WebpAnimationSource>(spec.path, compositionRate);
    case FileContent::Still:
      break;
  }
  return nullptr;
}

}  // namespace refhost
