// The division of the frame into regions, in double precision on convex polygons. It follows
// the effect's own order of cuts and choice of the region each cut divides, so that the
// regions agree with the effect's up to rounding at their edges.
#include "layouts/region_map.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace veltrane_cli {
namespace {

constexpr double kPi = 3.14159265358979323846;
constexpr double kEpsilon = 1e-9;

struct Cut {
  Point position{0, 0};
  Point direction{0, 1};
  double angle = 0;  // radians in [-pi, pi], 0 along +y
  int32_t number = 1;
};

struct Region {
  int32_t input = 0;
  std::vector<std::vector<Point>> pieces;
  double start = 0, end = 0;  // angular range for Radial cuts
};

// Positive to the left of the cut's direction.
double side(const Cut& cut, const Point& p) {
  return (p[0] - cut.position[0]) * -cut.direction[1] + (p[1] - cut.position[1]) * cut.direction[0];
}

double polygonArea(const std::vector<Point>& polygon) {
  double twice = 0;
  for (std::size_t i = 0; i < polygon.size(); ++i) {
    const Point& a = polygon[i];
    const Point& b = polygon[(i + 1) % polygon.size()];
    twice += a[0] * b[1] - a[1] * b[0];
  }
  return twice / 2;
}

Point polygonCentroid(const std::vector<Point>& polygon) {
  double area = 0, x = 0, y = 0;
  for (std::size_t i = 0; i < polygon.size(); ++i) {
    const Point& a = polygon[i];
    const Point& b = polygon[(i + 1) % polygon.size()];
    const double cross = a[0] * b[1] - a[1] * b[0];
    area += cross;
    x += (a[0] + b[0]) * cross;
    y += (a[1] + b[1]) * cross;
  }
  if (std::fabs(area) < kEpsilon) return polygon.empty() ? Point{0, 0} : polygon.front();
  return {x / (3 * area), y / (3 * area)};
}

// The part of a convex polygon on one side of the cut's line (left when `left`).
std::vector<Point> clip(const std::vector<Point>& polygon, const Cut& cut, bool left) {
  std::vector<Point> out;
  for (std::size_t i = 0; i < polygon.size(); ++i) {
    const Point& a = polygon[i];
    const Point& b = polygon[(i + 1) % polygon.size()];
    const double sa = left ? side(cut, a) : -side(cut, a);
    const double sb = left ? side(cut, b) : -side(cut, b);
    if (sa >= 0) out.push_back(a);
    if ((sa > 0 && sb < 0) || (sa < 0 && sb > 0)) {
      const double u = sa / (sa - sb);
      out.push_back({a[0] + u * (b[0] - a[0]), a[1] + u * (b[1] - a[1])});
    }
  }
  if (out.size() < 3 || std::fabs(polygonArea(out)) < kEpsilon) return {};
  return out;
}

bool strictlyInside(const std::vector<Point>& polygon, const Point& p) {
  for (std::size_t i = 0; i < polygon.size(); ++i) {
    const Point& a = polygon[i];
    const Point& b = polygon[(i + 1) % polygon.size()];
    if ((b[0] - a[0]) * (p[1] - a[1]) - (b[1] - a[1]) * (p[0] - a[0]) <= 0) return false;
  }
  return true;
}

// A position on an edge or a corner belongs to the piece its direction points into.
bool entered(const std::vector<Point>& polygon, const Cut& cut) {
  if (strictlyInside(polygon, cut.position)) return true;
  const double step = 1e-6;
  const Point ahead{cut.position[0] + cut.direction[0] * step,
                    cut.position[1] + cut.direction[1] * step};
  bool onBoundary = true;
  for (std::size_t i = 0; i < polygon.size(); ++i) {
    const Point& a = polygon[i];
    const Point& b = polygon[(i + 1) % polygon.size()];
    if ((b[0] - a[0]) * (cut.position[1] - a[1]) - (b[1] - a[1]) * (cut.position[0] - a[0]) <
        -kEpsilon)
      onBoundary = false;
  }
  return onBoundary && strictlyInside(polygon, ahead);
}

// 0 when the cut's position lies in the region, else the squared distance along its ray to the
// region's nearest edge, or infinity when the ray misses it.
double reach(const Region& region, const Cut& cut) {
  if (region.pieces.empty()) return std::numeric_limits<double>::infinity();
  double best = std::numeric_limits<double>::infinity();
  for (const std::vector<Point>& piece : region.pieces) {
    if (entered(piece, cut)) return 0;
    for (std::size_t i = 0; i < piece.size(); ++i) {
      const Point& a = piece[i];
      const Point& b = piece[(i + 1) % piece.size()];
      const double ex = b[0] - a[0], ey = b[1] - a[1];
      const double denominator = cut.direction[0] * ey - cut.direction[1] * ex;
      if (std::fabs(denominator) < kEpsilon) continue;
      const double wx = a[0] - cut.position[0], wy = a[1] - cut.position[1];
      const double along = (wx * ey - wy * ex) / denominator;
      const double u = (wx * cut.direction[1] - wy * cut.direction[0]) / denominator;
      if (along > 0 && u >= 0 && u <= 1) best = std::min(best, along * along);
    }
  }
  return best;
}

double angleFromUp(double x, double y) {
  if (y == 0) return x >= 0 ? kPi / 2 : -kPi / 2;
  return std::atan2(x, y);
}

Region split(Region& region, const Cut& cut, bool radial) {
  std::vector<std::vector<Point>> pieces;
  for (const std::vector<Point>& piece : region.pieces) {
    for (bool left : {true, false}) {
      std::vector<Point> part = clip(piece, cut, left);
      if (!part.empty()) pieces.push_back(std::move(part));
    }
  }
  if (radial) {
    while (cut.angle > region.end) {
      region.start += 2 * kPi;
      region.end += 2 * kPi;
    }
    while (region.start > cut.angle) {
      region.start -= 2 * kPi;
      region.end -= 2 * kPi;
    }
  }
  Region moved;
  moved.input = cut.number;
  moved.start = region.start;
  moved.end = cut.angle;
  std::vector<std::vector<Point>> staying;
  for (std::vector<Point>& piece : pieces) {
    const Point g = polygonCentroid(piece);
    bool moves = side(cut, g) > 0;
    if (radial) {
      double alpha = angleFromUp(g[0] - cut.position[0], g[1] - cut.position[1]);
      while (region.start - kEpsilon > alpha) alpha += 2 * kPi;
      while (alpha > region.end + kEpsilon) alpha -= 2 * kPi;
      moves = !(alpha > cut.angle);
    }
    (moves ? moved.pieces : staying).push_back(std::move(piece));
  }
  region.pieces = std::move(staying);
  region.start = cut.angle;
  return moved;
}

double wrapped(double radians) {
  while (radians > kPi) radians -= 2 * kPi;
  while (radians < -kPi) radians += 2 * kPi;
  return radians;
}

}  // namespace

