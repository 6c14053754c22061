// The host's parameter panel: what the plug-in declared (kind, names, groups, flags, ranges,
// defaults, enabled state) and each parameter's animated value.
#pragma once

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>
#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace refhost {

enum class ParamKind { Float, Int, Bool, Choice, Point, Angle, Color, Layer };

const char* kindName(ParamKind kind);  // "float", "int", "bool", "choice", "point", ...

// GUID text that stands for "no layer"; also every layer parameter's default.
extern const char* const kNoLayer;

// A layer reference: GUID text of at most 36 characters, held inline so that a value copies
// without touching the heap (every parameter read copies one).
class GuidText {
 public:
  static constexpr std::size_t kMaxLength = 36;
  GuidText() : GuidText(kNoLayer) {}
  // Longer text is cut to 36 characters, as the plug-in's buffers hold no more.
  GuidText(std::string_view text) {  // NOLINT: converts like the text it holds
    length_ = static_cast<uint8_t>(std::min(text.size(), kMaxLength));
    std::memcpy(text_, text.data(), length_);
    text_[length_] = '\0';
  }
  GuidText(const char* text) : GuidText(std::string_view(text ? text : "")) {}  // NOLINT
  GuidText(const std::string& text) : GuidText(std::string_view(text)) {}       // NOLINT
  operator std::string() const { return std::string(text_, length_); }          // NOLINT
  operator std::string_view() const { return {text_, length_}; }                // NOLINT
  const char* c_str() const { return text_; }
  const char* data() const { return text_; }
  std::size_t size() const { return length_; }
  bool empty() const { return length_ == 0; }
  friend bool operator==(const GuidText& a, const GuidText& b) {
    return std::string_view(a) == std::string_view(b);
  }
  friend bool operator!=(const GuidText& a, const GuidText& b) { return !(a == b); }

 private:
  char text_[kMaxLength + 1];
  uint8_t length_ = 0;
};

// One value of any kind. Float and angle use number[0], point number[0..1], colour
// number[0..2] (red, green, blue); int, bool and choice use integer; layer uses layer.
struct ParamValue {
  std::array<float, 3> number{};
  int32_t integer = 0;
  GuidText layer;

  static ParamValue ofFloat(float value);
  static ParamValue ofInt(int32_t value);
  static ParamValue ofPoint(float x, float y);
  static ParamValue ofColor(float red, float green, float blue);
  static ParamValue ofLayer(const std::string& guid);

  // Compares bit patterns of the numbers, so NaN equals NaN and 0 differs from -0: an undo
  // restores exactly what was there.
  bool operator==(const ParamValue& other) const;
  bool operator!=(const ParamValue& other) const { return !(*this == other); }
};

// Renders the value as the given kind shows it: "1.5", "(0, 0)", "(1, 0.5, 0)", "2", GUID text.
std::string formatValue(ParamKind kind, const ParamValue& value);

// Everything about a parameter that changes over its life: the static value and the keyframes.
// A parameter with keyframes is animated and its static value is not used.
struct ParamState {
  ParamValue value;
  std::map<int32_t, ParamValue> keyframes;
  bool operator==(const ParamState& other) const {
    return value == other.value && keyframes == other.keyframes;
  }
};

struct Param {
  ParamKind kind = ParamKind::Float;
  std::string id;
  std::string displayName;
  std::string unit;
  int32_t flags = 0;
  double minimum = 0;  // float and int ranges, exactly as declared
  double maximum = 0;
  ParamValue defaultValue;
  int32_t precision = 0;             // float
  std::vector<std::string> choices;  // choice, split at '|'
  uint8_t extra = 0;                 // angle: the extra byte, passed on unread
  int group = -1;                    // index into ParamPanel::groups(), -1 at top level
  // Usable in the panel. A parameter declared with kParamFlagNotInUse starts disabled;
  // SetParamEnabled decides from then on.
  bool enabled = true;
  ParamState state;

  // Linear between keyframes for float, point, angle and colour; held (the last keyframe at or
  // before the time) for int, bool, choice and layer. Before the first keyframe the first one
  // holds, after the last the last one.
  ParamValue valueAt(int32_t time) const;
  // An animated parameter gets a keyframe at the time; a static one a new static value.
  void edit(int32_t time, const ParamValue& value);
};

struct PanelItem {
  bool isGroup = false;
  int index = 0;  // into params() or groups()
};

struct ParamGroup {
  std::string displayName;
  int parent = -1;
  bool closed = false;
  std::vector<PanelItem> items;  // declaration order
};

// The parameters and groups in declaration order, with the nesting the declaration built.
class ParamPanel {
 public:
  // Opens a group inside the innermost open group.
  void beginGroup(const std::string& displayName);
  // False when no group is open.
  bool endGroup();
  // False (and nothing declared) when the id is already declared.
  bool add(Param param);

  const std::vector<Param>& params() const { return params_; }
  const std::vector<ParamGroup>& groups() const { return groups_; }
  const std::vector<PanelItem>& topLevel() const { return topLevel_; }
  int openGroupDepth() const { return static_cast<int>(openGroups_.size()); }
  // Display names from the outermost group down to the parameter's own group.
  std::vector<std::string> groupPath(const Param& param) const;

  // Null when the id was never declared. Looking up allocates nothing.
  Param* find(std::string_view id);
  const Param* find(std::string_view id) const;
  // The same for the zero-terminated ids the plug-in passes, read in one pass.
  const Param* find(const char* id) const;
  Param* find(const char* id) {
    return const_cast<Param*>(static_cast<const ParamPanel*>(this)->find(id));
  }

 private:
  std::vector<Param> params_;
  std::vector<ParamGroup> groups_;
  std::vector<PanelItem> topLevel_;
  std::vector<int> openGroups_;
  // Open addressing over the ids' hashes: a read by id hashes the id once and compares it with
  // one declared id in the usual case. Slots hold an index into params_, or -1; there are
  // always at least twice as many slots as parameters.
  std::size_t slotOf(std::string_view id) const { return slotOf(id, hashOf(id)); }
  std::size_t slotOf(std::string_view id, std::size_t hash) const;
  static std::size_t hashOf(std::string_view text);
  void rebuildIndex();
  std::vector<int32_t> slots_;
};

}  // namespace refhost
