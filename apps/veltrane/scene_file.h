// Scene files: the composition to render (size, rate, length, the effect's own source, the
// other layers with their sources) and the parameter values, read and checked field by field.
#pragma once

#include <nlohmann/json.hpp>
#include <set>
#include <string>

#include "refhost/engine/composition.h"

namespace veltrane_cli {

struct Scene {
  std::string file;  // as given; messages name it
  refhost::Composition composition;
  // The "params" object as written; it can only be checked against the parameters the module
  // declares (see scene_params.h). Null when the scene sets none.
  nlohmann::json params;

  // The own layer's GUID and every other layer's: what a layer parameter may name.
  std::set<std::string> layerGuids() const;
};

// Reads and checks a scene file; file sources are resolved against the scene's directory and
// opened once to prove they decode. Throws FieldError naming the file, the field and what was
// expected.
Scene loadScene(const std::string& path);

// The same for a parsed document; `baseDirectory` resolves relative file names.
Scene sceneFromJson(const nlohmann::json& document, const std::string& file,
                    const std::string& baseDirectory);

// True for "xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx" with hexadecimal digits.
bool isGuidText(const std::string& text);

}  // namespace veltrane_cli
