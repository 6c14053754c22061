// Scene files: the composition to render (size, rate, length, the effect's own source, the
// other layers with their sources) and the parameter values, read and checked field by field,
// and written back with the values a person set, the document's own order and fields kept.
#pragma once

#include <nlohmann/json.hpp>
#include <set>
#include <string>
#include <vector>

#include "refhost/core/params.h"
#include "refhost/engine/composition.h"

namespace veltrane_cli {

struct Scene {
  std::string file;  // as given; messages name it
  // The document as written, members in their order: what a save starts from.
  nlohmann::ordered_json document;
  refhost::Composition composition;
  // The "params" object as written; it can only be checked against the parameters the module
  // declares (see scene_params.h). Null when the scene sets none.
  nlohmann::ordered_json params;

  // The own layer's GUID and every other layer's: what a layer parameter may name.
  std::set<std::string> layerGuids() const;
};

// Reads and checks a scene file; file sources are resolved against the scene's directory and
// opened once to prove they decode. Throws FieldError naming the file, the field and what was
// expected.
Scene loadScene(const std::string& path);

// The media files a scene file names, resolved against its folder, read from the document
// alone: nothing is opened or decoded. Those it can find in a document that fails to read.
std::vector<std::string> sceneMediaFiles(const std::string& path);

// The media files of a composition: its own source's and its layers'.
std::vector<std::string> mediaFilesOf(const refhost::Composition& composition);

// The same as loadScene for a parsed document; `baseDirectory` resolves relative file names.
Scene sceneFromJson(const nlohmann::ordered_json& document, const std::string& file,
                    const std::string& baseDirectory);

// The scene's document with "params" replaced by every parameter that differs from its
// declared default (animated ones as keys) and relative file sources rewritten from the
// scene's folder to `toDirectory`, so that the saved scene finds the same media from its new
// place.
nlohmann::ordered_json savedScene(const Scene& scene, const refhost::ParamPanel& panel,
                                  const std::string& toDirectory);

// The document with its relative file sources rewritten from `fromDirectory` to `toDirectory`,
// so that a scene saved there finds the same media.
nlohmann::ordered_json movedTo(nlohmann::ordered_json document, const std::string& fromDirectory,
                               const std::string& toDirectory);

// Writes the document as a person writes a scene (what fits on a line stays on one) under a
// temporary name beside `path` and renames it into place. Throws std::runtime_error naming
// the file when it cannot be written.
void writeScene(const std::string& path, const nlohmann::ordered_json& document);

// True for "xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx" with hexadecimal digits.
bool isGuidText(const std::string& text);

}  // namespace veltrane_cli
