// Installing a composition into the host.
#include "refhost/engine/composition.h"

#include "refhost/engine.h"
#include "refhost/pipeline/frame_prefetch.h"

namespace refhost {
namespace {

// Frames a source decodes ahead of the render: enough to cover a slow frame. All the sources
// of a composition share 128 MB for them: four 1080p sources in 8 bits (three frames each, 8 MB
// a frame) fit whole, and larger frames are held a few at a time between all the sources
// instead of some for each: nine 4K sources in half floats (66 MB a frame) would otherwise
// hold 600 MB or more.
constexpr int32_t kDecodeAhead = 3;
constexpr std::size_t kDecodeAheadBytes = std::size_t{128} << 20;

// Sources that change over time (videos, the counter) decode ahead on a worker thread each.
std::shared_ptr<MediaSource> opened(const MediaSpec& spec, FrameRate rate,
                                    const std::shared_ptr<DecodeAheadBudget>& budget) {
  std::shared_ptr<MediaSource> source = openMediaSource(spec, rate);
  if (!source->changesOverTime()) return source;
  return std::make_shared<PrefetchingSource>(std::move(source), kDecodeAhead, budget);
}

// Another reader of the same media, opened when its first frame is asked for; a media that
// looks the same at every frame shares the one it has.
std::function<FrameSource()> streamOpener(const MediaSpec& spec, FrameRate rate,
                                          const std::shared_ptr<MediaSource>& first,
                                          const std::shared_ptr<DecodeAheadBudget>& budget) {
  if (!first->changesOverTime()) return [first] { return frameSourceOf(first); };
  return [spec, rate, budget] {
    auto source = std::make_shared<std::shared_ptr<MediaSource>>();
    return FrameSource([spec, rate, budget, source](int32_t frame, int32_t width, int32_t height,
                                                    PixelFormat format) {
      if (!*source) *source = opened(spec, rate, budget);
      return (*source)->glRows(frame, width, height, format);
    });
  };
}

}  // namespace

ColourDescription defaultColour(const MediaSpec& source) {
  // RGB video (an animated GIF, lossless RGB) has no matrix to write YUV with: BT.709 then.
  if (source.kind == MediaSpec::Kind::File && source.info && source.info->video &&
      source.info->colour.matrix != ColourDescription::kMatrixRgb)
    return source.info->colour;
  return ColourDescription::bt709();
}

int32_t deepestInput(const Composition& composition) {
  int32_t deepest = composition.source.info ? composition.source.info->bitDepth : 8;
  for (const CompositionLayer& layer : composition.layers)
    if (layer.media.info) deepest = std::max(deepest, layer.media.info->bitDepth);
  return deepest;
}

PixelFormat frameFormatFor(const Composition& composition, int32_t outputBitDepth) {
  return deepestInput(composition) > 8 || outputBitDepth > 8 ? PixelFormat::RgbaHalf
                                                             : PixelFormat::Rgba8;
}

FrameSource frameSourceOf(std::shared_ptr<MediaSource> source) {
  struct Kept {
    int32_t width = -1, height = -1;
    PixelFormat format = PixelFormat::Rgba8;
    std::vector<uint8_t> rows;
  };
  auto kept = std::make_shared<Kept>();
  return [source, kept](int32_t frame, int32_t width, int32_t height, PixelFormat format) {
    bool still = !source->changesOverTime();
    if (still && kept->width == width && kept->height == height && kept->format == format)
      return kept->rows;
    std::vector<uint8_t> rows = source->glRows(frame, width, height, format);
    if (still) *kept = Kept{width, height, format, rows};
    return rows;
  };
}

const char* const kDefaultOwnLayerGuid = "5ec0a11e-0000-4000-8000-000000000001";

InstalledComposition installComposition(Engine& engine, const Composition& composition,
                                        PixelFormat format) {
  InstalledComposition installed;
  const FrameRate rate = composition.frameRate;
  const auto budget = std::make_shared<DecodeAheadBudget>(kDecodeAheadBytes);
  installed.source = opened(composition.source, rate, budget);
  installed.sourceFrameCount =
      installed.source->frameCount() > 0 ? installed.source->frameCount() : composition.duration;
  FrameSettings settings;
  settings.width = composition.width;
  settings.height = composition.height;
  settings.frameRate = composition.frameRate.perSecond();
  settings.pixelAspect = composition.pixelAspect;
  settings.sourceFrameCount = installed.sourceFrameCount;
  settings.ownLayerGuid = composition.ownLayerGuid;
  settings.format = format;
  engine.setFrameSettings(settings);
  const std::function<FrameSource()> sourceStreams =
      streamOpener(composition.source, rate, installed.source, budget);
  engine.setSourceFrames(frameSourceOf(installed.source), sourceStreams);

  Layer own;
  own.guid = composition.ownLayerGuid;
  own.name = composition.ownLayerName;
  own.kind = 0;
  own.firstFrame = 0;
  own.frameCount = composition.duration;
  own.width = composition.width;
  own.height = composition.height;
  // The own layer reads on its own: it is asked for the frame being rendered, which the render
  // context's source has just taken from the first reader.
  own.source = sourceStreams();
  own.openStream = sourceStreams;
  engine.addLayer(own);

  for (const CompositionLayer& entry : composition.layers) {
    Layer layer = entry.layer;
    std::shared_ptr<MediaSource> media = opened(entry.media, rate, budget);
    layer.source = frameSourceOf(media);
    layer.openStream = streamOpener(entry.media, rate, media, budget);
    engine.addLayer(layer);
  }
  return installed;
}

}  // namespace refhost
