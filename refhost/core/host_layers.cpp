// The composition as the plug-in sees it: layers, their states, timing and frame delivery.
#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstring>
#include <ctime>

#include "refhost/core/host.h"
#include "refhost/platform/text.h"

namespace refhost {
namespace {

std::string guidText(const char* guid) { return guid ? std::string(guid, strnlen(guid, 64)) : ""; }

double threadCpuSeconds() {
  timespec now{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

}  // namespace

const Layer* Host::findLayer(const char* guid) const {
  if (!guid) return nullptr;
  std::string text = guidText(guid);
  for (const Layer& layer : layers_) {
    if (layer.guid == text) return &layer;
  }
  return nullptr;
}

int32_t Host::getLayerCount() {
  log([&] { return std::string("GetLayerCount"); });
  return static_cast<int32_t>(layers_.size());
}

void Host::getLayerInfo(int32_t index, char* guidBuffer, char* nameBuffer, int32_t nameSize,
                        int32_t* kind) {
  log([&] {
    return std::string("GetLayerInfo " + std::to_string(index) + " " + std::to_string(nameSize));
  });
  if (index < 0 || static_cast<std::size_t>(index) >= layers_.size()) {
    problem("GetLayerInfo: no layer at index " + std::to_string(index));
    return;
  }
  const Layer& layer = layers_[static_cast<std::size_t>(index)];
  if (guidBuffer) {
    std::size_t length = std::min<std::size_t>(layer.guid.size(), 36);
    std::memcpy(guidBuffer, layer.guid.data(), length);
    guidBuffer[length] = '\0';
  }
  if (nameBuffer && nameSize > 0) {
    std::size_t length =
        std::min<std::size_t>(layer.name.size(), static_cast<std::size_t>(nameSize) - 1);
    std::memcpy(nameBuffer, layer.name.data(), length);
    nameBuffer[length] = '\0';
  }
  if (kind) *kind = layer.kind;
  if (!guidBuffer || !nameBuffer || !kind) problem("GetLayerInfo with a null output pointer");
}

int32_t Host::queryLayerState(const char* guid, int32_t timeMs, LayerState* out) {
  log([&] { return std::string("QueryLayerState " + logId(guid) + " " + std::to_string(timeMs)); });
  const Layer* layer = findLayer(guid);
  if (faulty(&FaultPlan::failLayerQueries) || !layer || !out) {
    if (!out) problem("QueryLayerState with a null record");
    return 1;
  }
  std::memset(out, 0, sizeof *out);
  out->type = static_cast<uint32_t>(layer->kind);
  out->firstFrame = layer->firstFrame;
  out->frameCount = layer->frameCount;
  out->is3D = layer->is3D ? 1 : 0;
  out->width = scaled(layer->width);
  out->height = scaled(layer->height);
  std::memcpy(out->placement, layer->placement.data(), sizeof out->placement);
  for (int i = 12; i < 15; ++i)
    out->placement[i] = static_cast<float>(out->placement[i] * pixelScale_);
  std::memcpy(out->secondMatrix, layer->secondMatrix.data(), sizeof out->secondMatrix);
  return 0;
}

int32_t Host::getTimeInfo(WispTimeInfo* out) {
  log([&] { return std::string("GetTimeInfo"); });
  if (faulty(&FaultPlan::failTimeInfo) || !out) return 1;
  *out = timeInfo_;
  out->width = scaled(out->width);
  out->height = scaled(out->height);
  return 0;
}

int32_t Host::scaled(int32_t pixels) const {
  if (pixelScale_ == 1) return pixels;
  return std::max(1, static_cast<int32_t>(std::lround(pixels * pixelScale_)));
}

int32_t Host::getSourceFrame(void* renderContext, int32_t frameIndex, TextureRecord* out) {
  log([&] { return std::string("GetSourceFrame " + std::to_string(frameIndex)); });
  if (faulty(&FaultPlan::refuseSourceFrames)) return 1;
  // A source frame at another index has the size of the source the render context carries.
  int32_t width = timeInfo_.width;
  int32_t height = timeInfo_.height;
  if (auto* context = static_cast<const WispRenderContext*>(renderContext)) {
    bool hasSource = context->source.imageWidth > 0 && context->source.imageHeight > 0;
    width = hasSource ? context->source.imageWidth : context->width;
    height = hasSource ? context->source.imageHeight : context->height;
  }
  const auto* context = static_cast<const WispRenderContext*>(renderContext);
  const int32_t offset = context ? frameIndex - context->sourceFrameIndex : 0;
  return deliverFrame(stream(nullptr, offset), frameIndex, width, height, out);
}

const FrameSource& Host::stream(const Layer* layer, int32_t offset) {
  const FrameSource& first = layer ? layer->source : sourceFrames_;
  const std::function<FrameSource()>& open = layer ? layer->openStream : sourceStreamOpener_;
  if (offset == 0 || !open) return first;
  const std::string key = layer ? layer->guid : std::string();
  auto found = streams_.find({key, offset});
  if (found != streams_.end()) return found->second;
  std::size_t opened = 0;
  for (const auto& entry : streams_) opened += entry.first.first == key ? 1 : 0;
  if (opened + 1 >= kStreamsPerSource) return first;
  return streams_.emplace(std::make_pair(key, offset), open()).first->second;
}

int32_t Host::renderLayerFrame(void* renderContext, const char* guid, int32_t frame,
                               TextureRecord* out) {
  log([&] { return std::string("RenderLayerFrame " + logId(guid) + " " + std::to_string(frame)); });
  const Layer* layer = findLayer(guid);
  if (faulty(&FaultPlan::refuseLayerFrames) || !layer) return 1;
  if (!layer->source)
    return deliverFrame(frameCounterSource(static_cast<uint8_t>(layer - layers_.data() + 1)), frame,
                        scaled(layer->width), scaled(layer->height), out);
  const auto* context = static_cast<const WispRenderContext*>(renderContext);
  const int32_t offset = context ? frame - static_cast<int32_t>(context->frameNumber) : 0;
  return deliverFrame(stream(layer, offset), frame, scaled(layer->width), scaled(layer->height),
                      out);
}

int32_t Host::deliverFrame(const FrameSource& source, int32_t frame, int32_t width, int32_t height,
                           TextureRecord* out) {
  if (!out) {
    problem("frame fetch with a null texture record");
    return 1;
  }
  if (!requireGl("frame fetch")) return 1;
  if (width <= 0 || height <= 0) {
    problem("frame fetch of an empty frame (" + std::to_string(width) + "x" +
            std::to_string(height) + ")");
    return 1;
  }
  auto started = std::chrono::steady_clock::now();
  double startedCpu = threadCpuSeconds();
  std::vector<uint8_t> pixels = source(frame, width, height, frameFormat_);
  if (pixels.size() != static_cast<std::size_t>(width) * static_cast<std::size_t>(height) *
                           bytesPerPixel(frameFormat_)) {
    problem("a frame source gave " + std::to_string(pixels.size()) + " bytes for a " +
            std::to_string(width) + "x" + std::to_string(height) + " frame");
    return 1;
  }
  *out = createFrameTexture(width, height, pixels.data());
  frames_.insert(out->id);
  frameDeliverySeconds_ +=
      std::chrono::duration<double>(std::chrono::steady_clock::now() - started).count();
  frameDeliveryCpuSeconds_ += threadCpuSeconds() - startedCpu;
  return 0;
}

}  // namespace refhost
