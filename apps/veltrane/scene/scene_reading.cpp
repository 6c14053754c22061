// Reading scene files: the composition and the parameter values as written.
#include <algorithm>
#include <cctype>
#include <cmath>
#include <filesystem>

#include "refhost/core/params.h"
#include "scene/json_fields.h"
#include "scene/json_file.h"
#include "scene/scene_document.h"

namespace veltrane_cli {
namespace {

using refhost::MediaSpec;

constexpr int32_t kLargestFrameSide = 16384;
constexpr int32_t kLongestScene = 1000000;
const char kGuidExpectation[] =
    "a GUID text of 36 characters (8-4-4-4-12 hexadecimal digits, e.g. "
    "\"0a1b2c3d-0000-4000-8000-00000000000a\")";

std::string patternList() {
  std::string list;
  for (const std::string& name : refhost::patternNames())
    list += (list.empty() ? "\"" : ", \"") + name + "\"";
  return list;
}

// Why the path cannot be a media file, in words that follow the path; empty when it can.
std::string mediaFileProblem(const std::filesystem::path& path) {
  std::error_code error;
  std::filesystem::file_status status = std::filesystem::status(path, error);
  if (status.type() == std::filesystem::file_type::not_found) return "does not exist";
  if (error) return "cannot be opened: " + error.message();
  if (std::filesystem::is_directory(status)) return "is a directory";
  if (!std::filesystem::is_regular_file(status)) return "is not a regular file";
  return "";
}

MediaSpec readSource(const JsonField& field, const std::string& baseDirectory) {
  const char* expected =
      "a source: {\"pattern\": NAME}, {\"color\": [r, g, b, a]} or {\"file\": PATH}, the last "
      "with \"fit\" if it is to keep its proportions";
  if (!field.present() || !field.json().is_object() || field.json().empty()) field.fail(expected);
  field.requireObject({"pattern", "color", "file", "fit"});
  const bool withFit = field.member("fit").present();
  if (field.json().size() != (withFit ? 2u : 1u) || (withFit && !field.member("file").present()))
    field.fail(expected);
  if (JsonField pattern = field.member("pattern"); pattern.present()) {
    auto chosen = refhost::patternFromName(pattern.string("a pattern name"));
    if (!chosen) pattern.fail("one of " + patternList());
    return MediaSpec::ofPattern(*chosen);
  }
  if (JsonField colour = field.member("color"); colour.present()) {
    std::size_t count = colour.arraySize(3, 4, "[r, g, b, a] with each from 0 to 1");
    std::array<float, 4> rgba{0, 0, 0, 1};
    for (std::size_t i = 0; i < count; ++i)
      rgba[i] = static_cast<float>(colour.element(i).numberIn(0, 1));
    return MediaSpec::ofColour(rgba);
  }
  JsonField file = field.member("file");
  std::filesystem::path path(file.fileName("a file name"));
  if (path.is_relative()) path = std::filesystem::path(baseDirectory) / path;
  if (std::string problem = mediaFileProblem(path); !problem.empty())
    file.fail("an image or video file (relative to the scene file; " + path.string() + " " +
              problem + ")");
  MediaSpec spec = MediaSpec::ofFile(path.lexically_normal().string());
  if (JsonField fit = field.member("fit"); fit.present()) {
    const std::string how = fit.string("\"stretch\" or \"contain\"");
    if (how != "stretch" && how != "contain") fit.fail("\"stretch\" or \"contain\"");
    spec.keepProportions = how == "contain";
  }
  try {
    // Opened once to prove it decodes, and to learn what the composition needs to know of it.
    spec.info = refhost::openMediaSource(spec, {25, 1})->info();
  } catch (const std::exception& error) {
    file.fail(std::string("a file that decodes (") + error.what() + ")");
  }
  return spec;
}

// The colour a video output is converted to and tagged with: a name ("bt709", "bt601") or an
// object naming any of matrix, range, primaries and transfer; what it leaves out stays as
// `fallback` (the own source's, or BT.709 limited).
refhost::ColourDescription readColourSpace(const JsonField& field,
                                           refhost::ColourDescription fallback) {
  if (!field.present()) return fallback;
  const char* named =
      "\"bt709\", \"bt601\", or {\"matrix\", \"range\", \"primaries\", \"transfer\"}";
  if (field.isString()) {
    const std::string name = field.string(named);
    if (name == "bt709") return refhost::ColourDescription::bt709();
    if (name == "bt601") return refhost::ColourDescription::bt601();
    field.fail(named);
  }
  if (!field.json().is_object()) field.fail(named);
  field.requireObject({"matrix", "range", "primaries", "transfer"});
  auto choose = [&](const char* member, const std::vector<std::string>& names, auto fromName,
                    int32_t& into) {
    JsonField value = field.member(member);
    if (!value.present()) return;
    std::string list;
    for (const std::string& name : names) list += (list.empty() ? "\"" : ", \"") + name + "\"";
    const std::string name = value.string("one of " + list);
    if (std::find(names.begin(), names.end(), name) == names.end()) value.fail("one of " + list);
    into = *fromName(name);
  };
  refhost::ColourDescription colour = fallback;
  choose("matrix", {"bt709", "bt601", "smpte170m", "bt470bg"}, refhost::matrixFromName,
         colour.matrix);
  choose("primaries", {"bt709", "smpte170m", "bt470bg"}, refhost::primariesFromName,
         colour.primaries);
  choose("transfer", {"bt709", "smpte170m", "srgb", "iec61966-2-1"}, refhost::transferFromName,
         colour.transfer);
  if (JsonField range = field.member("range"); range.present()) {
    const std::string name = range.string("\"limited\" or \"full\"");
    if (name != "limited" && name != "full") range.fail("\"limited\" or \"full\"");
    colour.fullRange = name == "full";
  }
  return colour;
}

// Frames a second as a number (25, 29.97) or as text ("30000/1001", "29.97"), from 0.001 to
// 1000; the drop-frame decimals name the /1001 rates. A number with more decimals than a person
// writes (a rate saved as a float) is taken to the microsecond of frame time, then snapped to
// the common rate it rounds.
refhost::FrameRate readFrameRate(const JsonField& field) {
  const char* expected = "a number from 0.001 to 1000, or text such as \"30000/1001\"";
  std::optional<refhost::FrameRate> rate;
  if (field.isString()) {
    rate = refhost::frameRateFromText(field.string(expected));
  } else {
    const double value = field.numberIn(0.001, 1000);
    rate = refhost::frameRateFromText(numberText(value));
    if (!rate) rate = refhost::snappedToCommonRate({std::llround(value * 1001000), 1001000});
  }
  if (!rate || rate->perSecond() < 0.001 || rate->perSecond() > 1000) field.fail(expected);
  return *rate;
}

std::string readGuid(const JsonField& field) {
  std::string guid = field.string(kGuidExpectation);
  if (!isGuidText(guid)) field.fail(kGuidExpectation);
  if (guid == refhost::kNoLayer)
    field.fail("a GUID other than the null GUID, which means no layer");
  return guid;
}

refhost::Matrix4 readPlacement(const JsonField& field) {
  field.arraySize(16, 16, "16 numbers (a column-major 4x4 matrix)");
  refhost::Matrix4 matrix{};
  for (std::size_t i = 0; i < 16; ++i)
    matrix[i] = static_cast<float>(field.element(i).number("a number"));
  return matrix;
}

refhost::CompositionLayer readLayer(const JsonField& field, const refhost::Composition& scene,
                                    const std::string& baseDirectory) {
  field.requireObject({"guid", "name", "kind", "firstFrame", "frameCount", "source", "width",
                       "height", "placement", "is3D"});
  refhost::CompositionLayer entry;
  refhost::Layer& layer = entry.layer;
  layer.guid = readGuid(field.member("guid"));
  layer.name = field.member("name").string("the layer's name (text)");
  auto optional = [&](const char* name) { return field.member(name); };
  layer.kind = optional("kind").present() ? optional("kind").integerIn(0, 255) : 0;
  layer.firstFrame = optional("firstFrame").present()
                         ? optional("firstFrame").integerIn(-kLongestScene, kLongestScene)
                         : 0;
  layer.frameCount = optional("frameCount").present()
                         ? optional("frameCount").integerIn(1, kLongestScene)
                         : scene.duration;
  layer.width =
      optional("width").present() ? optional("width").integerIn(1, kLargestFrameSide) : scene.width;
  layer.height = optional("height").present() ? optional("height").integerIn(1, kLargestFrameSide)
                                              : scene.height;
  if (optional("placement").present()) layer.placement = readPlacement(optional("placement"));
  layer.is3D = optional("is3D").present() && optional("is3D").boolean();
  entry.media = optional("source").present() ? readSource(optional("source"), baseDirectory)
                                             : MediaSpec::ofPattern(refhost::Pattern::Counter);
  return entry;
}

}  // namespace

bool isGuidText(const std::string& text) {
  if (text.size() != 36) return false;
  for (std::size_t i = 0; i < text.size(); ++i) {
    bool hyphen = i == 8 || i == 13 || i == 18 || i == 23;
    if (hyphen ? text[i] != '-' : !std::isxdigit(static_cast<unsigned char>(text[i]))) return false;
  }
  return true;
}

std::set<std::string> Scene::layerGuids() const {
  std::set<std::string> guids{composition.ownLayerGuid};
  for (const refhost::CompositionLayer& entry : composition.layers) guids.insert(entry.layer.guid);
  return guids;
}

Scene sceneFromJson(const nlohmann::ordered_json& document, const std::string& file,
                    const std::string& baseDirectory) {
  Scene scene;
  scene.file = file;
  scene.document = document;
  JsonField top(document, scene.file);
  top.requireObject({"$schema", "description", "width", "height", "fps", "duration", "pixelAspect",
                     "colorSpace", "ownLayer", "source", "layers", "params"});
  refhost::Composition& composition = scene.composition;
  composition.width = top.member("width").integerIn(1, kLargestFrameSide);
  composition.height = top.member("height").integerIn(1, kLargestFrameSide);
  composition.frameRate = readFrameRate(top.member("fps"));
  composition.duration = top.member("duration").integerIn(1, kLongestScene);
  if (JsonField aspect = top.member("pixelAspect"); aspect.present())
    composition.pixelAspect = static_cast<float>(aspect.numberIn(0.01, 100));
  if (JsonField own = top.member("ownLayer"); own.present()) {
    own.requireObject({"guid", "name"});
    if (own.member("guid").present()) composition.ownLayerGuid = readGuid(own.member("guid"));
    if (own.member("name").present())
      composition.ownLayerName = own.member("name").string("the own layer's name (text)");
  }
  composition.source = readSource(top.member("source"), baseDirectory);
  composition.colour =
      readColourSpace(top.member("colorSpace"), refhost::defaultColour(composition.source));

  std::set<std::string> guids{composition.ownLayerGuid};
  if (JsonField layers = top.member("layers"); layers.present()) {
    std::size_t count = layers.arraySize(0, 1000, "an array of layers");
    for (std::size_t i = 0; i < count; ++i) {
      composition.layers.push_back(readLayer(layers.element(i), composition, baseDirectory));
      if (!guids.insert(composition.layers.back().layer.guid).second)
        layers.element(i).member("guid").fail(
            "a GUID no other layer (nor the own layer) already has");
    }
  }
  if (JsonField params = top.member("params"); params.present()) {
    if (!params.json().is_object()) params.fail("an object of parameter ids and values");
    scene.params = params.json();
  }
  return scene;
}

Scene loadScene(const std::string& path) {
  nlohmann::ordered_json document = readJsonFile(path);
  std::string base = std::filesystem::path(path).parent_path().string();
  return sceneFromJson(document, path, base.empty() ? "." : base);
}

}  // namespace veltrane_cli
