// Parameter values, keyframe interpolation and the declared panel.
#include "refhost/core/params.h"

#include <cstring>
#include <iterator>

#include "refhost/platform/text.h"

namespace refhost {

const char* const kNoLayer = "00000000-0000-0000-0000-000000000000";

const char* kindName(ParamKind kind) {
  switch (kind) {
    case ParamKind::Float:
      return "float";
    case ParamKind::Int:
      return "int";
    case ParamKind::Bool:
      return "bool";
    case ParamKind::Choice:
      return "choice";
    case ParamKind::Point:
      return "point";
    case ParamKind::Angle:
      return "angle";
    case ParamKind::Color:
      return "colour";
    case ParamKind::Layer:
      return "layer";
  }
  return "unknown";
}

ParamValue ParamValue::ofFloat(float value) {
  ParamValue out;
  out.number[0] = value;
  return out;
}

ParamValue ParamValue::ofInt(int32_t value) {
  ParamValue out;
  out.integer = value;
  return out;
}

ParamValue ParamValue::ofPoint(float x, float y) {
  ParamValue out;
  out.number = {x, y, 0.0f};
  return out;
}

ParamValue ParamValue::ofColor(float red, float green, float blue) {
  ParamValue out;
  out.number = {red, green, blue};
  return out;
}

ParamValue ParamValue::ofLayer(const std::string& guid) {
  ParamValue out;
  out.layer = guid;
  return out;
}

bool ParamValue::operator==(const ParamValue& other) const {
  return std::memcmp(number.data(), other.number.data(), sizeof(float) * number.size()) == 0 &&
         integer == other.integer && layer == other.layer;
}

std::string formatValue(ParamKind kind, const ParamValue& value) {
  switch (kind) {
    case ParamKind::Float:
    case ParamKind::Angle:
      return formatFloat(value.number[0]);
    case ParamKind::Point:
      return "(" + formatFloat(value.number[0]) + ", " + formatFloat(value.number[1]) + ")";
    case ParamKind::Color:
      return "(" + formatFloat(value.number[0]) + ", " + formatFloat(value.number[1]) + ", " +
             formatFloat(value.number[2]) + ")";
    case ParamKind::Int:
    case ParamKind::Bool:
    case ParamKind::Choice:
      return std::to_string(value.integer);
    case ParamKind::Layer:
      return std::string(value.layer);
  }
  return "";
}

namespace {

bool interpolates(ParamKind kind) {
  return kind == ParamKind::Float || kind == ParamKind::Point || kind == ParamKind::Angle ||
         kind == ParamKind::Color;
}

}  // namespace

ParamValue Param::valueAt(int32_t time) const {
  const auto& keys = state.keyframes;
  if (keys.empty()) return state.value;
  auto after = keys.upper_bound(time);  // first keyframe later than the time
  if (after == keys.begin()) return after->second;
  auto before = std::prev(after);
  if (after == keys.end() || before->first == time || !interpolates(kind)) return before->second;
  // Times are whole frames, so the fraction is exact in double before the one rounding to float.
  double fraction = (static_cast<double>(time) - before->first) /
                    (static_cast<double>(after->first) - before->first);
  ParamValue out = before->second;
  for (std::size_t i = 0; i < out.number.size(); ++i) {
    double from = before->second.number[i];
    double to = after->second.number[i];
    out.number[i] = static_cast<float>(from + (to - from) * fraction);
  }
  return out;
}

void Param::edit(int32_t time, const ParamValue& value) {
  if (state.keyframes.empty())
    state.value = value;
  else
    state.keyframes[time] = value;
}

void ParamPanel::beginGroup(const std::string& displayName) {
  ParamGroup group;
  group.displayName = displayName;
  group.parent = openGroups_.empty() ? -1 : openGroups_.back();
  int index = static_cast<int>(groups_.size());
  groups_.push_back(std::move(group));
  PanelItem item{true, index};
  if (openGroups_.empty())
    topLevel_.push_back(item);
  else
    groups_[static_cast<std::size_t>(openGroups_.back())].items.push_back(item);
  openGroups_.push_back(index);
}

bool ParamPanel::endGroup() {
  if (openGroups_.empty()) return false;
  groups_[static_cast<std::size_t>(openGroups_.back())].closed = true;
  openGroups_.pop_back();
  return true;
}

bool ParamPanel::add(Param param) {
  if (find(param.id)) return false;
  param.group = openGroups_.empty() ? -1 : openGroups_.back();
  PanelItem item{false, static_cast<int>(params_.size())};
  if (param.group < 0)
    topLevel_.push_back(item);
  else
    groups_[static_cast<std::size_t>(param.group)].items.push_back(item);
  params_.push_back(std::move(param));
  if (slots_.size() < 2 * params_.size()) {
    rebuildIndex();
  } else {
    slots_[slotOf(params_.back().id)] = static_cast<int32_t>(params_.size() - 1);
  }
  return true;
}

std::vector<std::string> ParamPanel::groupPath(const Param& param) const {
  std::vector<std::string> path;
  for (int group = param.group; group >= 0; group = groups_[static_cast<std::size_t>(group)].parent)
    path.insert(path.begin(), groups_[static_cast<std::size_t>(group)].displayName);
  return path;
}

namespace {

// FNV-1a: short ids that differ in their last character (cut and input numbers) spread well.
constexpr uint64_t kHashStart = 14695981039346656037ull;
constexpr uint64_t kHashFactor = 1099511628211ull;

}  // namespace

std::size_t ParamPanel::hashOf(std::string_view text) {
  uint64_t hash = kHashStart;
  for (char c : text) hash = (hash ^ static_cast<uint8_t>(c)) * kHashFactor;
  return static_cast<std::size_t>(hash);
}

// The slot holding the id, or the empty slot where it would go.
std::size_t ParamPanel::slotOf(std::string_view id, std::size_t hash) const {
  const std::size_t mask = slots_.size() - 1;
  for (std::size_t slot = hash & mask;; slot = (slot + 1) & mask) {
    const int32_t held = slots_[slot];
    if (held < 0 || params_[static_cast<std::size_t>(held)].id == id) return slot;
  }
}

void ParamPanel::rebuildIndex() {
  std::size_t size = 16;
  while (size < 2 * params_.size()) size *= 2;
  slots_.assign(size, -1);
  for (std::size_t i = 0; i < params_.size(); ++i)
    slots_[slotOf(params_[i].id)] = static_cast<int32_t>(i);
}

Param* ParamPanel::find(std::string_view id) {
  return const_cast<Param*>(static_cast<const ParamPanel*>(this)->find(id));
}

const Param* ParamPanel::find(const char* id) const {
  if (slots_.empty() || !id) return nullptr;
  uint64_t hash = kHashStart;
  const char* end = id;
  for (; *end; ++end) hash = (hash ^ static_cast<uint8_t>(*end)) * kHashFactor;
  const int32_t held = slots_[slotOf(std::string_view(id, static_cast<std::size_t>(end - id)),
                                     static_cast<std::size_t>(hash))];
  return held < 0 ? nullptr : &params_[static_cast<std::size_t>(held)];
}

const Param* ParamPanel::find(std::string_view id) const {
  if (slots_.empty()) return nullptr;
  const int32_t held = slots_[slotOf(id)];
  return held < 0 ? nullptr : &params_[static_cast<std::size_t>(held)];
}

}  // namespace refhost
