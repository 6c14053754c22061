// Host construction, message sending, configuration and the host-side parameter accessors.
#include "refhost/core/host.h"

#include <cstring>
#include <stdexcept>

#include "refhost/core/operations.h"

namespace refhost {

FrameSource frameCounterSource(uint8_t tag) {
  return [tag](int32_t frame, int32_t width, int32_t height, PixelFormat format) {
    auto pixels = static_cast<std::size_t>(width > 0 ? width : 0) *
                  static_cast<std::size_t>(height > 0 ? height : 0);
    std::vector<uint8_t> rgba(pixels * 4);
    auto counter = static_cast<uint32_t>(frame);
    for (std::size_t i = 0; i < pixels; ++i) {
      rgba[4 * i + 0] = static_cast<uint8_t>(counter & 0xFF);
      rgba[4 * i + 1] = static_cast<uint8_t>((counter >> 8) & 0xFF);
      rgba[4 * i + 2] = tag;
      rgba[4 * i + 3] = 255;
    }
    if (format == PixelFormat::Rgba8) return rgba;
    std::vector<uint8_t> halves(rgba.size() * 2);
    for (std::size_t i = 0; i < rgba.size(); ++i) {
      const uint16_t half = halfFromFloat(rgba[i] / 255.0f);
      std::memcpy(&halves[2 * i], &half, 2);
    }
    return halves;
  };
}

Matrix4 identityMatrix() { return {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}; }

Host::Host() {
  installOperations(api_);
  sourceFrames_ = frameCounterSource(0);
}

Host::Host(const Module& module) : Host() { module_ = &module; }

Host::~Host() { releaseGl(); }

int32_t Host::send(int32_t message) {
  if (!module_) throw std::logic_error("refhost::Host::send: no module loaded");
  bool draws = isDrawingMessage(message);
  if (gl_ && (message == kMessageLoad || message == kMessageUnload ||
              message == kMessagePrepareGl || draws)) {
    gl_->makeCurrent();
    if (draws) bindFramebuffer();
  }
  int32_t result = 0;
  try {
    result = module_->notify(handle(), &api_, message);
  } catch (...) {
    finishMessage(message, -1);
    throw;
  }
  finishMessage(message, result);
  return result;
}

void Host::finishMessage(int32_t message, int32_t result) {
  MessageRecord record;
  record.message = message;
  record.result = result;
  record.unreturnedFrames = outstandingFrames();
  reclaimFrames();
  record.outstandingTextures = outstandingTextures();
  record.outstandingBuffers = outstandingBuffers();
  messages_.push_back(record);
}

void Host::setTimeInfo(int32_t width, int32_t height, double frameRate) {
  timeInfo_ = WispTimeInfo{width, height, frameRate};
}

const wchar_t* Host::getHostIdentifier() {
  log([&] { return std::string("GetHostIdentifier"); });
  return hostIdentifier_.c_str();
}

int32_t Host::getHostId() {
  log([&] { return std::string("GetHostId"); });
  return hostId_;
}

const Param& Host::param(const std::string& id) const {
  const Param* found = panel_.find(id);
  if (!found) throw std::out_of_range("refhost: no parameter '" + id + "' was declared");
  return *found;
}

Param& Host::mutableParam(const std::string& id) { return const_cast<Param&>(param(id)); }

void Host::setValue(const std::string& id, const ParamValue& value) {
  Param& target = mutableParam(id);
  target.state.keyframes.clear();
  target.state.value = value;
}

void Host::setKeyframe(const std::string& id, int32_t time, const ParamValue& value) {
  mutableParam(id).state.keyframes[time] = value;
}

void Host::clearKeyframes(const std::string& id) { mutableParam(id).state.keyframes.clear(); }

void Host::editState(const std::string& id, const ParamState& state) {
  Param& target = mutableParam(id);
  undo_.noteBefore(target);
  target.state = state;
}

ParamValue Host::valueAt(const std::string& id, int32_t time) const {
  return param(id).valueAt(time);
}

void Host::clearViewerRecords() {
  cursorShapes_.clear();
  redraws_ = 0;
  popupAnswers_.clear();
  popupMenus_.clear();
  frameRequests_.clear();
}

}  // namespace refhost
