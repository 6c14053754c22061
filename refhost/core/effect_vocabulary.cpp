// The roles of the effect's parameters, read off the declared panel.
#include "refhost/core/effect_vocabulary.h"

#include <algorithm>
#include <stdexcept>

namespace refhost {
namespace {

struct Role {
  const char* id;  // the id, or the stem an index is appended to
  ParamKind kind;
};

constexpr std::array<Role, kEffectParams> kEffectRoles = {{
    {"preset", ParamKind::Choice},
    {"cutType", ParamKind::Choice},
    {"numberOfCuts", ParamKind::Int},
    {"viewCutRegions", ParamKind::Bool},
    {"cutPosition_global", ParamKind::Point},
    {"borderWidth", ParamKind::Float},
    {"borderColor", ParamKind::Color},
    {"borderAlpha", ParamKind::Float},
}};

// A cut's ids carry an underscore before the index, an input's carry the index bare.
constexpr std::array<Role, kCutParams> kCutRoles = {{
    {"cutPosition_", ParamKind::Point},
    {"cutDirection_", ParamKind::Angle},
}};
constexpr std::array<Role, kInputParams> kInputRoles = {{
    {"inputLayer", ParamKind::Layer},
    {"inputFrameShift", ParamKind::Int},
    {"inputFrameTranslation", ParamKind::Point},
    {"inputFrameScale", ParamKind::Float},
    {"inputFrameRotation", ParamKind::Angle},
}};

constexpr const char* kLocalChoice = "Local";
constexpr const char* kRadialChoice = "Radial";

std::runtime_error lacking(const std::string& what) {
  return std::runtime_error("the module's parameter panel " + what +
                            " (a module of another interface?)");
}

const Param& require(const ParamPanel& panel, const std::string& id, ParamKind kind) {
  const Param* param = panel.find(std::string_view(id));
  if (!param) throw lacking("declares no '" + id + "'");
  if (param->kind != kind)
    throw lacking("declares '" + id + "' as a " + kindName(param->kind) + ", not a " +
                  kindName(kind));
  return *param;
}

// The members of a family, index by index from 0 for as long as every role has one.
template <std::size_t N>
std::vector<std::array<std::string, N>> readFamily(const ParamPanel& panel,
                                                   const std::array<Role, N>& roles) {
  std::vector<std::array<std::string, N>> members;
  for (int32_t index = 0;; ++index) {
    std::array<std::string, N> ids;
    std::size_t found = 0;
    for (std::size_t r = 0; r < N; ++r) {
      ids[r] = roles[r].id + std::to_string(index);
      if (panel.find(std::string_view(ids[r]))) ++found;
    }
    if (found == 0) break;
    for (std::size_t r = 0; r < N; ++r) require(panel, ids[r], roles[r].kind);
    members.push_back(std::move(ids));
  }
  if (members.empty()) throw lacking(std::string("declares no '") + roles[0].id + "0'");
  return members;
}

int32_t choiceIndex(const Param& param, const char* name) {
  auto found = std::find(param.choices.begin(), param.choices.end(), name);
  if (found == param.choices.end())
    throw lacking("offers no '" + std::string(name) + "' in '" + param.id + "'");
  return static_cast<int32_t>(found - param.choices.begin());
}

// The index an id carries after `stem`: decimal digits with no leading zero, below `count`.
std::optional<int32_t> indexAfter(std::string_view id, std::string_view stem, int32_t count) {
  if (id.size() <= stem.size() || id.substr(0, stem.size()) != stem) return std::nullopt;
  const std::string_view digits = id.substr(stem.size());
  if (digits.size() > 3 || (digits.size() > 1 && digits[0] == '0')) return std::nullopt;
  int32_t index = 0;
  for (char c : digits) {
    if (c < '0' || c > '9') return std::nullopt;
    index = index * 10 + (c - '0');
  }
  if (index >= count) return std::nullopt;
  return index;
}

}  // namespace

EffectVocabulary::EffectVocabulary(const ParamPanel& panel) {
  for (std::size_t r = 0; r < kEffectRoles.size(); ++r) {
    effectIds_[r] = kEffectRoles[r].id;
    require(panel, effectIds_[r], kEffectRoles[r].kind);
  }
  cutIds_ = readFamily(panel, kCutRoles);
  inputIds_ = readFamily(panel, kInputRoles);
  const Param& cutType = *panel.find(std::string_view(id(EffectParam::CutType)));
  localIndex_ = choiceIndex(cutType, kLocalChoice);
  radialIndex_ = choiceIndex(cutType, kRadialChoice);
  declared_ = panel.params();
  for (Param& param : declared_) param.state = ParamState{};
}

const std::string& EffectVocabulary::id(EffectParam role) const {
  return effectIds_.at(static_cast<std::size_t>(role));
}

const std::string& EffectVocabulary::id(CutParam role, int32_t cut) const {
  if (cut < 0 || cut >= cuts()) throw std::out_of_range("no cut " + std::to_string(cut));
  return cutIds_[static_cast<std::size_t>(cut)][static_cast<std::size_t>(role)];
}

const std::string& EffectVocabulary::id(InputParam role, int32_t input) const {
  if (input < 0 || input >= inputs()) throw std::out_of_range("no input " + std::to_string(input));
  return inputIds_[static_cast<std::size_t>(input)][static_cast<std::size_t>(role)];
}

std::optional<std::pair<CutParam, int32_t>> EffectVocabulary::cutOf(std::string_view id) const {
  for (std::size_t r = 0; r < kCutRoles.size(); ++r) {
    if (auto index = indexAfter(id, kCutRoles[r].id, cuts()))
      return std::make_pair(static_cast<CutParam>(r), *index);
  }
  return std::nullopt;
}

std::optional<std::pair<InputParam, int32_t>> EffectVocabulary::inputOf(std::string_view id) const {
  for (std::size_t r = 0; r < kInputRoles.size(); ++r) {
    if (auto index = indexAfter(id, kInputRoles[r].id, inputs()))
      return std::make_pair(static_cast<InputParam>(r), *index);
  }
  return std::nullopt;
}

const Param& EffectVocabulary::declared(std::string_view id) const {
  for (const Param& param : declared_)
    if (param.id == id) return param;
  throw std::out_of_range("the module declared no parameter '" + std::string(id) + "'");
}

}  // namespace refhost
