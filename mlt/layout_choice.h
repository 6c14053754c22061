// The layout an editor picks for the effect (the bridge's own properties `layout`,
// `layout_angle` and `frame_pictures`) and what it does to the parameters: a named layout's
// cuts replace the cut parameters, and with framing on, every input it shows is moved and
// scaled onto its region as `veltrane split` frames it. Layers, time shifts and the border keep
// their own properties.
#pragma once

#include <framework/mlt.h>

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <tuple>
#include <vector>

#include "refhost/engine.h"

namespace veltrane_mlt {

extern const char* const kLayoutProperty;         // a layout's name; "none" or empty: none
extern const char* const kLayoutAngleProperty;    // degrees the layout is turned by; animated
extern const char* const kFramePicturesProperty;  // 1: each picture framed on its region

struct LayoutChoice {
  std::optional<std::size_t> layout;  // an index into veltrane_cli::layouts()
  double angle = 0;
  bool framePictures = false;
};

// The choice at `position` of an item `length` frames long; `problem` gets what was refused
// (an unknown layout's name), which then counts as none.
LayoutChoice readLayoutChoice(mlt_properties properties, int position, int length,
                              std::string* problem);

// The values (every declared parameter, declaration order) with the choice applied. The
// framing of each layout, angle and frame size is worked out once, from the regions the
// module reports for it, and kept.
class LayoutApplier {
 public:
  void apply(refhost::Engine& engine, const LayoutChoice& choice,
             std::vector<refhost::ParamValue>& values);

 private:
  using Key = std::tuple<std::size_t, double, int32_t, int32_t>;
  std::map<Key, std::vector<std::pair<std::string, refhost::ParamValue>>> framings_;
};

}  // namespace veltrane_mlt
