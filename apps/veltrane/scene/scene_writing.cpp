// Writing scene documents: the saved values and the staged write.
#include <cmath>
#include <filesystem>
#include <ostream>
#include <sstream>
#include <stdexcept>

#include "refhost/platform/staged_file.h"
#include "scene/scene_document.h"
#include "scene/scene_params.h"

namespace veltrane_cli {
namespace {

namespace fs = std::filesystem;

void moveFileSource(nlohmann::ordered_json& holder, const fs::path& from, const fs::path& to) {
  if (!holder.is_object() || !holder.contains("source")) return;
  nlohmann::ordered_json& source = holder["source"];
  if (!source.is_object() || !source.contains("file") || !source["file"].is_string()) return;
  fs::path file = source["file"].get<std::string>();
  if (file.is_absolute()) return;
  source["file"] = (from / file).lexically_normal().lexically_relative(to).generic_string();
}

constexpr std::size_t kLineLength = 100;

// The value on one line, with a space after every comma and colon: {"pattern": "bars"}.
std::string oneLine(const nlohmann::ordered_json& value) {
  // Whole numbers without a fraction: a border of 4, not 4.0.
  if (value.is_number_float() && std::abs(value.get<double>()) < 1e15 &&
      std::trunc(value.get<double>()) == value.get<double>())
    return std::to_string(static_cast<long long>(value.get<double>()));
  if (!value.is_structured()) return value.dump();
  bool object = value.is_object();
  std::string text = object ? "{" : "[";
  for (auto it = value.begin(); it != value.end(); ++it) {
    if (it != value.begin()) text += ", ";
    if (object) text += nlohmann::ordered_json(it.key()).dump() + ": ";
    text += oneLine(it.value());
  }
  return text + (object ? "}" : "]");
}

// As a person writes a scene: what fits stays on one line, the rest one member per line.
void writeJson(std::ostream& out, const nlohmann::ordered_json& value, std::size_t indent,
               std::size_t lead) {
  std::string flat = oneLine(value);
  if (!value.is_structured() || value.empty() || indent + lead + flat.size() <= kLineLength) {
    out << flat;
    return;
  }
  bool object = value.is_object();
  std::string inner(indent + 2, ' ');
  out << (object ? "{\n" : "[\n");
  std::size_t i = 0;
  for (auto it = value.begin(); it != value.end(); ++it, ++i) {
    std::string key = object ? nlohmann::ordered_json(it.key()).dump() + ": " : "";
    out << inner << key;
    writeJson(out, it.value(), indent + 2, key.size() + 1);
    out << (i + 1 < value.size() ? ",\n" : "\n");
  }
  out << std::string(indent, ' ') << (object ? "}" : "]");
}

std::string directoryOf(const std::string& path) {
  std::string parent = fs::path(path).parent_path().string();
  return parent.empty() ? "." : parent;
}

}  // namespace

nlohmann::ordered_json savedScene(const Scene& scene, const refhost::ParamPanel& panel,
                                  const std::string& toDirectory) {
  nlohmann::ordered_json document = scene.document;
  nlohmann::ordered_json values = paramValuesJson(panel);
  nlohmann::ordered_json params = nlohmann::ordered_json::object();
  for (const refhost::Param& param : panel.params()) {
    bool isDefault = param.state.keyframes.empty() && param.state.value == param.defaultValue;
    if (!isDefault) params[param.id] = values[param.id];
  }
  document["params"] = params;
  return movedTo(document, directoryOf(scene.file), toDirectory);
}

nlohmann::ordered_json movedTo(nlohmann::ordered_json document, const std::string& fromDirectory,
                               const std::string& toDirectory) {
  fs::path from = fs::absolute(fromDirectory).lexically_normal();
  fs::path to = fs::absolute(toDirectory).lexically_normal();
  if (from == to) return document;
  moveFileSource(document, from, to);
  if (document.contains("layers") && document["layers"].is_array()) {
    for (nlohmann::ordered_json& layer : document["layers"]) moveFileSource(layer, from, to);
  }
  return document;
}

void writeScene(const std::string& path, const nlohmann::ordered_json& document) {
  std::ostringstream text;
  writeJson(text, document, 0, 0);
  text << "\n";
  // Every write, the flush and the close are checked, and the old scene stays until the new one
  // is complete.
  refhost::writeFileAtomically(path, text.str());
}

}  // namespace veltrane_cli
