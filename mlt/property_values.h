// The effect's parameters as MLT properties: each declared parameter is read from the property
// of the same id at a frame's position, keyframes interpolated by MLT, and checked the way the
// module would check it.
#pragma once

#include <framework/mlt.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "refhost/engine.h"
#include "track_layers.h"

namespace veltrane_mlt {

// A property whose text the module would refuse; the parameter took its default.
struct Refusal {
  std::string id;
  std::string text;
  std::string reason;  // e.g. "expected a number from 0 to 200"
};

struct ParamReading {
  // Every declared parameter with its value, in declaration order.
  std::vector<refhost::ParamValue> values;
  std::vector<Refusal> refusals;
};

// The composition's size, in which a rectangle's position is measured.
struct FrameSize {
  int32_t width = 0;
  int32_t height = 0;
};

// The text without the white space around it.
std::string_view trimmed(std::string_view text);

// The values of an MLT animation string, one per key ("0=15;100|=75" holds 15 and 75); a
// string without keys is its own single value.
std::vector<std::string_view> keyValues(std::string_view text);

// Reads every parameter of `panel` from `properties` at `position` of an item `length` frames
// long. An unset property gives the declared default; so does a refused one, reported in
// `refusals`. Numbers, angles, points and colours follow MLT's keyframes ("0=15;100=75");
// choices, booleans and layers hold MLT's key at or before the position. A layer's name becomes
// the GUID of the track `layers` resolves it to. A point given as a rectangle with a size
// ("x y w h", as Kdenlive writes one) is the rectangle's centre, measured from the top-left
// corner of a `frame`-sized picture, y down.
ParamReading readParams(mlt_properties properties, const refhost::ParamPanel& panel, int position,
                        int length, const FrameSize& frame, const LayerResolver& layers);

}  // namespace veltrane_mlt
