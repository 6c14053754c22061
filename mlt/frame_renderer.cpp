// One thread's engine: the module driven through refhost's engine, fed with MLT's pictures.
#include "frame_renderer.h"

#include <algorithm>
#include <cstring>

#include "property_values.h"
#include "refhost/gl/headless_context.h"
#include "refhost/pipeline/frame_readback.h"
#include "track_frames.h"
#include "track_layers.h"

namespace veltrane_mlt {
namespace {

// Host textures of one frame, given back to the host's pool however the frame ends.
class FrameTextures {
 public:
  FrameTextures(refhost::Engine& engine, int32_t width, int32_t height, const uint8_t* sourceRows)
      : engine_(engine) {
    textures.source = engine.createTexture(width, height, sourceRows);
    textures.output = engine.createTexture(width, height);
  }
  ~FrameTextures() {
    engine_.deleteTexture(textures.output.id);
    engine_.deleteTexture(textures.source.id);
  }
  FrameTextures(const FrameTextures&) = delete;
  FrameTextures& operator=(const FrameTextures&) = delete;

  refhost::CallerTextures textures;

 private:
  refhost::Engine& engine_;
};

bool sameSettings(const refhost::FrameSettings& a, const refhost::FrameSettings& b) {
  return a.width == b.width && a.height == b.height && a.frameRate == b.frameRate &&
         a.pixelAspect == b.pixelAspect && a.sourceFrameCount == b.sourceFrameCount &&
         a.ownLayerGuid == b.ownLayerGuid;
}

}  // namespace

FrameRenderer::FrameRenderer(const std::string& modulePath) {
  std::unique_ptr<refhost::GlContext> context;
  try {
    context = refhost::makeHeadlessContext(refhost::GlProfile::Core);
  } catch (const std::exception& error) {
    throw GlUnavailable(error.what());
  }
  refhost::EngineOptions options;
  options.modulePath = modulePath;
  options.context = std::move(context);
  engine_ = std::make_unique<refhost::Engine>(std::move(options));

  auto ownRows = [this](int32_t frame, int32_t width, int32_t height, refhost::PixelFormat) {
    return request_ ? rowsOf(&request_->own, frame, width, height) : std::vector<uint8_t>();
  };
  engine_->setSourceFrames(ownRows);
  // The layer picker lists the track the effect sits on first, as the host lists its own
  // layer; choosing it means the own source. The tracks follow as inputs name them.
  refhost::Layer own;
  own.guid = kOwnLayerGuid;
  own.name = "This track";
  own.source = ownRows;
  engine_->addLayer(own);
  engine_->start();
  engine_->createInstance();
  for (const refhost::Param& param : engine_->panel().params())
    applied_.push_back(param.state.value);
}

FrameRenderer::~FrameRenderer() {
  // The read-back's buffers belong to the engine's context.
  if (readback_) {
    engine_->gl().makeCurrent();
    readback_.reset();
  }
}

std::vector<uint8_t> FrameRenderer::rowsOf(const TrackPictures* shown, int32_t position,
                                           int32_t width, int32_t height) const {
  // Called by the host from inside the plug-in's render: nothing may be thrown through it. An
  // empty answer is a frame the host does not have, which the effect shows as such.
  if (!shown) return {};
  const TrackPictures& track = *shown;
  try {
    const std::size_t rowBytes = static_cast<std::size_t>(width) * 4;
    std::vector<uint8_t> other;
    const uint8_t* pixels = nullptr;
    if (position == track.position && width == request_->width && height == request_->height &&
        track.current) {
      pixels = track.current;
    } else if (track.other) {
      other = track.other(position, width, height);
      if (other.size() != rowBytes * static_cast<std::size_t>(height)) return {};
      pixels = other.data();
    } else {
      return {};
    }
    std::vector<uint8_t> rows(rowBytes * static_cast<std::size_t>(height));
    refhost::copyRowsFlipped(pixels, rows.data(), rowBytes, height);
    return rows;
  } catch (const std::exception&) {
    return {};
  }
}

void FrameRenderer::applyComposition(const RenderRequest& request) {
  refhost::FrameSettings settings;
  settings.width = request.compositionWidth;
  settings.height = request.compositionHeight;
  settings.frameRate = request.frameRate;
  settings.pixelAspect = request.pixelAspect;
  settings.sourceFrameCount = request.own.length;
  settings.ownLayerGuid = kOwnLayerGuid;
  if (!sameSettings(settings, engine_->frameSettings())) engine_->setFrameSettings(settings);

  // The frame number is the own track's position, and a transition's tracks share their
  // positions (the composition's): every layer starts at frame 0 and plays its track's frames.
  std::vector<std::pair<std::size_t, const TrackPictures*>> shown{{0, &request.own}};
  for (const auto& [track, pictures] : request.tracks) {
    auto found = trackLayers_.find(track);
    if (found == trackLayers_.end()) {
      refhost::Layer layer;
      layer.guid = trackGuid(track);
      layer.name = "Track " + std::to_string(track);
      layer.source = [this, track = track](int32_t frame, int32_t width, int32_t height,
                                           refhost::PixelFormat) {
        if (!request_) return std::vector<uint8_t>();
        auto pictures = request_->tracks.find(track);
        return rowsOf(pictures == request_->tracks.end() ? nullptr : &pictures->second, frame,
                      width, height);
      };
      engine_->addLayer(layer);
      found = trackLayers_.emplace(track, engine_->layers().size() - 1).first;
    }
    shown.emplace_back(found->second, &pictures);
  }
  for (const auto& [index, pictures] : shown) {
    refhost::Layer layer = engine_->layers()[index];
    const int32_t frameCount = std::max(1, pictures->length);
    if (layer.frameCount == frameCount && layer.width == request.compositionWidth &&
        layer.height == request.compositionHeight)
      continue;
    layer.frameCount = frameCount;
    layer.width = request.compositionWidth;
    layer.height = request.compositionHeight;
    engine_->setLayer(index, layer);
  }
}

void FrameRenderer::applyValues(const std::vector<refhost::ParamValue>& values) {
  const std::vector<refhost::Param>& params = engine_->panel().params();
  for (std::size_t i = 0; i < params.size() && i < values.size(); ++i) {
    if (values[i] == applied_[i]) continue;
    engine_->setParam(params[i].id, values[i]);
    applied_[i] = values[i];
  }
}

void FrameRenderer::render(const RenderRequest& request, uint8_t* out) {
  struct Current {
    const RenderRequest*& slot;
    ~Current() { slot = nullptr; }
  } current{request_};
  request_ = &request;
  applyComposition(request);
  std::vector<refhost::ParamValue> values = request.values;
  layouts_.apply(*engine_, request.layout, values);
  applyValues(values);

  const int32_t width = request.width, height = request.height;
  const std::size_t rowBytes = static_cast<std::size_t>(width) * 4;
  upload_.resize(rowBytes * static_cast<std::size_t>(height));
  // MLT's pictures run top row first, GL's textures bottom row first.
  refhost::copyRowsFlipped(request.own.current, upload_.data(), rowBytes, height);

  // A picture of another size than the composition's (an editor's preview) is rendered as the
  // engine renders previews: everything in pixels scaled to it.
  FrameTextures frame(*engine_, width, height, upload_.data());
  engine_->render(request.own.position, frame.textures);
  if (!readback_ || readback_->width() != width || readback_->height() != height) {
    readback_.reset();
    readback_ = std::make_unique<refhost::FrameReadback>(width, height, 1);
  }
  readback_->start(frame.textures.output.id);
  readback_->collectInto(out);
}

}  // namespace veltrane_mlt
