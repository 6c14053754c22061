// The effect's vocabulary on the host side: which declared parameter plays which role. The ids
// of the effect-wide parameters, the stems of the per-cut and per-input families with their
// index rules, and the names of the cut types are written here and nowhere else on the host
// side; how many cuts and inputs there are, each parameter's kind, default and range come from
// the panel the module declared, and are checked against what the roles need when the model is
// built. Scenes, layouts, the viewer, benches and the bridges to editors all speak through it.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "refhost/core/params.h"

namespace refhost {

// Parameters the effect has once.
enum class EffectParam {
  Preset,
  CutType,
  NumberOfCuts,
  ViewCutRegions,
  GlobalPosition,  // the Radial cuts' shared centre
  BorderWidth,
  BorderColor,
  BorderAlpha,
};
constexpr std::size_t kEffectParams = 8;

// Parameters each cut has.
enum class CutParam { Position, Direction };
constexpr std::size_t kCutParams = 2;

// Parameters each input has.
enum class InputParam { Layer, Shift, Translation, Scale, Rotation };
constexpr std::size_t kInputParams = 5;

// The cut types, as the cut type's choices name them.
enum class CutType { Local, Radial };

class EffectVocabulary {
 public:
  // Reads the roles off a declared panel. Throws std::runtime_error naming the first thing a
  // role needs and the panel lacks: a parameter, its kind, or a member of a family (a module of
  // another interface).
  explicit EffectVocabulary(const ParamPanel& panel);

  int32_t cuts() const { return static_cast<int32_t>(cutIds_.size()); }
  int32_t inputs() const { return static_cast<int32_t>(inputIds_.size()); }

  // Ids; an index out of range throws std::out_of_range.
  const std::string& id(EffectParam role) const;
  const std::string& id(CutParam role, int32_t cut) const;
  const std::string& id(InputParam role, int32_t input) const;

  // The role and index an id has by the families' index rules; nothing for any other id.
  std::optional<std::pair<CutParam, int32_t>> cutOf(std::string_view id) const;
  std::optional<std::pair<InputParam, int32_t>> inputOf(std::string_view id) const;

  // The declared records (kind, default, range, choices), without any value.
  const Param& declared(EffectParam role) const { return declared(id(role)); }
  const Param& declared(CutParam role, int32_t cut) const { return declared(id(role, cut)); }
  const Param& declared(InputParam role, int32_t input) const { return declared(id(role, input)); }
  const Param& declared(std::string_view id) const;

  // The cut type's choice index for a type, and the type for an index (any index that is not
  // Radial's is Local, as the effect reads it).
  int32_t choiceOf(CutType type) const {
    return type == CutType::Radial ? radialIndex_ : localIndex_;
  }
  CutType cutTypeOf(int32_t choice) const {
    return choice == radialIndex_ ? CutType::Radial : CutType::Local;
  }

 private:
  using CutIds = std::array<std::string, kCutParams>;
  using InputIds = std::array<std::string, kInputParams>;

  std::array<std::string, kEffectParams> effectIds_;
  std::vector<CutIds> cutIds_;
  std::vector<InputIds> inputIds_;
  std::vector<Param> declared_;  // every declared parameter, declaration order, values dropped
  int32_t localIndex_ = 0;
  int32_t radialIndex_ = 1;
};

}  // namespace refhost
