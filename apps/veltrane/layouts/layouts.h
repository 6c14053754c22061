// The layouts people ask a split screen for (diagonals, slanted columns, a comic panel, grids,
// radial sectors, a picture in a corner), as the cuts that make them for a frame size, and as
// the parameter values that show one picture in each region, each picture framed on its own
// region. The viewer's Presets menu, `veltrane split` and the tests share them.
#pragma once

#include <array>
#include <cstdint>
#include <functional>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "refhost/engine.h"

namespace veltrane_cli {

using Point = std::array<double, 2>;

// A cut as the parameters hold it: a frame-space position (origin at the centre, y up) and a
// direction in degrees from +y towards +x.
struct CutLine {
  double x = 0;
  double y = 0;
  double degrees = 0;
};

struct LayoutInfo {
  const char* name;      // as `--layout` and the example scenes name it: "diagonal-2"
  const char* menuName;  // as the Presets menu lists it: "2-way diagonal"
  int32_t regions;       // pictures it shows
  bool takesGap;         // its cuts run side by side, so `gap` moves them apart
  bool radial;
};

// Every layout, in the Presets menu's order.
const std::vector<LayoutInfo>& layouts();
// By its whole name ("radial-5"), or by its family's name without the count ("radial",
// "diagonal", "grid", "z") for `pictures` pictures: the family's layout of that many regions,
// else its smallest with more, else its largest.
std::optional<std::size_t> findLayout(const std::string& name, int32_t pictures = 0);
// "diagonal-2, vertical-2, ...": for messages.
std::string layoutNames();
// Every name findLayout takes: the layouts' and their families'.
std::vector<std::string> layoutNamesTaken();
// The layout a split of `inputs` pictures takes when none is named: diagonal-2 for 1 or 2,
// comic-3 for 3, grid-2x2 for 4, radial-N for 5 to 8, grid-3x3 for 9.
std::string defaultLayoutFor(int32_t inputs);

struct LayoutOptions {
  double angle = 0;                   // degrees the cuts are turned by (about the frame's centre)
  std::optional<double> gap;          // pixels between side-by-side cuts
  std::optional<Point> radialCentre;  // frame space (origin at the centre, y up)
};

// A layout for a frame: its cuts, and its regions' inputs in the order pictures fill them.
struct LayoutPlan {
  bool radial = false;
  Point centre{0, 0};  // the Radial cuts' shared centre
  std::vector<CutLine> cuts;
  std::vector<int32_t> inputs;
};

// Throws std::invalid_argument saying what is wrong: a gap for a layout whose cuts do not run
// side by side, or one that leaves no room; a radial centre for a layout of lines.
LayoutPlan planLayout(std::size_t index, double width, double height,
                      const LayoutOptions& options = {});

struct ParamEdit {
  std::string id;
  refhost::ParamValue value;
};

// One input's region as the module shows it (frame space, origin at the centre, y up): the
// centre of mass of its pixels and the rectangle their edges span.
struct RegionExtent {
  int32_t input = 0;
  double area = 0;  // square pixels
  Point centroid{0, 0};
  Point low{0, 0};
  Point high{0, 0};
};
// Every input the map shows, in input order.
std::vector<RegionExtent> regionExtents(const refhost::RegionMap& map);

// Where an input's picture goes: its centre on the centroid of its region, scaled without
// stretching to the smallest size that covers the whole region. `pictureSize` is the size of
// the picture's content at scale 100 in frame pixels (the frame's size for a picture that fills
// it; less along one side for a picture kept at its own proportions).
struct Framing {
  Point translation{0, 0};  // frame pixels
  double scale = 100;       // percent
};
Framing frameOnRegion(const RegionExtent& region, Point pictureSize);

// The size of a picture's content at scale 100 in a frame of `width` x `height`: the frame's
// own for a picture that is stretched to it (or has no size of its own, 0 x 0), else the
// largest of the picture's proportions inside the frame.
Point contentSize(int32_t pictureWidth, int32_t pictureHeight, bool keepsProportions, double width,
                  double height);

// The plan's cut parameters: count, type, centre and every cut (the ones it does not use back
// to their declared defaults, ready for the next Shift-insert).
std::vector<ParamEdit> cutEdits(const LayoutPlan& plan, const refhost::EffectVocabulary& roles);

// Every cut and input parameter of the plan. The inputs the plan shows take `sources` in turn
// (a layer GUID each, the null GUID for the effect's own input), cycling when there are fewer,
// each framed on its region as the engine's module divides the frame, for its picture's
// content size (`pictureSizes`, one per source; missing ones fill the frame). Inputs the plan
// does not show go back to their defaults.
std::vector<ParamEdit> layoutEdits(refhost::Engine& engine, const LayoutPlan& plan,
                                   const std::vector<std::string>& sources,
                                   const std::vector<Point>& pictureSizes = {});

// The translation, scale and rotation of every input shown at `frame` with the cuts as they
// are, each picture framed on its region; `pictureSize` gives an input's content size.
std::vector<ParamEdit> framingEdits(refhost::Engine& engine, int32_t frame,
                                    const std::function<Point(int32_t input)>& pictureSize);

}  // namespace veltrane_cli
