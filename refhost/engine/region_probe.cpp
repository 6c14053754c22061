// The module's regions learnt by rendering: each input shows a frame of the host's frame
// counter of its own (input j the source shifted by j + 1 frames), so the picture read back
// names, pixel by pixel, the input whose region covers it.
#include <GL/glew.h>

#include <utility>

#include "refhost/engine.h"

namespace refhost {
namespace {

// The probe's values stand in for the stored ones while it renders; the stored ones come back
// however the render ends.
class StandIn {
 public:
  explicit StandIn(Host& host) : host_(host) {}
  ~StandIn() {
    for (auto entry = saved_.rbegin(); entry != saved_.rend(); ++entry)
      host_.editStateWithoutUndo(entry->first, entry->second);
  }
  StandIn(const StandIn&) = delete;
  StandIn& operator=(const StandIn&) = delete;

  void set(const std::string& id, const ParamValue& value) {
    saved_.emplace_back(id, host_.param(id).state);
    ParamState state;
    state.value = value;
    host_.editStateWithoutUndo(id, state);
  }

 private:
  Host& host_;
  std::vector<std::pair<std::string, ParamState>> saved_;
};

class SourceStandIn {
 public:
  explicit SourceStandIn(Host& host)
      : host_(host), source_(host.sourceFrames()), opener_(host.sourceStreamOpener()) {
    host_.setSourceFrames(frameCounterSource(0));
  }
  ~SourceStandIn() { host_.setSourceFrames(source_, opener_); }
  SourceStandIn(const SourceStandIn&) = delete;
  SourceStandIn& operator=(const SourceStandIn&) = delete;

 private:
  Host& host_;
  FrameSource source_;
  std::function<FrameSource()> opener_;
};

}  // namespace

RegionMap Engine::mapRegions(int32_t frame,
                             const std::vector<std::pair<std::string, ParamValue>>& settings) {
  gl();
  const EffectVocabulary& roles = vocabulary();
  StandIn values(*host_);
  for (const auto& [id, value] : settings) values.set(id, value);
  for (int32_t j = 0; j < roles.inputs(); ++j) {
    for (InputParam role :
         {InputParam::Layer, InputParam::Translation, InputParam::Scale, InputParam::Rotation})
      values.set(roles.id(role, j), roles.declared(role, j).defaultValue);
    values.set(roles.id(InputParam::Shift, j), ParamValue::ofInt(j + 1));
  }
  values.set(roles.id(EffectParam::ViewCutRegions), ParamValue::ofInt(0));
  values.set(
      roles.id(EffectParam::BorderWidth),
      ParamValue::ofFloat(static_cast<float>(roles.declared(EffectParam::BorderWidth).minimum)));
  values.set(
      roles.id(EffectParam::BorderAlpha),
      ParamValue::ofFloat(static_cast<float>(roles.declared(EffectParam::BorderAlpha).minimum)));
  SourceStandIn counter(*host_);

  FrameSettings probe = settings_;
  probe.format = PixelFormat::Rgba8;
  probe.sourceFrameCount = frame + roles.inputs() + 1;
  RenderFrame rendered(*host_, probe, frame);
  render(rendered);

  RegionMap map;
  map.width = settings_.width;
  map.height = settings_.height;
  std::vector<uint8_t> rows(static_cast<std::size_t>(map.width) * map.height * 4);
  // Read through the host's framebuffer, as GL ES and WebGL can too.
  glBindFramebuffer(GL_FRAMEBUFFER, host_->framebuffer());
  glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D,
                         rendered.context().output.id, 0);
  glPixelStorei(GL_PACK_ALIGNMENT, 1);
  glReadPixels(0, 0, map.width, map.height, GL_RGBA, GL_UNSIGNED_BYTE, rows.data());
  glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, 0, 0);
  glBindFramebuffer(GL_FRAMEBUFFER, 0);
  map.inputs.resize(static_cast<std::size_t>(map.width) * map.height);
  for (int32_t y = 0; y < map.height; ++y) {
    // GL's rows run from the bottom.
    const uint8_t* row = rows.data() + static_cast<std::size_t>(map.height - 1 - y) * map.width * 4;
    for (int32_t x = 0; x < map.width; ++x) {
      const uint8_t* pixel = row + static_cast<std::size_t>(x) * 4;
      const int32_t shown = pixel[0] + 256 * pixel[1] - frame - 1;
      const bool input = pixel[3] == 255 && shown >= 0 && shown < roles.inputs();
      map.inputs[static_cast<std::size_t>(y) * map.width + x] =
          static_cast<int8_t>(input ? shown : -1);
    }
  }
  return map;
}

}  // namespace refhost
