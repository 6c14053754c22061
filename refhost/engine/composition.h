// A composition: its size, rate, length and pixel aspect, the effect's own layer with its
// media source, and the other layers with theirs; installing it fills an engine.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "refhost/core/host.h"
#include "refhost/media/media_source.h"

namespace refhost {
class Engine;
}

namespace refhost {

// The effect's own layer unless a composition names another GUID.
extern const char* const kDefaultOwnLayerGuid;

struct CompositionLayer {
  Layer layer;  // everything but its frames, which come from `media`
  MediaSpec media;
};

struct Composition {
  int32_t width = 1920;
  int32_t height = 1080;
  double frameRate = 25.0;
  int32_t duration = 1;  // frames
  float pixelAspect = 1.0f;
  std::string ownLayerGuid = kDefaultOwnLayerGuid;
  std::string ownLayerName = "Split Screen";
  MediaSpec source;  // the effect's own input
  std::vector<CompositionLayer> layers;
};

// What the host now holds that render contexts need.
struct InstalledComposition {
  std::shared_ptr<MediaSource> source;
  // Frames of the own input: the video's length for a video source, else the duration.
  int32_t sourceFrameCount = 1;
};

// The host's frame callback over a media source: the same pictures in GL's bottom-up rows. A
// source that does not change over time is converted once per size.
FrameSource frameSourceOf(std::shared_ptr<MediaSource> source);

// Sets the engine's frame to the composition's size, rate and pixel aspect, lists the own
// layer first (kind 0, frames 0 to duration - 1, the composition's size, identity placement)
// and then the other layers in order, and feeds the own source and each layer from its media.
// Throws std::runtime_error naming the file when a media file cannot be opened.
InstalledComposition installComposition(Engine& engine, const Composition& composition);

}  // namespace refhost
