// The plan of a farm job: its chunks, its file and the names of its parts.
#include "commands/farm_plan.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <limits>
#include <nlohmann/json.hpp>
#include <stdexcept>

#include "scene/json_fields.h"
#include "scene/json_file.h"
#include "scene/scene_document.h"

namespace veltrane_cli {
namespace {

namespace fs = std::filesystem;

// The plan file's format; a reader refuses others.
constexpr int32_t kPlanFormat = 1;

// A path as the plan stores it: relative to the plan's folder when given relative.
std::string storedPath(const std::string& path, const fs::path& planFolder) {
  if (fs::path(path).is_absolute()) return path;
  return fs::absolute(path).lexically_relative(fs::absolute(planFolder)).generic_string();
}

// A stored path as this process finds it.
std::string foundPath(const std::string& stored, const fs::path& planFolder) {
  if (fs::path(stored).is_absolute()) return stored;
  return (planFolder / stored).lexically_normal().generic_string();
}

fs::path folderOf(const std::string& planFile) {
  const fs::path folder = fs::path(planFile).parent_path();
  return folder.empty() ? fs::path(".") : folder;
}

nlohmann::ordered_json rangeJson(const FrameRange& range) { return {range.first, range.last}; }

FrameRange readRange(const JsonField& field, const FrameRange& within) {
  field.arraySize(2, 2, "[first, last] frames");
  FrameRange range{field.element(0).integerIn(within.first, within.last),
                   field.element(1).integerIn(within.first, within.last)};
  if (range.last < range.first) field.fail("[first, last] frames with first <= last");
  return range;
}

void readEncoding(const JsonField& output, FarmPlan& plan) {
  output.requireObject({"file", "codec", "crf", "preset", "bitDepth", "gopLength", "sound"});
  plan.encoding = refhost::encodingFor(output.member("codec").string("a codec's name"));
  if (!refhost::findVideoCodec(plan.encoding.codec)) output.member("codec").fail("a codec's name");
  if (output.member("crf").isNumber()) plan.encoding.crf = output.member("crf").integerIn(0, 63);
  if (output.member("preset").isString())
    plan.encoding.preset = output.member("preset").string("a preset's name");
  plan.encoding.bitDepth = output.member("bitDepth").integerIn(8, 16);
  plan.gopLength = output.member("gopLength").integerIn(1, 100000);
  plan.sound = output.member("sound").string("where the sound comes from");
}

}  // namespace

const char kPlanSceneTag[] = "veltrane_scene";
const char kPlanSettingsTag[] = "veltrane_settings";
const char kPlanChunkTag[] = "veltrane_chunk";

std::string FarmPlan::settingsText() const {
  const refhost::VideoCodecInfo* info = refhost::findVideoCodec(encoding.codec);
  std::string text = encoding.codec;
  if (info && info->defaultCrf)
    text += " crf " + std::to_string(encoding.crf.value_or(*info->defaultCrf));
  if (info && !info->presets.empty())
    text += " preset " + encoding.preset.value_or(info->defaultPreset);
  return text + " " + std::to_string(encoding.bitDepth) + "-bit gop " + std::to_string(gopLength) +
         ", frames " + std::to_string(frames.first) + "-" + std::to_string(frames.last) + " in " +
         std::to_string(chunks.size()) + " chunks";
}

std::string FarmPlan::chunkText(std::size_t index) const {
  const FrameRange& range = chunks.at(index).frames;
  return "chunk " + std::to_string(index) + ", frames " + std::to_string(range.first) + "-" +
         std::to_string(range.last);
}

std::vector<FrameRange> chunksOf(const FrameRange& frames, int32_t count) {
  if (count < 1 || count > frames.count())
    throw UsageError("option '--chunks': expected 1 to " + std::to_string(frames.count()) +
                     " (a chunk holds a frame at least), got '" + std::to_string(count) + "'");
  std::vector<FrameRange> chunks;
  const int32_t shortLength = frames.count() / count;
  const int32_t longer = frames.count() % count;  // the first chunks get a frame more
  int32_t next = frames.first;
  for (int32_t i = 0; i < count; ++i) {
    const int32_t length = shortLength + (i < longer ? 1 : 0);
    chunks.push_back({next, next + length - 1});
    next += length;
  }
  return chunks;
}

std::vector<FrameRange> chunksOfLength(const FrameRange& frames, int32_t length) {
  if (length < 1)
    throw UsageError("option '--chunk-frames': expected 1 or more, got '" + std::to_string(length) +
                     "'");
  std::vector<FrameRange> chunks;
  for (int64_t first = frames.first; first <= frames.last; first += length)
    chunks.push_back({static_cast<int32_t>(first),
                      static_cast<int32_t>(std::min<int64_t>(first + length - 1, frames.last))});
  return chunks;
}

std::string chunkFileName(const std::string& output, const std::string& codec, std::size_t index,
                          std::size_t count) {
  const bool quickTime = refhost::containerHolds(refhost::VideoContainer::Mov, codec);
  const std::size_t digits = std::max<std::size_t>(3, std::to_string(count - 1).size());
  std::string number = std::to_string(index);
  number.insert(0, digits - std::min(digits, number.size()), '0');
  fs::path path(output);
  path.replace_extension();
  return path.generic_string() + ".chunk" + number + (quickTime ? ".mov" : ".mkv");
}

std::string fileChecksum(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  if (!file) throw std::runtime_error(path + ": cannot read it");
  std::uint64_t hash = 14695981039346656037ull;
  char buffer[1 << 16];
  while (file.read(buffer, sizeof buffer) || file.gcount() > 0) {
    for (std::streamsize i = 0; i < file.gcount(); ++i)
      hash = (hash ^ static_cast<unsigned char>(buffer[i])) * 1099511628211ull;
  }
  char hex[17];
  std::snprintf(hex, sizeof hex, "%016llx", static_cast<unsigned long long>(hash));
  return hex;
}

void writePlan(const FarmPlan& plan) {
  const fs::path folder = folderOf(plan.file);
  nlohmann::ordered_json chunks = nlohmann::ordered_json::array();
  for (const FarmChunk& chunk : plan.chunks)
    chunks.push_back(
        {{"frames", rangeJson(chunk.frames)}, {"file", storedPath(chunk.file, folder)}});
  const refhost::VideoEncoding& encoding = plan.encoding;
  nlohmann::ordered_json audioFrom = nullptr;
  if (plan.audioFrom.kind == AudioFrom::Kind::File)
    audioFrom = {{"file", storedPath(plan.audioFrom.name, folder)}};
  if (plan.audioFrom.kind == AudioFrom::Kind::Layer) audioFrom = {{"layer", plan.audioFrom.name}};
  if (plan.audioFrom.kind == AudioFrom::Kind::Clip) audioFrom = {{"clip", plan.audioFrom.clip}};
  const nlohmann::ordered_json document = {
      {"veltranePlan", kPlanFormat},
      {"scene", {{"file", storedPath(plan.scene, folder)}, {"checksum", plan.sceneChecksum}}},
      {"output",
       {{"file", storedPath(plan.output, folder)},
        {"codec", encoding.codec},
        {"crf", encoding.crf ? nlohmann::ordered_json(*encoding.crf) : nullptr},
        {"preset", encoding.preset ? nlohmann::ordered_json(*encoding.preset) : nullptr},
        {"bitDepth", encoding.bitDepth},
        {"gopLength", plan.gopLength},
        {"sound", plan.sound}}},
      {"renderOptions", plan.renderOptions},
      {"audioFrom", audioFrom},
      {"frames", rangeJson(plan.frames)},
      {"chunks", chunks}};
  writeScene(plan.file, document);
}

FarmPlan readPlan(const std::string& path) {
  const nlohmann::ordered_json document = readJsonFile(path);
  const JsonField top(document, path);
  top.requireObject(
      {"veltranePlan", "scene", "output", "renderOptions", "audioFrom", "frames", "chunks"});
  top.member("veltranePlan").integerIn(kPlanFormat, kPlanFormat);
  FarmPlan plan;
  plan.file = path;
  const fs::path folder = folderOf(path);
  const JsonField scene = top.member("scene");
  scene.requireObject({"file", "checksum"});
  plan.scene = foundPath(scene.member("file").fileName("the scene's file"), folder);
  plan.sceneChecksum = scene.member("checksum").string("the scene's checksum");
  const JsonField output = top.member("output");
  plan.output = foundPath(output.member("file").fileName("the final video's file"), folder);
  readEncoding(output, plan);
  const JsonField options = top.member("renderOptions");
  if (!options.present() || !options.json().is_object()) options.fail("an object of options");
  for (const auto& entry : options.json().items()) {
    const JsonField value = options.member(entry.key());
    bool known = false;
    for (const OptionDefinition& definition : kRenderOutputOptions)
      known = known || definition.name == entry.key();
    if (!known) value.fail("one of render's output options");
    plan.renderOptions[entry.key()] = value.string("an option's value");
  }
  const JsonField audioFrom = top.member("audioFrom");
  if (audioFrom.present() && !audioFrom.json().is_null()) {
    audioFrom.requireObject({"file", "layer", "clip"});
    if (audioFrom.member("file").present())
      plan.audioFrom = {AudioFrom::Kind::File,
                        foundPath(audioFrom.member("file").fileName("a sound file"), folder)};
    else if (audioFrom.member("clip").present())
      plan.audioFrom = {AudioFrom::Kind::Clip, "",
                        audioFrom.member("clip").integerIn(1, std::numeric_limits<int32_t>::max())};
    else
      plan.audioFrom = {AudioFrom::Kind::Layer, audioFrom.member("layer").string("a layer's name")};
  }
  plan.frames = readRange(top.member("frames"), {0, std::numeric_limits<int32_t>::max()});
  const JsonField chunks = top.member("chunks");
  const std::size_t count = chunks.arraySize(1, 100000, "the chunks");
  int32_t next = plan.frames.first;
  for (std::size_t i = 0; i < count; ++i) {
    const JsonField chunk = chunks.element(i);
    chunk.requireObject({"frames", "file"});
    FarmChunk read{readRange(chunk.member("frames"), plan.frames),
                   foundPath(chunk.member("file").fileName("the chunk's file"), folder)};
    // The chunks cover the job's frames in order, each frame once.
    if (read.frames.first != next)
      chunk.member("frames").fail("frames from " + std::to_string(next));
    next = read.frames.last + 1;
    plan.chunks.push_back(read);
  }
  if (next != plan.frames.last + 1)
    chunks.fail("chunks up to frame " + std::to_string(plan.frames.last));
  return plan;
}

}  // namespace veltrane_cli
