// Installing a composition into the host.
#include "refhost/composition.h"

namespace refhost {

const char* const kDefaultOwnLayerGuid = "5ec0a11e-0000-4000-8000-000000000001";

InstalledComposition installComposition(Host& host, const Composition& composition) {
  InstalledComposition installed;
  installed.source = openMediaSource(composition.source);
  installed.sourceFrameCount =
      installed.source->frameCount() > 0 ? installed.source->frameCount() : composition.duration;
  host.setTimeInfo(composition.width, composition.height, composition.frameRate);
  host.setSourceFrames(frameSourceOf(installed.source));

  Layer own;
  own.guid = composition.ownLayerGuid;
  own.name = composition.ownLayerName;
  own.kind = 0;
  own.firstFrame = 0;
  own.frameCount = composition.duration;
  own.width = composition.width;
  own.height = composition.height;
  own.source = frameSourceOf(installed.source);
  host.addLayer(own);

  for (const CompositionLayer& entry : composition.layers) {
    Layer layer = entry.layer;
    layer.source = frameSourceOf(openMediaSource(entry.media));
    host.addLayer(layer);
  }
  return installed;
}

}  // namespace refhost
