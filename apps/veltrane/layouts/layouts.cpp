// The layouts as cuts and the parameter values that show them.
//
// Directions are degrees from +y towards +x; a Local cut's new region lies to the left of its
// direction and takes the cut's number (its index + 1) as its input, the region it divides
// keeps its own. A Radial layout numbers each sector by the ray at its end in the direction of
// increasing angle and never shows input 0.
#include "layouts/layouts.h"

#include <algorithm>
#include <cctype>
#include <cmath>

namespace veltrane_cli {
namespace {

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

// A layout's name without its count of pictures: "radial-5" and "grid-3x3" are "radial" and
// "grid"; a name without a count is its own family.
std::string familyOf(const std::string& name) {
  const std::string::size_type dash = name.rfind('-');
  if (dash == std::string::npos || dash + 1 >= name.size() ||
      !std::isdigit(static_cast<unsigned char>(name[dash + 1])))
    return name;
  return name.substr(0, dash);
}

// Turns a point about the frame's centre the way directions turn: towards +x from +y.
Point turned(Point p, double degrees) {
  const double a = degrees / kDegreesPerRadian;
  return {p[0] * std::cos(a) + p[1] * std::sin(a), -p[0] * std::sin(a) + p[1] * std::cos(a)};
}

}  // namespace

const std::vector<LayoutInfo>& layouts() { return kLayouts; }

std::optional<std::size_t> findLayout(const std::string& name, int32_t pictures) {
  std::optional<std::size_t> chosen;
  for (std::size_t i = 0; i < kLayouts.size(); ++i) {
    if (name == kLayouts[i].name) return i;
    if (name != familyOf(kLayouts[i].name)) continue;
    const int32_t regions = kLayouts[i].regions;
    if (!chosen) {
      chosen = i;
      continue;
    }
    const int32_t best = kLayouts[*chosen].regions;
    // Enough regions beats too few; of those enough, the fewest; of too few, the most.
    const bool better = (regions >= pictures) != (best >= pictures)
                            ? regions >= pictures
                            : (regions >= pictures ? regions < best : regions > best);
    if (better) chosen = i;
  }
  return chosen;
}

std::vector<std::string> layoutNamesTaken() {
  std::vector<std::string> names;
  for (const LayoutInfo& layout : kLayouts) names.push_back(layout.name);
  for (const LayoutInfo& layout : kLayouts) {
    const std::string family = familyOf(layout.name);
    if (std::find(names.begin(), names.end(), family) == names.end()) names.push_back(family);
  }
  return names;
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

std::vector<RegionExtent> regionExtents(const refhost::RegionMap& map) {
  std::vector<RegionExtent> regions;
  std::vector<int> slot(128, -1);  // the entry of each input seen so far
  for (int32_t y = 0; y < map.height; ++y) {
    for (int32_t x = 0; x < map.width; ++x) {
      const int8_t input = map.inputs[static_cast<std::size_t>(y) * map.width + x];
      if (input < 0) continue;
      // The pixel's edges in frame space: rows run from the top, y points up.
      const double left = x - map.width / 2.0, bottom = map.height / 2.0 - y - 1;
      if (slot[static_cast<std::size_t>(input)] < 0) {
        slot[static_cast<std::size_t>(input)] = static_cast<int>(regions.size());
        regions.push_back({input, 0, {0, 0}, {left, bottom}, {left + 1, bottom + 1}});
      }
      RegionExtent& region =
          regions[static_cast<std::size_t>(slot[static_cast<std::size_t>(input)])];
      region.area += 1;
      region.centroid[0] += left + 0.5;
      region.centroid[1] += bottom + 0.5;
      region.low = {std::min(region.low[0], left), std::min(region.low[1], bottom)};
      region.high = {std::max(region.high[0], left + 1), std::max(region.high[1], bottom + 1)};
    }
  }
  for (RegionExtent& region : regions)
    region.centroid = {region.centroid[0] / region.area, region.centroid[1] / region.area};
  std::sort(regions.begin(), regions.end(),
            [](const RegionExtent& a, const RegionExtent& b) { return a.input < b.input; });
  return regions;
}

Framing frameOnRegion(const RegionExtent& region, Point pictureSize) {
  Framing framing;
  framing.translation = region.centroid;
  double needed = 0;  // the picture's scale as a fraction, from each side of the region
  for (int axis = 0; axis < 2; ++axis) {
    const double reach = std::max(region.centroid[axis] - region.low[axis],
                                  region.high[axis] - region.centroid[axis]);
    needed = std::max(needed, 2 * reach / pictureSize[static_cast<std::size_t>(axis)]);
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

namespace {

refhost::ParamValue pointValue(Point p) {
  return refhost::ParamValue::ofPoint(static_cast<float>(p[0]), static_cast<float>(p[1]));
}

void addFraming(std::vector<ParamEdit>& edits, const refhost::EffectVocabulary& roles,
                int32_t input, const Framing& framing) {
  using refhost::InputParam;
  edits.push_back({roles.id(InputParam::Translation, input), pointValue(framing.translation)});
  edits.push_back({roles.id(InputParam::Scale, input),
                   refhost::ParamValue::ofFloat(static_cast<float>(framing.scale))});
  edits.push_back({roles.id(InputParam::Rotation, input),
                   roles.declared(InputParam::Rotation, input).defaultValue});
}

}  // namespace

std::vector<ParamEdit> cutEdits(const LayoutPlan& plan, const refhost::EffectVocabulary& roles) {
  using refhost::CutParam;
  using refhost::EffectParam;
  using refhost::ParamValue;
  std::vector<ParamEdit> edits{
      {roles.id(EffectParam::NumberOfCuts),
       ParamValue::ofInt(static_cast<int32_t>(plan.cuts.size()))},
      {roles.id(EffectParam::CutType),
       ParamValue::ofInt(
           roles.choiceOf(plan.radial ? refhost::CutType::Radial : refhost::CutType::Local))},
      {roles.id(EffectParam::GlobalPosition), pointValue(plan.centre)}};
  for (int32_t i = 0; i < roles.cuts(); ++i) {
    const auto cut = static_cast<std::size_t>(i);
    const bool used = cut < plan.cuts.size();
    edits.push_back({roles.id(CutParam::Position, i),
                     used ? pointValue({plan.cuts[cut].x, plan.cuts[cut].y})
                          : roles.declared(CutParam::Position, i).defaultValue});
    edits.push_back({roles.id(CutParam::Direction, i),
                     used ? ParamValue::ofFloat(static_cast<float>(plan.cuts[cut].degrees))
                          : roles.declared(CutParam::Direction, i).defaultValue});
  }
  return edits;
}

std::vector<ParamEdit> layoutEdits(refhost::Engine& engine, const LayoutPlan& plan,
                                   const std::vector<std::string>& sources,
                                   const std::vector<Point>& pictureSizes) {
  using refhost::InputParam;
  const refhost::EffectVocabulary& roles = engine.vocabulary();
  std::vector<ParamEdit> edits = cutEdits(plan, roles);
  std::vector<std::pair<std::string, refhost::ParamValue>> cuts;
  for (const ParamEdit& edit : edits) cuts.emplace_back(edit.id, edit.value);
  const std::vector<RegionExtent> regions = regionExtents(engine.mapRegions(0, cuts));
  const Point frame{static_cast<double>(engine.frameSettings().width),
                    static_cast<double>(engine.frameSettings().height)};
  for (int32_t j = 0; j < roles.inputs(); ++j) {
    refhost::ParamValue layer = roles.declared(InputParam::Layer, j).defaultValue;
    Framing framing;
    bool shown = false;
    for (std::size_t k = 0; k < plan.inputs.size(); ++k) {
      if (plan.inputs[k] != j || sources.empty()) continue;
      const std::size_t source = k % sources.size();
      layer = refhost::ParamValue::ofLayer(sources[source]);
      const Point size = source < pictureSizes.size() ? pictureSizes[source] : frame;
      for (const RegionExtent& region : regions)
        if (region.input == j) framing = frameOnRegion(region, size), shown = true;
    }
    edits.push_back({roles.id(InputParam::Layer, j), layer});
    edits.push_back(
        {roles.id(InputParam::Shift, j), roles.declared(InputParam::Shift, j).defaultValue});
    if (shown) {
      addFraming(edits, roles, j, framing);
    } else {
      for (InputParam role : {InputParam::Translation, InputParam::Scale, InputParam::Rotation})
        edits.push_back({roles.id(role, j), roles.declared(role, j).defaultValue});
    }
  }
  return edits;
}

std::vector<ParamEdit> framingEdits(refhost::Engine& engine, int32_t frame,
                                    const std::function<Point(int32_t input)>& pictureSize) {
  std::vector<ParamEdit> edits;
  for (const RegionExtent& region : regionExtents(engine.mapRegions(frame)))
    addFraming(edits, engine.vocabulary(), region.input,
               frameOnRegion(region, pictureSize(region.input)));
  return edits;
}

}  // namespace veltrane_cli
