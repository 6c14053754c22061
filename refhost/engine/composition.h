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
  FrameRate frameRate{25, 1};
  int32_t duration = 1;  // frames
  float pixelAspect = 1.0f;
  std::string ownLayerGuid = kDefaultOwnLayerGuid;
  std::string ownLayerName = "Split Screen";
  MediaSpec source;  // the effect's own input
  std::vector<CompositionLayer> layers;
  // What a video output is converted to and tagged with.
  ColourDescription colour = ColourDescription::bt709();
};

// The composition's colour when a document does not choose one: the effect's own source's when
// that is a video in YUV, else BT.709 with limited range. Needs the source's info (see
// MediaSpec).
ColourDescription defaultColour(const MediaSpec& source);

// The most bits a channel of any of the composition's media holds (8 for generated pictures
// and for media not yet opened).
int32_t deepestInput(const Composition& composition);

// How the frames of a render are stored: half floats when an input or the output
// (`outputBitDepth`) holds more than 8 bits a channel, else 8 bits.
PixelFormat frameFormatFor(const Composition& composition, int32_t outputBitDepth);

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
// The frames are stored in `format` (see frameFormatFor).
InstalledComposition installComposition(Engine& engine, const Composition& composition,
                                        PixelFormat format = PixelFormat::Rgba8);

}  // namespace refhost
