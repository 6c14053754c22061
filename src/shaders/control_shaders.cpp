// The control fragment stages. Distances are measured in viewer pixels (frame positions divided
// by the view's pixel size); colours are premultiplied and laid halo first, core on top.
#include "shaders/control_shaders.h"

#include "shaders/glsl_text.h"
#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace shaders {
namespace {

using namespace shader_ids;

// Coverage of a segment as (core, halo), the halo reaching 2.5 pixels beyond the core, and the
// premultiplied colour of a coverage pair.
const std::string kLineHelpers = lines({
    "const float haloWidth = 2.5;",
    "vec2 closestPointOnSegment(vec2 a, vec2 b, vec2 p) {",
    "  vec2 ab = b - a;",
    "  return a + ab * clamp(dot(ab, (p - a) / dot(ab, ab)), 0.0, 1.0);",
    "}",
    "vec2 segmentCoverage(vec2 a, vec2 b, vec2 p, float width, vec2 pixel) {",
    "  vec2 q = closestPointOnSegment(a, b, p);",
    "  float d = distance(p / pixel, q / pixel);",
    "  return clamp(vec2(width - d, (width - d + haloWidth) / haloWidth), 0.0, 1.0);",
    "}",
    "vec4 coverageColour(vec4 colour, vec2 coverage) {",
    "  vec4 core = colour * coverage.x;",
    "  vec4 halo = vec4(colour.rgb * 0.5, colour.a) * coverage.y * 0.5;",
    "  return halo * (1.0 - core.a) + core;",
    "}",
    // Turns a vector by `angle` so that the handle's own axes line up with x and y.
    "mat2 rotation(float angle) {",
    "  return mat2(cos(angle), sin(angle), -sin(angle), cos(angle));",
    "}",
});

// Coverage of an axis-aligned box centred on the origin, with a one-pixel edge and a halo.
const std::string kBoxHelpers = lines({
    "vec2 box(vec2 q, float halfWidth, float halfHeight) {",
    "  vec2 e = vec2(halfWidth - 0.5, halfHeight - 0.5) - abs(q);",
    "  float core = clamp(e.x, 0.0, 1.0) * clamp(e.y, 0.0, 1.0);",
    "  float halo = clamp((e.x + 2.5) / 2.5, 0.0, 1.0) * clamp((e.y + 2.5) / 2.5, 0.0, 1.0);",
    "  return vec2(core, halo);",
    "}",
});

std::string fragmentHeader() {
  return lines({kVersionLine, input("vec2", kFragTexCoord), colourOutput()});
}

// The position of this fragment in the handle's frame: from texture units back to frame pixels,
// relative to the handle's centre, turned into its own axes.
std::string handleFramePosition() {
  return "  vec2 q = rotation(" + name(kHandleAngle) + ") * (" + kFragTexCoord + " * " + kTexScale +
         " - " + kHandleCentre + ");";
}

std::string lineCoverage(const std::string& a, const std::string& b) {
  return "segmentCoverage(" + a + ", " + b + ", q, " + kLineWidth + ", " + kPixelSize + ")";
}

}  // namespace

