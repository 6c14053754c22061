// Sends viewer messages (pointer, keys) to the module the way a host's viewer does: a viewer
// context with the frame size, view scales and projection, and the event record.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>

#include "refhost/core/host.h"
#include "refhost/engine/render_frame.h"
#include "support/instrumented_host.h"

class ViewerEvents {
 public:
  ViewerEvents(testsupport::InstrumentedHost& host, int32_t width, int32_t height) : host_(host) {
    context_.width = width;
    context_.height = height;
    context_.viewScaleX = context_.viewScaleY = context_.uiScale = 1.0;
    const refhost::Matrix4 projection = refhost::pixelProjection(width, height);
    std::copy(projection.begin(), projection.end(), context_.projection);
  }

  WispViewerContext& context() { return context_; }

  int32_t send(int32_t message, void* event) {
    host_.setEvent(event);
    host_.setRenderContext(&context_);
    const int32_t result = host_.send(message);
    host_.setEvent(nullptr);
    host_.setRenderContext(nullptr);
    return result;
  }
  int32_t press(float x, float y) { return pointer(kMessagePointerPress, x, y, 1.0); }
  int32_t move(float x, float y, bool held) {
    return pointer(kMessagePointerMove, x, y, held ? 1.0 : 0.0);
  }
  int32_t release(float x, float y) { return pointer(kMessagePointerRelease, x, y, 0.0); }
  int32_t key(int32_t message, uint32_t code) {
    WispKeyEvent event{code};
    return send(message, &event);
  }
  // A whole drag: press, moves along a straight path, release.
  void drag(float x0, float y0, float x1, float y1, int steps = 8) {
    press(x0, y0);
    for (int i = 1; i <= steps; ++i) {
      const float t = static_cast<float>(i) / static_cast<float>(steps);
      move(x0 + (x1 - x0) * t, y0 + (y1 - y0) * t, true);
    }
    release(x1, y1);
  }

 private:
  int32_t pointer(int32_t message, float x, float y, double button) {
    WispPointerEvent event{static_cast<int32_t>(std::lround(x)),
                           static_cast<int32_t>(std::lround(y)), button};
    return send(message, &event);
  }

  testsupport::InstrumentedHost& host_;
  WispViewerContext context_{};
};
