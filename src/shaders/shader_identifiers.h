// The names of every attribute, varying, output and uniform the GLSL sources declare, held once:
// the sources are assembled from these constants and the code binds and looks up the same ones.
#pragma once

namespace veltrane {
namespace shader_ids {

// Vertex attributes and the fixed locations the registry binds them to.
inline constexpr char kVertexPosition[] = "vertexPosition";
inline constexpr char kVertexTexCoord[] = "vertexTexCoord";
inline constexpr char kVertexTexCoord0[] = "vertexTexCoord0";
inline constexpr char kVertexTexCoord1[] = "vertexTexCoord1";
inline constexpr int kPositionLocation = 0;
inline constexpr int kTexCoordLocation = 8;
inline constexpr int kTexCoord0Location = 8;
inline constexpr int kTexCoord1Location = 9;

// Attribute names bound instead when a program's sources use the conventional names.
inline constexpr char kLiteralPosition[] = "in_Position";
inline constexpr char kLiteralTexCoord[] = "in_TexCoord";
inline constexpr char kLiteralTexCoord0[] = "in_TexCoord0";
inline constexpr char kLiteralTexCoord1[] = "in_TexCoord1";

// Varyings and the fragment output (location 0).
inline constexpr char kFragTexCoord[] = "fragTexCoord";
inline constexpr char kFragValue[] = "fragValue";
inline constexpr char kFragColour[] = "fragColour";

// Uniforms of the effect's own programs.
inline constexpr char kProjectionMatrix[] = "projectionMatrix";
inline constexpr char kModelViewMatrix[] = "modelViewMatrix";
inline constexpr char kSourceTexture[] = "sourceTexture";
inline constexpr char kSourceExtent[] = "sourceExtent";
inline constexpr char kTint[] = "tint";
inline constexpr char kSampleOffset[] = "sampleOffset";
inline constexpr char kSampleRotation[] = "sampleRotation";
inline constexpr char kInverseScale[] = "inverseScale";
inline constexpr char kAspectRatio[] = "aspectRatio";
inline constexpr char kDistanceTexture[] = "distanceTexture";
inline constexpr char kDistanceScale[] = "distanceScale";
inline constexpr char kBorderHalfWidth[] = "borderHalfWidth";
inline constexpr char kBorderColour[] = "borderColour";
inline constexpr char kFillColour[] = "fillColour";
inline constexpr char kLayerMatrix[] = "layerMatrix";
inline constexpr char kLayerOffset[] = "layerOffset";
inline constexpr char kCameraPosition[] = "cameraPosition";

// Uniforms of the on-screen control programs. Their vertex stage is the textured vertex stage,
// so "projection" and "model" are kProjectionMatrix and kModelViewMatrix.
inline constexpr char kHandleLength[] = "handleLength";
inline constexpr char kHandleGap[] = "handleGap";
inline constexpr char kHandleRadius[] = "handleRadius";
inline constexpr char kHandleCentre[] = "handleCentre";
inline constexpr char kHandleAngle[] = "handleAngle";
inline constexpr char kReferenceAngle[] = "referenceAngle";
inline constexpr char kArrowMode[] = "arrowMode";
inline constexpr char kTexScale[] = "texScale";
inline constexpr char kPixelSize[] = "pixelSize";
inline constexpr char kLineWidth[] = "lineWidth";
inline constexpr char kHandleColour[] = "handleColour";
inline constexpr char kHighlightColour[] = "highlightColour";
inline constexpr char kHighlightMask[] = "highlightMask";
inline constexpr char kQuadRect[] = "quadRect";
inline constexpr char kMarkerSize[] = "markerSize";

}  // namespace shader_ids
}  // namespace veltrane
