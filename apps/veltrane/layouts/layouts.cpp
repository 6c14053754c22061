// The layouts as cuts and the parameter values that show them.
//
// Directions are degrees from +y towards +x; a Local cut's new region lies to the left of its
// direction and takes the cut's number (its index + 1) as its input, the region it divides
// keeps its own. A Radial layout numbers each sector by the ray at its end in the direction of
// increasing angle and never shows input 0.
#include "layouts/layouts.h"

#include <algorithm>
#include <cmath>

namespace veltrane_cli {
namespace {

constexpr int kCuts = 8;
constexpr int kInputs = 9;
constexpr double kDegreesPerRadian = 57.29577951308232;
constexpr double kPi = 3.14159265358979323846;
// How far slanted columns and the Z's bands lean from upright and level.
constexpr double kSlant = 15;

const std::vector<LayoutInfo> kLayouts = {
    {"diagonal-2", "2-way diagonal", 2, false, false},
    {"vertical-2", "2-way, left and right", 2, false, false},
    {"horizontal-2", "2-way, top and bottom", 2, false, false},
    {"slanted-2", "2 slanted columns", 2, false, false},
    {"slanted-3", "3 slanted columns", 3, true, false},
    {"slanted-4", "4 slanted columns", 4, true, false},
    {"z-3", "3-way Z", 3, true, false},
    {"comic-3", "3-way comic diagonals", 3, true, false},
    {"grid-2x2", "2x2 grid", 4, false, false},
    {"grid-3x3", "3x3 grid", 9, false, false},
    {"radial-3", "3 radial sectors", 3, false, true},
    {"radial-4", "4 radial sectors", 4, false, true},
    {"radial-5", "5 radial sectors", 5, false, true},
    {"radial-6", "6 radial sectors", 6, false, true},
    {"radial-7", "7 radial sectors", 7, false, true},
    {"radial-8", "8 radial sectors", 8, false, true},
    {"picture-in-picture", "Picture in picture, corner", 2, false, true},
};

// N - 1 parallel cuts leaning by the slant, `spacing` apart across the frame and centred on it:
// columns from left to right.
LayoutPlan slantedColumns(int columns, double spacing) {
  LayoutPlan plan;
  for (int k = 0; k < columns - 1; ++k) {
    plan.cuts.push_back({(k - (columns - 2) / 2.0) * spacing, 0, kSlant});
    plan.inputs.push_back(k + 1);
  }
  plan.inputs.push_back(0);
  return plan;
}

LayoutPlan radialSectors(int count, double firstDegrees) {
  LayoutPlan plan;
  plan.radial = true;
  for (int i = 0; i < count; ++i) {
    plan.cuts.push_back({0, 0, firstDegrees + 360.0 * i / count});
    plan.inputs.push_back(i + 1);
  }
  return plan;
}

LayoutPlan basePlan(const std::string& name, double w, double h, std::optional<double> gap) {
  if (name == "diagonal-2")  // one line from the bottom-left corner to the top-right one
    return {false, {0, 0}, {{0, 0, std::atan2(w, h) * kDegreesPerRadian}}, {1, 0}};
  if (name == "vertical-2") return {false, {0, 0}, {{0, 0, 0}}, {1, 0}};
  if (name == "horizontal-2") return {false, {0, 0}, {{0, 0, 90}}, {1, 0}};
  if (name == "slanted-2") return slantedColumns(2, 0);
  if (name == "slanted-3") return slantedColumns(3, gap.value_or(w / 3));
  if (name == "slanted-4") return slantedColumns(4, gap.value_or(w / 4));
  if (name == "z-3") {  // three bands, the lines between them rising to the right
    const double spacing = gap.value_or(h / 3);
    return {
        false, {0, 0}, {{0, spacing / 2, 90 - kSlant}, {0, -spacing / 2, 90 - kSlant}}, {1, 2, 0}};
  }
  if (name == "comic-3") {  // a wide panel on top, two below split by a slanted line
    const double spacing = gap.value_or(h / 3);
    return {false, {0, 0}, {{0, spacing / 2, 98}, {0, -spacing / 2, 12}}, {1, 2, 0}};
  }
  if (name == "grid-2x2")  // a vertical line, then each half split across
    return {false, {0, 0}, {{0, 0, 0}, {w / 4, 0, 90}, {-w / 4, 0, 90}}, {3, 2, 1, 0}};
  if (name == "grid-3x3") {  // two vertical lines, then each column split twice across
    const double sixthW = w / 6, thirdW = w / 3, sixthH = h / 6;
    return {false,
            {0, 0},
            {{-sixthW, 0, 0},
             {sixthW, 0, 0},
             {thirdW, sixthH, 90},
             {thirdW, -sixthH, 90},
             {0, sixthH, 90},
             {0, -sixthH, 90},
             {-thirdW, sixthH, 90},
             {-thirdW, -sixthH, 90}},
            {7, 5, 3, 8, 6, 4, 1, 2, 0}};
  }
  if (name == "picture-in-picture") {  // rays up and right from a third in from the corner
    LayoutPlan plan{true, {w / 6, h / 6}, {{0, 0, 0}, {0, 0, 90}}, {1, 2}};
    return plan;
  }
  const int sectors = name.back() - '0';  // radial-N
  return radialSectors(sectors, sectors == 4 ? 45 : 0);
}

// Turns a point about the frame's centre the way directions turn: towards +x from +y.
Point turned(Point p, double degrees) {
  const double a = degrees / kDegreesPerRadian;
  return {p[0] * std::cos(a) + p[1] * std::sin(a), -p[0] * std::sin(a) + p[1] * std::cos(a)};
}

}  // namespace

const std::vector<LayoutInfo>& layouts() { return kLayouts; }

std::optional<std::size_t> findLayout(const std::string& name) {
  for (std::size_t i = 0; i < kLayouts.size(); ++i)
    if (name == kLayouts[i].name) return i;
  return std::nullopt;
}

std::string layoutNames() {
  std::string names;
  for (const LayoutInfo& layout : kLayouts)
    names += (names.empty() ? "" : ", ") + std::string(layout.name);
  return names;
}

std::string defaultLayoutFor(int32_t inputs) {
  if (inputs <= 2) return "diagonal-2";
  if (inputs == 3) return "comic-3";
  if (inputs == 4) return "grid-2x2";
  if (inputs <= 8) return "radial-" + std::to_string(inputs);
  return "grid-3x3";
}

LayoutPlan planLayout(std::size_t index, double width, double height,
                      const LayoutOptions& options) {
  const LayoutInfo& info = kLayouts.at(index);
  if (options.gap) {
    if (!info.takesGap)
      throw std::invalid_argument(std::string("the cuts of ") + info.name +
                                  " do not run side by side; a gap suits slanted-3, slanted-4, "
                                  "z-3 and comic-3");
    const double across =
        info.name == std::string("z-3") || info.name == std::string("comic-3") ? height : width;
    const int gaps = info.regions - 1;
    if (!(*options.gap > 0) || *options.gap * (gaps - 1) >= across)
      throw std::invalid_argument("a gap between 0 and " +
                                  std::to_string(static_cast<int>(across / std::max(gaps - 1, 1))) +
                                  " pixels for " + info.name);
  }
  if (options.radialCentre && !info.radial)
    throw std::invalid_argument(std::string(info.name) + " has no radial centre");
  LayoutPlan plan = basePlan(info.name, width, height, options.gap);
  for (CutLine& cut : plan.cuts) {
    const Point at = turned({cut.x, cut.y}, options.angle);
    cut = {at[0], at[1], cut.degrees + options.angle};
  }
  if (options.radialCentre) plan.centre = *options.radialCentre;
  return plan;
}

std::vector<RegionShape> planRegions(const LayoutPlan& plan, double width, double height) {
  return mapRegions(plan.cuts, plan.radial, plan.centre, width, height);
}

Framing frameOnRegion(const RegionShape& region, Point pictureSize) {
  Framing framing;
  framing.translation = region.centroid;
  double needed = 0;  // the picture's scale as a fraction, from each corner of the region
  for (const std::vector<Point>& piece : region.pieces) {
    for (const Point& corner : piece) {
      needed = std::max(needed, 2 * std::fabs(corner[0] - region.centroid[0]) / pictureSize[0]);
      needed = std::max(needed, 2 * std::fabs(corner[1] - region.centroid[1]) / pictureSize[1]);
    }
  }
  framing.scale = needed * 100;
  // To a ten-thousandth of a pixel and of a percent, as a scene keeps them, so that a centre on
  // the frame's axis is 0 and not a rounding error's 1e-15; the scale upwards, still covering.
  const auto kept = [](double value) { return std::round(value * 1e4) / 1e4 + 0.0; };
  framing.translation = {kept(framing.translation[0]), kept(framing.translation[1])};
  framing.scale = std::ceil(framing.scale * 1e4 - 1e-6) / 1e4;
  return framing;
}

Point contentSize(int32_t pictureWidth, int32_t pictureHeight, bool keepsProportions, double width,
                  double height) {
  if (!keepsProportions || pictureWidth <= 0 || pictureHeight <= 0) return {width, height};
  const double scale = std::min(width / pictureWidth, height / pictureHeight);
  return {pictureWidth * scale, pictureHeight * scale};
}

std::vector<ParamEdit> layoutEdits(const LayoutPlan& plan, double width, double height,
                                   const std::vector<std::string>& sources,
                                   const std::vector<Point>& pictureSizes) {
  using refhost::ParamValue;
  const std::vector<RegionShape> regions = planRegions(plan, width, height);
  auto point = [](Point p) {
    return ParamValue::ofPoint(static_cast<float>(p[0]), static_cast<float>(p[1]));
  };
  std::vector<ParamEdit> edits{
      {"numberOfCuts", ParamValue::ofInt(static_cast<int32_t>(plan.cuts.size()))},
      {"cutType", ParamValue::ofInt(plan.radial ? 1 : 0)},
      {"cutPosition_global", point(plan.centre)}};
  for (int i = 0; i < kCuts; ++i) {
    const bool used = static_cast<std::size_t>(i) < plan.cuts.size();
    const CutLine cut = used ? plan.cuts[static_cast<std::size_t>(i)] : CutLine{};
    // An unused cut goes back to its declared default, ready for the next Shift-insert.
    const float degrees = used ? static_cast<float>(cut.degrees) : (i == 0 ? 225.0f : 0.0f);
    edits.push_back({"cutPosition_" + std::to_string(i), point({cut.x, cut.y})});
    edits.push_back({"cutDirection_" + std::to_string(i), ParamValue::ofFloat(degrees)});
  }
  for (int j = 0; j < kInputs; ++j) {
    std::string layer = refhost::kNoLayer;
    Framing framing;
    for (std::size_t k = 0; k < plan.inputs.size(); ++k) {
      if (plan.inputs[k] != j || sources.empty()) continue;
      const std::size_t source = k % sources.size();
      layer = sources[source];
      const Point size = source < pictureSizes.size() ? pictureSizes[source] : Point{width, height};
      for (const RegionShape& region : regions)
        if (region.input == j) framing = frameOnRegion(region, size);
    }
    const std::string n = std::to_string(j);
    edits.push_back({"inputLayer" + n, ParamValue::ofLayer(layer)});
    edits.push_back({"inputFrameShift" + n, ParamValue::ofInt(0)});
    edits.push_back({"inputFrameTranslation" + n, point(framing.translation)});
    edits.push_back(
        {"inputFrameScale" + n, ParamValue::ofFloat(static_cast<float>(framing.scale))});
    edits.push_back({"inputFrameRotation" + n, ParamValue::ofFloat(0)});
  }
  return edits;
}

}  // namespace veltrane_cli
