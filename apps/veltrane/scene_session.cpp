// Bringing a scene up in the plug-in and rendering its frames.
#include "scene_session.h"

#include "json_fields.h"
#include "scene_params.h"

namespace veltrane_cli {

SceneSession::SceneSession(const Scene& scene, const std::string& modulePath,
                           refhost::GlProfile profile, int32_t hostId)
    : plugin_(modulePath, profile) {
  refhost::Host& host = plugin_.host();
  host.setHostId(hostId);
  refhost::InstalledComposition installed = refhost::installComposition(host, scene.composition);
  const refhost::Composition& composition = scene.composition;
  settings_.width = composition.width;
  settings_.height = composition.height;
  settings_.frameRate = composition.frameRate;
  settings_.pixelAspect = composition.pixelAspect;
  settings_.sourceFrameCount = installed.sourceFrameCount;
  settings_.ownLayerGuid = composition.ownLayerGuid;

  layerGuids_ = scene.layerGuids();

  plugin_.load();
  // The values are checked against the declared panel before the instance exists, so a bad
  // scene stops before any GL work.
  nlohmann::json wrapped = {
      {"params", scene.params.is_null() ? nlohmann::json::object() : scene.params}};
  JsonField document(wrapped, scene.file);
  std::vector<ParamSetting> settings =
      readParamSettings(document.member("params"), host.panel(), layerGuids_);
  plugin_.createInstance();
  setParams(settings);
}

void SceneSession::applyParams(const nlohmann::json& params, const std::string& file) {
  // Wrapped so that messages name fields as a scene file has them: "params.borderWidth".
  nlohmann::json wrapped = {{"params", params}};
  JsonField document(wrapped, file);
  setParams(readParamSettings(document.member("params"), host().panel(), layerGuids_));
}

void SceneSession::setParams(const std::vector<ParamSetting>& settings) {
  applyParamSettings(host(), settings);
  for (const ParamSetting& setting : settings) {
    WispParamEvent event{setting.id.c_str()};
    host().setEvent(&event);
    try {
      plugin_.send(7);
    } catch (...) {
      host().setEvent(nullptr);
      throw;
    }
    host().setEvent(nullptr);
  }
}

refhost::RgbaImage SceneSession::render(int32_t frame) {
  refhost::RenderFrame context(host(), settings_, frame);
  draw(context);
  return context.readOutput();
}

void SceneSession::draw(refhost::RenderFrame& frame) {
  host().setRenderContext(&frame.context());
  try {
    plugin_.send(12);
    plugin_.send(10);
  } catch (...) {
    host().setRenderContext(nullptr);
    throw;
  }
  host().setRenderContext(nullptr);
}

}  // namespace veltrane_cli