// The straight arrow along x is bent onto the circle: a point is moved along its ray from the
// centre so that its distance from the centre equals its former height.
const std::string kRotationHandleFragment =
    fragmentHeader() + kLineHelpers +
    lines({
        uniform("vec2", kTexScale),
        uniform("vec2", kPixelSize),
        uniform("vec2", kHandleCentre),
        uniform("float", kHandleLength),
        uniform("float", kHandleRadius),
        uniform("float", kHandleAngle),
        uniform("float", kReferenceAngle),
        uniform("float", kLineWidth),
        uniform("vec4", kHandleColour),
        uniform("int", kArrowMode),
        "const float pi = 3.14159265;",
        "vec2 sweepCoverage(vec2 q) {",
        "  vec2 ring = normalize(q) * " + name(kHandleRadius) + ";",
        "  float d = length((ring - q) / (" + name(kPixelSize) + " * " + kLineWidth + "));",
        "  vec2 coverage = vec2(clamp(1.0 - abs(d), 0.0, 1.0), clamp(1.0 - abs(d / 2.5), 0.0, "
        "1.0));",
        "  float s = " + name(kHandleAngle) + " - " + kReferenceAngle + ";",
        "  float t = (fract((atan(q.x, -q.y) + pi - min(s, 0.0)) / (2.0 * pi)) * 2.0 * pi) / "
        "abs(s);",
        "  if (s >= 0.0) {",
        "    t = 1.0 - t;",
        "  } else if (t >= 1.0) {",
        "    t = 0.0;",
        "  }",
        "  return coverage * pow(clamp(t, 0.0, 1.0), 0.25) * 0.5;",
        "}",
        "void main() {",
        handleFramePosition(),
        "  q = q / abs(q.y) * length(q);",
        "  float l = " + name(kHandleLength) + ";",
        "  float r = " + name(kHandleRadius) + ";",
        "  int mode = " + name(kArrowMode) + ";",
        "  vec2 a = vec2(mode != 2 ? -l / 2.0 : 0.0, r);",
        "  vec2 b = vec2(mode != 1 ? l / 2.0 : 0.0, r);",
        "  vec2 c = " + lineCoverage("a", "b") + ";",
        "  if (mode != 2) {",
        "    c = max(c, " + lineCoverage("a", "a + vec2(l, l) / 8.0") + ");",
        "    c = max(c, " + lineCoverage("a", "a + vec2(l, -l) / 8.0") + ");",
        "  }",
        "  if (mode != 1) {",
        "    c = max(c, " + lineCoverage("b", "b + vec2(-l, l) / 8.0") + ");",
        "    c = max(c, " + lineCoverage("b", "b + vec2(-l, -l) / 8.0") + ");",
        "  }",
        "  if (mode != 0) {",
        "    c = max(c, " + lineCoverage("vec2(0.0, r - l / 8.0)", "vec2(0.0, r + l / 8.0)") + ");",
        "    c = max(c, sweepCoverage(q));",
        "  }",
        "  " + name(kFragColour) + " = coverageColour(" + kHandleColour + ", c);",
        "}",
    });

const std::string kDoubleArrowFragment =
    fragmentHeader() + kLineHelpers +
    lines({
        uniform("vec2", kTexScale),
        uniform("vec2", kPixelSize),
        uniform("vec2", kHandleCentre),
        uniform("float", kHandleLength),
        uniform("float", kHandleGap),
        uniform("float", kHandleAngle),
        uniform("float", kLineWidth),
        uniform("vec4", kHandleColour),
        "void main() {",
        handleFramePosition(),
        "  float l = " + name(kHandleLength) + ";",
        "  float g = " + name(kHandleGap) + ";",
        "  vec2 e1 = vec2(-l / 2.0 - g / 2.0, 0.0);",
        "  vec2 e2 = vec2(l / 2.0 + g / 2.0, 0.0);",
        "  vec2 c;",
        "  if (g > 0.0) {",
        "    c = max(" + lineCoverage("e1", "vec2(-g / 2.0, 0.0)") + ", " +
            lineCoverage("vec2(g / 2.0, 0.0)", "e2") + ");",
        "  } else {",
        "    c = " + lineCoverage("e1", "e2") + ";",
        "  }",
        "  c = max(c, " + lineCoverage("e1", "e1 + vec2(l, l) / 8.0") + ");",
        "  c = max(c, " + lineCoverage("e1", "e1 + vec2(l, -l) / 8.0") + ");",
        "  c = max(c, " + lineCoverage("e2", "e2 + vec2(-l, l) / 8.0") + ");",
        "  c = max(c, " + lineCoverage("e2", "e2 + vec2(-l, -l) / 8.0") + ");",
        "  " + name(kFragColour) + " = coverageColour(" + kHandleColour + ", c);",
        "}",
    });

