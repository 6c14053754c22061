// A scene running in the plug-in: its composition installed in an engine, the plug-in started,
// the scene's parameters checked against the declared panel, an instance created and the
// values set and reported.
#pragma once

#include <cstdint>
#include <memory>
#include <nlohmann/json.hpp>
#include <optional>
#include <set>
#include <string>

#include "refhost/engine.h"
#include "scene/scene_document.h"

namespace veltrane_cli {

struct SceneEngineOptions {
  std::string modulePath;
  // A module linked into the program (a browser page) instead of the file at modulePath.
  std::optional<refhost::ModuleEntryPoints> entryPoints;
  refhost::GlProfile profile = refhost::GlProfile::Core;
  int32_t hostId = 0;
  // A window's context to draw in, or null for the engine's own.
  std::unique_ptr<refhost::GlContext> context;
  // Bits a channel of the output: above 8, the frames are kept in half floats (as they are
  // when an input holds more than 8).
  int32_t outputBitDepth = 8;
  // Told about every message and the plug-in's calls during it (see refhost::EngineOptions).
  std::function<void(int32_t, int32_t, const std::vector<std::string>&)> onMessage;
};

// Sends 0 and 2, checks the scene's parameters (FieldError naming the scene file on a bad
// one), sends 3 and 8, sets the parameters and reports each with message 7. The host's
// complaints about the plug-in's calls are printed to stderr once each.
std::unique_ptr<refhost::Engine> startScene(const Scene& scene, SceneEngineOptions options);

// Checks and sets parameter values written as a scene's "params" object, each reported with
// message 7. Throws FieldError naming `file` for a bad one. `layerGuids` are what a layer
// parameter may name besides the null GUID.
void applySceneParams(refhost::Engine& engine, const nlohmann::ordered_json& params,
                      const std::string& file, const std::set<std::string>& layerGuids);

}  // namespace veltrane_cli