std::vector<RegionShape> mapRegions(const std::vector<CutLine>& lines, bool radial, Point centre,
                                    double width, double height) {
  const double halfW = width / 2, halfH = height / 2;
  auto inside = [&](Point p) {  // one pixel inside the frame, as the effect holds positions
    p[0] = std::clamp(p[0], std::min(1 - halfW, halfW - 1), std::max(1 - halfW, halfW - 1));
    p[1] = std::clamp(p[1], std::min(1 - halfH, halfH - 1), std::max(1 - halfH, halfH - 1));
    return p;
  };
  std::vector<Cut> cuts;
  for (std::size_t i = 0; i < lines.size(); ++i) {
    Cut cut;
    cut.position = inside(radial ? centre : Point{lines[i].x, lines[i].y});
    cut.angle = wrapped(lines[i].degrees * kPi / 180);
    cut.direction = {std::sin(cut.angle), std::cos(cut.angle)};
    cut.number = static_cast<int32_t>(i) + 1;
    // A cut equal to an earlier one in angle and position adds nothing.
    const bool repeated = std::any_of(cuts.begin(), cuts.end(), [&](const Cut& other) {
      return std::fabs(other.angle - cut.angle) < 1e-12 && other.position == cut.position;
    });
    if (!repeated) cuts.push_back(cut);
  }
  if (cuts.empty()) return {};

  const Point corners[4] = {{-halfW, -halfH}, {halfW, -halfH}, {halfW, halfH}, {-halfW, halfH}};
  Region first;
  first.input = radial ? 1 : 0;
  first.start = cuts.front().angle - 2 * kPi;
  first.end = cuts.front().angle;
  if (radial) {
    const Point c = cuts.front().position;
    for (int i = 0; i < 4; ++i) first.pieces.push_back({c, corners[i], corners[(i + 1) % 4]});
  } else {
    first.pieces.push_back({corners[0], corners[1], corners[2], corners[3]});
  }
  std::vector<Region> regions{first};
  for (const Cut& cut : cuts) {
    double best = std::numeric_limits<double>::infinity();
    std::size_t target = regions.size();
    for (std::size_t r = 0; r < regions.size(); ++r) {
      const double distance = reach(regions[r], cut);
      if (distance < best) {
        best = distance;
        target = r;
      }
    }
    if (target == regions.size()) continue;
    Region created = split(regions[target], cut, radial);
    if (!created.pieces.empty()) regions.push_back(std::move(created));
  }

  std::vector<RegionShape> shapes;
  for (const Region& region : regions) {
    RegionShape shape;
    shape.input = region.input;
    double x = 0, y = 0;
    for (const std::vector<Point>& piece : region.pieces) {
      const double area = polygonArea(piece);
      const Point g = polygonCentroid(piece);
      shape.area += area;
      x += g[0] * area;
      y += g[1] * area;
    }
    if (shape.area <= kEpsilon) continue;
    shape.centroid = {x / shape.area, y / shape.area};
    shape.pieces = region.pieces;
    shapes.push_back(std::move(shape));
  }
  return shapes;
}

}  // namespace veltrane_cli
