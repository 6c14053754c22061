// Layouts people ask a split screen for (diagonals, grids, radial sectors, a picture in a
// corner), as the parameter values that make them for a frame size and a list of pictures.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "refhost/core/params.h"

namespace veltrane_viewer {

struct LayoutPreset {
  const char* name;      // as the Presets menu lists it
  const char* fileStem;  // as the example scenes are named
};

const std::vector<LayoutPreset>& layoutPresets();

struct ParamEdit {
  std::string id;
  refhost::ParamValue value;
};

// Every cut and input parameter of the layout (unused cuts and inputs back to their defaults)
// for a frame of width x height. The inputs the layout shows take `sources` in turn (a layer
// GUID each, the null GUID for the effect's own input), cycling when there are fewer; the
// picture-in-picture inset shows its picture whole, scaled into the corner. Throws
// std::out_of_range for a bad index.
std::vector<ParamEdit> presetEdits(std::size_t index, int32_t width, int32_t height,
                                   const std::vector<std::string>& sources);

}  // namespace veltrane_viewer
