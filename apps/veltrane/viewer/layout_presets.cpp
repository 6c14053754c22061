// The layout presets as cuts and inputs.
//
// Directions are degrees from +y towards +x; a Local cut's new region lies to the left of its
// direction and takes the cut's number as its input, the region it divides keeps its own. A
// Radial layout numbers each sector by the cut at its end in the direction of increasing
// angle and never shows input 0.
#include "viewer/layout_presets.h"

#include <cmath>
#include <stdexcept>

namespace veltrane_viewer {
namespace {

constexpr int kCuts = 8;
constexpr int kInputs = 9;
constexpr double kDegreesPerRadian = 57.29577951308232;

// Positions as fractions of the frame's width and height, frame space.
struct CutPlacement {
  double x = 0;
  double y = 0;
  double degrees = 0;
};

struct Layout {
  bool radial = false;
  CutPlacement centre;  // the shared centre of Radial cuts
  std::vector<CutPlacement> cuts;
  std::vector<int> inputs;  // the inputs the layout shows, in the order they take sources
  int inset = -1;           // the input shown whole in a corner, if any
};

Layout radialSectors(int count, double firstDegrees) {
  Layout layout;
  layout.radial = true;
  for (int i = 0; i < count; ++i) {
    layout.cuts.push_back({0, 0, firstDegrees + 360.0 * i / count});
    layout.inputs.push_back(i + 1);
  }
  return layout;
}

Layout layoutFor(std::size_t index, double aspect) {
  constexpr double sixth = 1.0 / 6;
  constexpr double third = 1.0 / 3;
  switch (index) {
    case 0:  // one line from the bottom-left corner to the top-right one
      return {false, {}, {{0, 0, std::atan2(aspect, 1.0) * kDegreesPerRadian}}, {1, 0}};
    case 1:  // a wide panel on top, two below split by a slanted line
      return {false, {}, {{0, sixth, 98}, {0, -sixth, 12}}, {1, 2, 0}};
    case 2:  // a vertical line, then each half split across
      return {false, {}, {{0, 0, 0}, {0.25, 0, 90}, {-0.25, 0, 90}}, {3, 2, 1, 0}};
    case 3:  // two vertical lines, then each column split twice across
      return {false,
              {},
              {{-sixth, 0, 0},
               {sixth, 0, 0},
               {third, sixth, 90},
               {third, -sixth, 90},
               {0, sixth, 90},
               {0, -sixth, 90},
               {-third, sixth, 90},
               {-third, -sixth, 90}},
              {7, 5, 3, 8, 6, 4, 1, 2, 0}};
    case 4:
      return radialSectors(3, 0);
    case 5:
      return radialSectors(4, 45);
    case 6:
      return radialSectors(6, 0);
    case 7:  // rays up and right from a point a third in from the top-right corner
      return {true, {sixth, sixth, 0}, {{0, 0, 0}, {0, 0, 90}}, {1, 2}, 2};
  }
  throw std::out_of_range("no layout preset " + std::to_string(index));
}

std::string cutId(const char* name, int i) { return std::string(name) + "_" + std::to_string(i); }
std::string inputId(const char* name, int j) { return std::string(name) + std::to_string(j); }

}  // namespace

const std::vector<LayoutPreset>& layoutPresets() {
  static const std::vector<LayoutPreset> presets{
      {"2-way diagonal", "diagonal-2"}, {"3-way comic diagonals", "comic-3"},
      {"2x2 grid", "grid-2x2"},         {"3x3 grid", "grid-3x3"},
      {"3 radial sectors", "radial-3"}, {"4 radial sectors", "radial-4"},
      {"6 radial sectors", "radial-6"}, {"Picture in picture, corner", "picture-in-picture"},
  };
  return presets;
}

std::vector<ParamEdit> presetEdits(std::size_t index, int32_t width, int32_t height,
                                   const std::vector<std::string>& sources) {
  double w = width;
  double h = height;
  Layout layout = layoutFor(index, h > 0 ? w / h : 1);
  using refhost::ParamValue;
  auto point = [&](const CutPlacement& at) {
    return ParamValue::ofPoint(static_cast<float>(at.x * w), static_cast<float>(at.y * h));
  };
  std::vector<ParamEdit> edits{
      {"numberOfCuts", ParamValue::ofInt(static_cast<int32_t>(layout.cuts.size()))},
      {"cutType", ParamValue::ofInt(layout.radial ? 1 : 0)},
      {"cutPosition_global", point(layout.centre)}};
  for (int i = 0; i < kCuts; ++i) {
    bool used = static_cast<std::size_t>(i) < layout.cuts.size();
    CutPlacement cut = used ? layout.cuts[static_cast<std::size_t>(i)] : CutPlacement{};
    // An unused cut goes back to its declared default, ready for the next Shift-insert.
    float degrees = used ? static_cast<float>(cut.degrees) : (i == 0 ? 225.0f : 0.0f);
    edits.push_back({cutId("cutPosition", i), point(cut)});
    edits.push_back({cutId("cutDirection", i), ParamValue::ofFloat(degrees)});
  }
  for (int j = 0; j < kInputs; ++j) {
    std::string layer = refhost::kNoLayer;
    for (std::size_t k = 0; k < layout.inputs.size(); ++k) {
      if (layout.inputs[k] == j && !sources.empty()) layer = sources[k % sources.size()];
    }
    bool inset = j == layout.inset;
    // The inset covers the third of the frame between the centre and the top-right corner.
    float scale = inset ? 100.0f / 3 : 100.0f;
    edits.push_back({inputId("inputLayer", j), ParamValue::ofLayer(layer)});
    edits.push_back({inputId("inputFrameShift", j), ParamValue::ofInt(0)});
    edits.push_back({inputId("inputFrameTranslation", j),
                     inset ? point({1.0 / 3, 1.0 / 3, 0}) : ParamValue::ofPoint(0, 0)});
    edits.push_back({inputId("inputFrameScale", j), ParamValue::ofFloat(scale)});
    edits.push_back({inputId("inputFrameRotation", j), ParamValue::ofFloat(0)});
  }
  return edits;
}

}  // namespace veltrane_viewer
