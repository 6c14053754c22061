// The engine over the built module in a headless context, and layers of one colour, as the
// engine's, the layouts' and the render tests use them.
#pragma once

#include <functional>
#include <memory>
#include <string>

#include "refhost/engine.h"
#include "refhost/gl/headless_context.h"
#include "refhost/media/rgba_image.h"

namespace testsupport {

// `prepare` gives the engine its sources and layers before the start; one instance is made.
inline std::unique_ptr<refhost::Engine> startEngine(
    const refhost::FrameSettings& settings,
    const std::function<void(refhost::Engine&)>& prepare = nullptr) {
  refhost::EngineOptions options;
  options.makeContext = refhost::makeHeadlessContext;
  options.modulePath = VELTRANE_MODULE_PATH;
  auto engine = std::make_unique<refhost::Engine>(std::move(options));
  engine->setFrameSettings(settings);
  if (prepare) prepare(*engine);
  engine->start();
  engine->createInstance();
  return engine;
}

// Frames of every size with every pixel of the colour.
inline refhost::FrameSource solidSource(refhost::Rgba8 colour) {
  return [colour](int32_t, int32_t width, int32_t height, refhost::PixelFormat) {
    return refhost::RgbaImage(width, height, colour).pixels;
  };
}

// A layer of 100 such frames of that size, named after its GUID.
inline refhost::Layer solidLayer(const std::string& guid, int32_t width, int32_t height,
                                 refhost::Rgba8 colour) {
  refhost::Layer layer;
  layer.guid = guid;
  layer.name = guid.substr(0, 8);
  layer.width = width;
  layer.height = height;
  layer.frameCount = 100;
  layer.source = solidSource(colour);
  return layer;
}

}  // namespace testsupport
