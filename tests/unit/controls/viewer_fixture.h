// A viewer over the in-memory parameter host: one effect instance, the viewer context and the
// pointer event, and the pointer messages sent the way the host's dispatch sends them.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "controls/key_handling.h"
#include "controls/pointer_handling.h"
#include "effect/instance_record.h"
#include "effect/param_ids.h"
#include "support/param_host.h"

namespace controls_test {

using veltrane::cutParamId;
using veltrane::inputParamId;
namespace param = veltrane::param;

class ViewerFixture : public ::testing::Test {
 public:
  static constexpr int kWidth = 1920;
  static constexpr int kHeight = 1080;

  void SetUp() override {
    context_.width = kWidth;
    context_.height = kHeight;
    context_.viewScaleX = 1.0;
    context_.viewScaleY = 1.0;
    context_.uiScale = 1.0;
    api()->renderContext = &context_;
    api()->event = &event_;
    veltrane::createInstance(api());
    for (int j = 0; j < veltrane::kInputCount; ++j) {
      host_.setFloat(inputParamId(param::kInputFrameScalePrefix, j), 100.0f);
    }
  }
  void TearDown() override { veltrane::destroyInstance(api()); }

  // A fresh instance over an empty host, for tables of gestures in one test.
  void restart() {
    TearDown();
    host_.recordCalls(false);
    host_.clearCalls();
    host_.clear();
    host_.setHostId(0);
    SetUp();
  }

  // Local cut `index` through the frame-space point (x, y) with direction `degrees`.
  void setCut(int index, float x, float y, float degrees) {
    host_.setPoint(cutParamId(param::kCutPositionPrefix, index), x, y);
    host_.setAngle(cutParamId(param::kCutDirectionPrefix, index), degrees);
  }
  void setCutCount(int n) { host_.setInt(param::kNumberOfCuts, n); }

  // Pointer messages at corner-space (x, y). A move asks the control owning a drag first.
  int move(int x, int y, double button) {
    aim(x, y, button);
    const int taken = veltrane::onPointerMove(host(), api(), true);
    return taken ? taken : veltrane::onPointerMove(host(), api(), false);
  }
  int press(int x, int y) {
    aim(x, y, 1.0);
    return veltrane::onPointerPress(host(), api());
  }
  int release(int x, int y) {
    aim(x, y, 0.0);
    return veltrane::onPointerRelease(host(), api());
  }

  // Host calls of one operation, e.g. "BeginUndo", in order, as "BeginUndo(name)".
  std::vector<std::string> callsOf(const std::string& operation) const {
    std::vector<std::string> found;
    for (const std::string& call : host_.calls()) {
      if (call.compare(0, operation.size() + 1, operation + "(") == 0) found.push_back(call);
    }
    return found;
  }

  WispHost* host() { return host_.handle(); }
  tagWispAPI* api() { return host_.api(); }
  veltrane::EffectInstance& instance() { return *veltrane::instanceOf(api()); }

  testsupport::ParamHost host_;
  WispViewerContext context_{};
  WispPointerEvent event_{};

 private:
  void aim(int x, int y, double button) {
    event_.x = x;
    event_.y = y;
    event_.button = button;
  }
};

}  // namespace controls_test
