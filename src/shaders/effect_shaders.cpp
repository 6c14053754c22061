// The effect's shader stages. Uniform, attribute and varying names come from the shared
// identifier table; the computation of each stage is written out step by step.
#include "shaders/effect_shaders.h"

#include "shaders/glsl_text.h"
#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace shaders {

using namespace shader_ids;

const std::string kTexturedVertex = lines({
    kVersionLine,
    input("vec4", kVertexPosition),
    input("vec2", kVertexTexCoord),
    output("vec2", kFragTexCoord),
    uniform("mat4", kProjectionMatrix),
    uniform("mat4", kModelViewMatrix),
    "void main() {",
    "  " + name(kFragTexCoord) + " = " + kVertexTexCoord + ";",
    "  gl_Position = " + name(kProjectionMatrix) + " * " + kModelViewMatrix + " * " +
        kVertexPosition + ";",
    "}",
});

// The vertex's z carries its distance value (distance to the cut over the border radius); it
// is passed on and also becomes the depth, in GL's [-1, 1].
const std::string kDistanceVertex = lines({
    kVersionLine,
    input("vec4", kVertexPosition),
    output("float", kFragValue),
    uniform("mat4", kProjectionMatrix),
    uniform("mat4", kModelViewMatrix),
    "void main() {",
    "  " + name(kFragValue) + " = " + kVertexPosition + ".z;",
    "  gl_Position = " + name(kProjectionMatrix) + " * " + kModelViewMatrix + " * " +
        kVertexPosition + ";",
    "  gl_Position.z = " + name(kFragValue) + " * 2.0 - 1.0;",
    "}",
});

const std::string kSolidVertex = lines({
    kVersionLine,
    input("vec4", kVertexPosition),
    uniform("mat4", kProjectionMatrix),
    uniform("mat4", kModelViewMatrix),
    "void main() {",
    "  gl_Position = " + name(kProjectionMatrix) + " * " + kModelViewMatrix + " * " +
        kVertexPosition + ";",
    "}",
});

// The layer's corner is flattened onto z = 0 before its own transform and its depth added back
// after; with a camera the point slides along the line towards the camera onto the plane z = 0.
const std::string kLayerAlignmentVertex = lines({
    kVersionLine,
    input("vec4", kVertexPosition),
    input("vec2", kVertexTexCoord),
    output("vec2", kFragTexCoord),
    uniform("mat4", kProjectionMatrix),
    uniform("mat4", kModelViewMatrix),
    uniform("mat4", kLayerMatrix),
    uniform("vec3", kLayerOffset),
    uniform("vec3", kCameraPosition),
    "void main() {",
    "  " + name(kFragTexCoord) + " = " + kVertexTexCoord + ";",
    "  vec4 p = " + name(kVertexPosition) + ";",
    "  p.z = 0.0;",
    "  p = " + name(kModelViewMatrix) + " * p;",
    "  p = " + name(kLayerMatrix) + " * p;",
    "  p.z += " + name(kVertexPosition) + ".z;",
    "  p.xyz += " + name(kLayerOffset) + ";",
    "  if (" + name(kCameraPosition) + " != vec3(0.0)) {",
    "    vec3 v = " + name(kCameraPosition) + " - p.xyz;",
    "    float t = v.z != 0.0 ? -p.z / v.z : 0.0;",
    "    if (t >= 1.0) t = -t;",
    "    p.xyz += v * t;",
    "  }",
    "  gl_Position = " + name(kProjectionMatrix) + " * p;",
    "}",
});

// The picture is placed in centred frame coordinates; the turn happens with x stretched to the
// frame's aspect so that it is a true rotation of the picture. Outside the picture: nothing.
const std::string kSplitScreenFragment = lines({
    kVersionLine,
    input("vec2", kFragTexCoord),
    colourOutput(),
    uniform("sampler2D", kSourceTexture),
    uniform("vec2", kSourceExtent),
    uniform("vec3", kTint),
    uniform("vec2", kSampleOffset),
    uniform("float", kSampleRotation),
    uniform("float", kInverseScale),
    uniform("float", kAspectRatio),
    "void main() {",
    "  float r = " + name(kSampleRotation) + ";",
    "  vec2 p = " + name(kFragTexCoord) + " - vec2(0.5);",
    "  p += " + name(kSampleOffset) + ";",
    "  p *= " + name(kInverseScale) + ";",
    "  p.x *= " + name(kAspectRatio) + ";",
    "  p = mat2(cos(r), -sin(r), sin(r), cos(r)) * p;",
    "  p.x /= " + name(kAspectRatio) + ";",
    "  p += vec2(0.5);",
    "  vec4 q = vec4(0.0);",
    "  if (p.x >= 0.0 && p.x <= 1.0 && p.y >= 0.0 && p.y <= 1.0) {",
    "    q = texture(" + name(kSourceTexture) + ", p * " + kSourceExtent + ");",
    "  }",
    "  q.rgb *= " + name(kTint) + ";",
    "  " + name(kFragColour) + " = q;",
    "}",
});

// The distance texture holds distance / (h + 1); the border covers up to h pixels from a cut
// with a one-pixel linear edge and fades out as h falls below one pixel.
const std::string kCombineBorderFragment = lines({
    kVersionLine,
    input("vec2", kFragTexCoord),
    colourOutput(),
    uniform("sampler2D", kSourceTexture),
    uniform("sampler2D", kDistanceTexture),
    uniform("vec2", kDistanceScale),
    uniform("float", kBorderHalfWidth),
    uniform("vec4", kBorderColour),
    "void main() {",
    "  float h = " + name(kBorderHalfWidth) + ";",
    "  vec4 q = texture(" + name(kSourceTexture) + ", " + kFragTexCoord + ");",
    "  float d = texture(" + name(kDistanceTexture) + ", " + kFragTexCoord + " * " +
        kDistanceScale + ").r * (h + 1.0);",
    "  float e = h - d;",
    "  float a = clamp(e + 0.5, 0.0, 1.0) * clamp(h, 0.0, 1.0);",
    "  " + name(kFragColour) + " = mix(q, " + kBorderColour + ", a);",
    "}",
});

const std::string kDistanceFragment = lines({
    kVersionLine,
    input("float", kFragValue),
    colourOutput(),
    "void main() {",
    "  " + name(kFragColour) + " = vec4(vec3(" + kFragValue + "), 1.0);",
    "}",
});

const std::string kSolidFragment = lines({
    kVersionLine,
    colourOutput(),
    uniform("vec4", kFillColour),
    "void main() {",
    "  " + name(kFragColour) + " = " + kFillColour + ";",
    "}",
});

const std::string kCopyFragment = lines({
    kVersionLine,
    input("vec2", kFragTexCoord),
    colourOutput(),
    uniform("sampler2D", kSourceTexture),
    "void main() {",
    "  " + name(kFragColour) + " = texture(" + kSourceTexture + ", " + kFragTexCoord + ");",
    "}",
});

}  // namespace shaders
}  // namespace veltrane
