// Where the effect's regions lie for a set of cuts, worked out on the host's side: the frame
// divided one cut at a time by the rules the effect follows (a Local cut divides the region its
// position lies in along its line, the new region taking the cut's number; Radial cuts carve
// sectors around their shared centre), each region kept as convex polygons. Layouts use it to
// place every input's picture over its own region.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

namespace veltrane_cli {

using Point = std::array<double, 2>;

// A cut as the parameters hold it: a frame-space position (origin at the centre, y up) and a
// direction in degrees from +y towards +x.
struct CutLine {
  double x = 0;
  double y = 0;
  double degrees = 0;
};

struct RegionShape {
  int32_t input = 0;                       // the input the region shows (0 to 8)
  std::vector<std::vector<Point>> pieces;  // convex polygons, counter-clockwise
  double area = 0;                         // square pixels
  Point centroid{0, 0};                    // the area's centre of mass (frame space)
};

// The regions of a frame of width x height divided by `cuts` in order (Local lines, or Radial
// rays from `centre`), as the effect divides it; regions left without area are dropped.
std::vector<RegionShape> mapRegions(const std::vector<CutLine>& cuts, bool radial, Point centre,
                                    double width, double height);

}  // namespace veltrane_cli
