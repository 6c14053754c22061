// The settings an editor shows for the effect, in the user's words: the bridge's layout pick
// first, then every parameter the module declares, each with its MLT property, label, kind,
// range, default and, for lists, the values offered. The descriptions for MLT, Kdenlive and
// Shotcut are all written from this one list.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "refhost/engine.h"

namespace veltrane_describe {

struct Setting {
  enum class Kind { Number, WholeNumber, Angle, Point, Color, Bool, List };
  std::string property;
  std::string group;  // "Layout", "Cuts", "Cut 2", "Picture 3", "Border"
  std::string name;   // within its group: "Position", "Track"
  Kind kind = Kind::Number;
  double minimum = 0;
  double maximum = 0;
  int decimals = 0;
  std::string unit;
  bool animated = false;
  // The value as the MLT property holds it: the module's default, and the one an editor sets
  // when the effect is dropped (a split of the two tracks, framed).
  std::string fallback;
  std::string editorDefault;
  std::vector<std::pair<std::string, std::string>> choices;  // value, shown
  std::string description;

  std::string label() const { return group.empty() ? name : group + ": " + name; }
};

// The settings of a transition (whose pictures can be the lower track) or a filter.
std::vector<Setting> settingsOf(const refhost::ParamPanel& panel, bool transition);

std::string number(double value);

}  // namespace veltrane_describe