// Highlighted edges are laid over the others, each weighted by its own coverage.
const std::string kQuadEdgesFragment =
    fragmentHeader() + kLineHelpers +
    lines({
        uniform("vec2", kTexScale),
        uniform("vec2", kPixelSize),
        uniform("vec4", kQuadRect),
        uniform("float", kLineWidth),
        uniform("vec4", kHandleColour),
        uniform("vec4", kHighlightColour),
        uniform("ivec4", kHighlightMask),
        "void main() {",
        "  vec2 q = " + name(kFragTexCoord) + " * " + kTexScale + ";",
        "  vec4 r = " + name(kQuadRect) + ";",
        "  vec2 corners[5] = vec2[5](r.xy, r.zy, r.zw, r.xw, r.xy);",
        "  vec2 n = vec2(0.0);",
        "  vec2 m = vec2(0.0);",
        "  for (int i = 0; i < 4; ++i) {",
        "    vec2 c = " + lineCoverage("corners[i]", "corners[i + 1]") + ";",
        "    if (" + name(kHighlightMask) + "[i] == 0) {",
        "      n = max(n, c);",
        "    } else {",
        "      m = max(m, c);",
        "    }",
        "  }",
        "  vec4 colour = " + name(kHandleColour) + ";",
        "  vec4 highlight = " + name(kHighlightColour) + ";",
        "  vec4 core = colour * n.x;",
        "  vec4 halo = vec4(colour.rgb * 0.5, colour.a) * n.y * 0.5;",
        "  vec4 hcore = highlight * m.x;",
        "  vec4 hhalo = vec4(highlight.rgb * 0.5, highlight.a) * m.y * 0.25;",
        "  core = mix(core, hcore, hcore.a / (hcore.a + core.a + 0.00001));",
        "  halo = mix(halo, hhalo, hhalo.a / (hhalo.a + halo.a + 0.00001));",
        "  " + name(kFragColour) + " = halo * (1.0 - core.a) + core;",
        "}",
    });

const std::string kCutMarkerFragment =
    fragmentHeader() + kLineHelpers + kBoxHelpers +
    lines({
        uniform("vec2", kTexScale),
        uniform("vec2", kHandleCentre),
        uniform("float", kMarkerSize),
        uniform("vec4", kHandleColour),
        "void main() {",
        "  float size = " + name(kMarkerSize) + ";",
        "  vec2 q = " + name(kFragTexCoord) + " * " + kTexScale + " - " + kHandleCentre + ";",
        "  vec2 q1 = rotation(3.14159265 / 4.0) * q;",
        "  vec2 q2 = rotation(3.14159265 / 8.0) * q;",
        "  vec2 c = max(box(q1, 0.75 * 1.25 * size, 1.5), box(q2, 1.5, 0.75 * size));",
        "  " + name(kFragColour) + " = coverageColour(" + kHandleColour + ", c);",
        "}",
    });

// Each arrowhead is the intersection of three half-planes: beyond the arm's end and inside the
// two 45 degree flanks that meet at the tip.
const std::string kMoveMarkerFragment =
    fragmentHeader() + kLineHelpers + kBoxHelpers +
    lines({
        uniform("vec2", kTexScale),
        uniform("vec2", kHandleCentre),
        uniform("float", kMarkerSize),
        uniform("vec4", kHandleColour),
        "vec2 edge(float e) {",
        "  return clamp(vec2(e, (e + 2.5) / 2.5), 0.0, 1.0);",
        "}",
        "vec2 head(vec2 q, float halfSize) {",
        "  mat2 turnA = mat2(-0.70710678118, 0.70710678118, -0.70710678118, -0.70710678118);",
        "  mat2 turnB = mat2(-0.70710678118, -0.70710678118, 0.70710678118, -0.70710678118);",
        "  return edge(q.x) * edge((turnA * (q - vec2(0.0, halfSize))).x) *",
        "         edge((turnB * (q + vec2(0.0, halfSize))).x);",
        "}",
        "void main() {",
        "  float size = " + name(kMarkerSize) + ";",
        "  vec2 q = " + name(kFragTexCoord) + " * " + kTexScale + " - " + kHandleCentre + ";",
        "  vec2 arm = vec2(size / 2.0, 0.0);",
        "  vec2 c = max(box(q, 0.75 * size, 1.5), box(q, 1.5, 0.75 * size));",
        "  c = max(c, head(q - arm, size / 2.0));",
        "  c = max(c, head(vec2(-q.x, q.y) - arm, size / 2.0));",
        "  c = max(c, head(vec2(q.y, q.x) - arm, size / 2.0));",
        "  c = max(c, head(vec2(-q.y, q.x) - arm, size / 2.0));",
        "  " + name(kFragColour) + " = coverageColour(" + kHandleColour + ", c);",
        "}",
    });

}  // namespace shaders
}  // namespace veltrane
