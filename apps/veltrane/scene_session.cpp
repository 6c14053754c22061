// Bringing a scene up in the plug-in and rendering its frames.
#include "scene_session.h"

#include "json_fields.h"
#include "scene_params.h"

namespace veltrane_cli {

SceneSession::SceneSession(const Scene& scene, const std::string& modulePath,
                           refhost::GlProfile profile, int32_t hostId,
                           std::unique_ptr<refhost::GlContext> context)
    : plugin_(modulePath, profile, std::move(context)),
      file_(scene.file),
      layerCount_(scene.composition.layers.size()) {
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

std::runtime_error SceneSession::memoryError() const {
  std::string layers = layerCount_ == 0   ? ""
                       : layerCount_ == 1 ? " and 1 layer"
                                          : " and " + std::to_string(layerCount_) + " layers";
  return std::runtime_error(file_ + ": width, height: not enough memory for frames of " +
                            std::to_string(settings_.width) + "x" +
                            std::to_string(settings_.height) + layers +
                            "; expected a smaller frame size");
}

refhost::RgbaImage SceneSession::render(int32_t frame) {
  try {
    return renderFrame(frame)->readOutput();
  } catch (const std::bad_alloc&) {
    throw memoryError();
  }
}

std::unique_ptr<refhost::RenderFrame> SceneSession::renderFrame(int32_t frame) {
  auto context = std::make_unique<refhost::RenderFrame>(host(), settings_, frame);
  draw(*context);
  return context;
}

void SceneSession::draw(refhost::RenderFrame& frame) {
  try {
    plugin_.send(12, &frame.context(), nullptr, {1});
    plugin_.send(10, &frame.context(), nullptr, {1});
  } catch (const std::bad_alloc&) {
    throw memoryError();
  }
}

}  // namespace veltrane_cli
