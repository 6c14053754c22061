// Bringing a scene up in the plug-in.
#include "scene/scene_engine.h"

#include <algorithm>
#include <cstdio>

#include "refhost/gl/headless_context.h"
#include "scene/json_fields.h"
#include "scene/scene_params.h"

namespace veltrane_cli {
namespace {

std::vector<ParamSetting> checkedSettings(const refhost::Engine& engine,
                                          const nlohmann::ordered_json& params,
                                          const std::string& file,
                                          const std::set<std::string>& layerGuids) {
  // Wrapped so that messages name fields as a scene file has them: "params.borderWidth".
  nlohmann::ordered_json wrapped = {
      {"params", params.is_null() ? nlohmann::ordered_json::object() : params}};
  JsonField document(wrapped, file);
  std::vector<ParamSetting> settings =
      readParamSettings(document.member("params"), engine.panel(), layerGuids);
  // Reported in id order, so that the order of a document's members changes nothing.
  std::sort(settings.begin(), settings.end(),
            [](const ParamSetting& a, const ParamSetting& b) { return a.id < b.id; });
  return settings;
}

// A Radial layout shows inputs 1 to 8 only: a scene that sets input 0 in one has made a mistake
// the render would hide, so it is named once on stderr.
void noteUnusedInputZero(const refhost::EffectVocabulary& roles,
                         const std::vector<ParamSetting>& settings, const std::string& file) {
  bool radial = false;
  std::string inputZero;
  for (const ParamSetting& setting : settings) {
    if (setting.id == roles.id(refhost::EffectParam::CutType)) {
      auto isRadial = [&](const refhost::ParamValue& value) {
        return roles.cutTypeOf(value.integer) == refhost::CutType::Radial;
      };
      radial = isRadial(setting.value);
      for (const auto& key : setting.keys) radial = radial || isRadial(key.second);
    }
    const auto input = roles.inputOf(setting.id);
    if (input && input->second == 0 && inputZero.empty()) inputZero = setting.id;
  }
  if (radial && !inputZero.empty())
    std::fprintf(stderr,
                 "veltrane: note: %s: params.%s: a Radial layout never shows input 0 (its "
                 "sectors show inputs 1 to 8), so this value goes unused\n",
                 file.c_str(), inputZero.c_str());
}

}  // namespace

std::unique_ptr<refhost::Engine> startScene(const Scene& scene, SceneEngineOptions options) {
  refhost::EngineOptions engineOptions;
  engineOptions.modulePath = options.modulePath;
  engineOptions.entryPoints = options.entryPoints;
  engineOptions.profile = options.profile;
  engineOptions.context = std::move(options.context);
  engineOptions.makeContext = refhost::makeHeadlessContext;
  engineOptions.hostId = options.hostId;
  engineOptions.documentName = scene.file;
  engineOptions.onMessage = std::move(options.onMessage);
  engineOptions.onHostProblem = [](const std::string& problem) {
    std::fprintf(stderr, "veltrane: host: %s\n", problem.c_str());
  };
  auto engine = std::make_unique<refhost::Engine>(std::move(engineOptions));
  refhost::installComposition(*engine, scene.composition,
                              refhost::frameFormatFor(scene.composition, options.outputBitDepth));
  engine->start();
  // The values are checked against the declared panel before the instance exists, so a bad
  // scene stops before any GL work.
  std::vector<ParamSetting> settings =
      checkedSettings(*engine, scene.params, scene.file, scene.layerGuids());
  noteUnusedInputZero(engine->vocabulary(), settings, scene.file);
  engine->createInstance();
  applyParamSettings(*engine, settings);
  return engine;
}

void applySceneParams(refhost::Engine& engine, const nlohmann::ordered_json& params,
                      const std::string& file, const std::set<std::string>& layerGuids) {
  applyParamSettings(engine, checkedSettings(engine, params, file, layerGuids));
}

}  // namespace veltrane_cli
