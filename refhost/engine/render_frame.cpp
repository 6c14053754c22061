// Render and viewer contexts with their host textures.
#include "refhost/engine/render_frame.h"

#include <cmath>
#include <cstring>

namespace refhost {
namespace {

// With this lens term a flat layer taken into camera space sits 1000 * H / 720 pixels from the
// eye, the distance at which one layer pixel covers one frame pixel.
constexpr float kLensTerm = 2.7777791f;

void copyMatrix(float (&to)[16], const Matrix4& from) { std::memcpy(to, from.data(), sizeof to); }

}  // namespace

Matrix4 pixelProjection(int32_t width, int32_t height) {
  Matrix4 m = identityMatrix();
  m[0] = width > 0 ? 2.0f / static_cast<float>(width) : 1.0f;
  m[5] = height > 0 ? 2.0f / static_cast<float>(height) : 1.0f;
  m[10] = -1.0f;
  m[12] = -1.0f;  // column-major: the translation is the last column
  m[13] = -1.0f;
  return m;
}

int32_t frameToMilliseconds(int32_t frame, double frameRate) {
  double rate = frameRate > 0 ? frameRate : 25.0;
  return static_cast<int32_t>(std::trunc(frame * 1000.0 / rate + 0.49998999));
}

RenderFrame::RenderFrame(Host& host, const FrameSettings& settings, int32_t frame)
    : host_(host), ownLayerGuid_(settings.ownLayerGuid) {
  std::vector<uint8_t> pixels =
      host.sourceFrames()(frame, settings.width, settings.height, host.frameFormat());
  context_.source = host.createFrameTexture(settings.width, settings.height, pixels.data());
  context_.output = host.createFrameTexture(settings.width, settings.height);
  context_.second = host.createFrameTexture(settings.width, settings.height);
  fill(settings, frame);
}

RenderFrame::RenderFrame(Host& host, const FrameSettings& settings, int32_t frame,
                         const TextureRecord& source, const TextureRecord& output)
    : host_(host), ownLayerGuid_(settings.ownLayerGuid), ownsSourceAndOutput_(false) {
  context_.source = source;
  context_.output = output;
  context_.second = host.createFrameTexture(settings.width, settings.height);
  fill(settings, frame);
}

void RenderFrame::fill(const FrameSettings& settings, int32_t frame) {
  WispRenderContext& c = context_;
  c.width = settings.width;
  c.height = settings.height;
  c.time = frame;
  c.frameNumber = static_cast<uint32_t>(frame);
  c.sourceFrameIndex = frame;
  c.sourceFrameCount = settings.sourceFrameCount;
  c.pixelAspect = settings.pixelAspect;
  c.hasPixelAspect = 1;
  copyMatrix(c.projection, pixelProjection(settings.width, settings.height));
  copyMatrix(c.modelView, identityMatrix());
  c.ownLayerGuid = ownLayerGuid_.c_str();
  copyMatrix(c.layerSpaceMatrix, identityMatrix());
  c.hasLayerSpaceMatrix = 1;
  Matrix4 lens = identityMatrix();
  lens[5] = kLensTerm;
  copyMatrix(c.view.lens, lens);
  copyMatrix(c.view.view, identityMatrix());
  c.currentTimeMs = frameToMilliseconds(frame, settings.frameRate);
  c.view.timeMs = c.currentTimeMs;
  c.layerTimeMs = c.currentTimeMs;  // the own layer starts at frame 0
}

RenderFrame::~RenderFrame() {
  if (ownsSourceAndOutput_) {
    host_.deleteTexture(context_.source.id);
    host_.deleteTexture(context_.output.id);
  }
  host_.deleteTexture(context_.second.id);
}

WispViewerContext makeViewerContext(int32_t width, int32_t height, double viewScaleX,
                                    double viewScaleY, double uiScale, int32_t time) {
  WispViewerContext context{};
  context.name = nullptr;
  context.width = width;
  context.height = height;
  context.viewScaleX = viewScaleX;
  context.viewScaleY = viewScaleY;
  context.uiScale = uiScale;
  context.time = time;
  copyMatrix(context.projection, pixelProjection(width, height));
  return context;
}

}  // namespace refhost
