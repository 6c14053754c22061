// Saving what the viewer shows as a scene file: the document it was opened from with the
// panel's current values, so that `veltrane render` makes the same pictures from it.
#pragma once

#include <nlohmann/json.hpp>
#include <string>

#include "refhost/core/params.h"

namespace veltrane_viewer {

// `original` with "params" replaced by every parameter that differs from its declared default
// (animated ones as keys) and relative file sources rewritten from `fromDirectory` to
// `toDirectory`, so that the saved scene finds the same media from its new place.
nlohmann::ordered_json savedScene(const nlohmann::ordered_json& original,
                                  const refhost::ParamPanel& panel,
                                  const std::string& fromDirectory, const std::string& toDirectory);

// Writes the document under a temporary name beside `path` and renames it into place. Throws
// std::runtime_error naming the file when it cannot be written.
void writeScene(const std::string& path, const nlohmann::ordered_json& document);

}  // namespace veltrane_viewer
