// Draw overlay: the on-screen handles drawn over the viewer. Each handle is one quad whose
// fragment program draws its lines analytically, so handles look the same at every zoom. At
// most one handle is highlighted per draw: the first hot one in draw order.
#include "controls/overlay_drawing.h"

#include <GL/glew.h>

#include <algorithm>
#include <cmath>

#include "controls/control_constants.h"
#include "controls/handle_geometry.h"
#include "controls/instance_record.h"
#include "gl/draws.h"
#include "gl/effect_data.h"
#include "gl/textured_quad.h"
#include "render/gl_startup.h"
#include "shaders/program_names.h"
#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace {

using plugin_glsl_types::genVec4;

struct Colour {
  float r, g, b, a;
};
constexpr Colour kNormalColour{0.5f, 0.5f, 0.5f, 0.5f};
constexpr Colour kHighlightColour{0.75f, 0.75f, 0.75f, 0.75f};
constexpr Colour kMarkerColour{1.0f, 1.0f, 1.0f, 1.0f};
constexpr float kIdentity[16] = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
constexpr float kMarkerOffset = 5.0f;

// What one draw shares between its handles.
struct OverlayDraw {
  WispHost* host;
  tagWispAPI* api;
  const EffectData& registry;
  const WispViewerContext& context;
  EffectInstance& instance;
  ViewerMeasures view;
  bool stickyHover;  // the touch host: no hover arrows, every rotation handle highlighted
  bool anyHot = false;

  GLint location(const char* name) const { return registry.uniformLocation(name); }
  void colour(const char* name, Colour c) const {
    registry.setUniform4f(location(name), c.r, c.g, c.b, c.a);
  }
  void frameUniforms(const char* program, const float* model) const {
    registry.useProgram(program);
    registry.setUniformMatrix(location(shader_ids::kProjectionMatrix), 4, 1, false,
                              context.projection);
    registry.setUniformMatrix(location(shader_ids::kModelViewMatrix), 4, 1, false, model);
    registry.setUniform2f(location(shader_ids::kTexScale), view.frameSize.x, view.frameSize.y);
    registry.setUniform2f(location(shader_ids::kPixelSize), view.viewScale.x, view.viewScale.y);
  }
  float maxViewScale() const { return std::max(view.viewScale.x, view.viewScale.y); }
};

// Premultiplied handles over the viewer's picture; the host's blend state is put back after.
void drawBlended(const OverlayDraw& draw, const TexturedQuad& quad) {
  glEnable(GL_BLEND);
  glBlendEquation(GL_FUNC_ADD);
  glBlendFunc(GL_ONE, GL_ONE_MINUS_SRC_ALPHA);
  drawTexturedVertices(draw.api, draw.host, quad.data(), 4, GL_TRIANGLE_STRIP);
  glBlendEquation(GL_FUNC_ADD);
  glBlendFunc(GL_ONE, GL_ONE);
  glDisable(GL_BLEND);
  draw.registry.releaseProgram();
}

// A corner-space box whose texture coordinates recover corner space through texScale.
TexturedQuad frameBox(const OverlayDraw& draw, float x0, float y0, float x1, float y1) {
  const float w = draw.view.frameSize.x;
  const float h = draw.view.frameSize.y;
  auto vertex = [&](float x, float y) {
    return TexturedVertex{x, y, w != 0.0f ? x / w : 0.0f, h != 0.0f ? y / h : 0.0f};
  };
  return {vertex(x0, y0), vertex(x1, y0), vertex(x0, y1), vertex(x1, y1)};
}

void drawDoubleArrow(const OverlayDraw& draw, const char* program, const float* model,
                     genVec2 centre, float angle, float length, float lineWidth,
                     genVec2 halfExtent) {
  draw.frameUniforms(program, model);
  draw.registry.setUniform2f(draw.location(shader_ids::kHandleCentre), centre.x, centre.y);
  draw.registry.setUniform1f(draw.location(shader_ids::kHandleLength), length);
  draw.registry.setUniform1f(draw.location(shader_ids::kHandleGap), length);
  draw.registry.setUniform1f(draw.location(shader_ids::kHandleAngle), angle);
  draw.registry.setUniform1f(draw.location(shader_ids::kLineWidth), lineWidth);
  draw.colour(shader_ids::kHandleColour, kHighlightColour);
  drawBlended(draw, frameBox(draw, centre.x - halfExtent.x, centre.y - halfExtent.y,
                             centre.x + halfExtent.x, centre.y + halfExtent.y));
}

void drawCutPositionHandle(OverlayDraw& draw, const SplitScreenCutPositionControl& control) {
  if (!control.hot || draw.anyHot || draw.stickyHover) return;
  draw.anyHot = true;
  const float s = draw.maxViewScale();
  drawDoubleArrow(draw, programs::kCutMoveHandle, kIdentity, control.handlePosition,
                  control.segmentAngle, 10.0f * s, 1.5f,
                  {35.0f * draw.view.viewScale.x, 35.0f * draw.view.viewScale.y});
}

void drawRotationHandle(OverlayDraw& draw, const RotationControl& control,
                        const HandleCircle& circle) {
  const float angle = control.getter(draw.host, draw.api, draw.view.time);
  const RotationControl::HandleGeometry geometry =
      control.handleGeometry(circle.radius, draw.view.viewScale, draw.view.uiScale);
  if (!geometry.fits) return;
  const bool highlighted = (!draw.anyHot && control.hot) || draw.stickyHover;
  if (highlighted) draw.anyHot = true;
  const float referenceAngle = 0.0f;
  const int arrowMode = control.showSweep == 0 ? 0 : (angle - referenceAngle < 0.0f ? 1 : 2);

  draw.frameUniforms(programs::kRotationControl, kIdentity);
  const EffectData& registry = draw.registry;
  registry.setUniform1f(draw.location(shader_ids::kHandleLength), geometry.size);
  registry.setUniform1f(draw.location(shader_ids::kHandleRadius), geometry.handleRadius);
  registry.setUniform2f(draw.location(shader_ids::kHandleCentre), circle.centre.x, circle.centre.y);
  registry.setUniform1f(draw.location(shader_ids::kHandleAngle), angle);
  registry.setUniform1f(draw.location(shader_ids::kReferenceAngle), referenceAngle);
  registry.setUniform1f(draw.location(shader_ids::kLineWidth), highlighted ? 1.5f : 1.0f);
  draw.colour(shader_ids::kHandleColour, highlighted ? kHighlightColour : kNormalColour);
  registry.setUniform1i(draw.location(shader_ids::kArrowMode), arrowMode);
  const float reach = geometry.handleRadius + 5.0f;
  drawBlended(draw, frameBox(draw, circle.centre.x - reach, circle.centre.y - reach,
                             circle.centre.x + reach, circle.centre.y + reach));
}

// Column-major turn by `rotation` about `centre`, carrying the rectangle's +y axis onto
// (sin rotation, cos rotation) like the input's picture.
void rotationAbout(genVec2 centre, float rotation, float (&m)[16]) {
  const float c = std::cos(rotation);
  const float s = std::sin(rotation);
  const float values[16] = {c,
                            -s,
                            0,
                            0,
                            s,
                            c,
                            0,
                            0,
                            0,
                            0,
                            1,
                            0,
                            centre.x - (c * centre.x + s * centre.y),
                            centre.y - (-s * centre.x + c * centre.y),
                            0,
                            1};
  std::copy(std::begin(values), std::end(values), m);
}

// The resize arrow sits on the hovered edge or corner, pointing along the resize.
bool resizeArrowPlacement(ControlPart part, const genVec4& r, bool flipped, genVec2& at,
                          float& angle) {
  const float cx = (r.x + r.z) / 2.0f;
  const float cy = (r.y + r.w) / 2.0f;
  switch (part) {
    case ControlPart::EdgeX0:
      at = {r.x, cy}, angle = 3.1415927f;
      return true;
    case ControlPart::EdgeX1:
      at = {r.z, cy}, angle = 0.0f;
      return true;
    case ControlPart::EdgeY0:
      at = {cx, r.y}, angle = 1.5707964f;
      return true;
    case ControlPart::EdgeY1:
      at = {cx, r.w}, angle = 4.712389f;
      return true;
    case ControlPart::CornerX0Y0:
      at = {r.x, r.y}, angle = flipped ? 0.7853982f : 2.3561945f;
      return true;
    case ControlPart::CornerX1Y0:
      at = {r.z, r.y}, angle = flipped ? 2.3561945f : 0.7853982f;
      return true;
    case ControlPart::CornerX0Y1:
      at = {r.x, r.w}, angle = flipped ? 5.497787f : 3.9269908f;
      return true;
    case ControlPart::CornerX1Y1:
      at = {r.z, r.w}, angle = flipped ? 3.9269908f : 5.497787f;
      return true;
    default:
      return false;
  }
}

void drawInputRectangle(OverlayDraw& draw, const AAQuadControl& control, float rotation) {
  const genVec4 r = control.getter(draw.host, draw.api, draw.view.time, draw.view.frameSize);
  const genVec4 sorted{std::min(r.x, r.z), std::min(r.y, r.w), std::max(r.x, r.z),
                       std::max(r.y, r.w)};
  const bool xInOrder = r.x <= r.z;
  const bool yInOrder = r.y <= r.w;
  const bool flipped = xInOrder != yInOrder;
  float model[16];
  rotationAbout({(sorted.x + sorted.z) / 2.0f, (sorted.y + sorted.w) / 2.0f}, rotation, model);

  int mask[4] = {0, 0, 0, 0};  // min-y, max-x, max-y, min-x edges
  if (!draw.anyHot && !draw.stickyHover) {
    const int bits = static_cast<unsigned char>(AAQuadControl::edgeMaskOf(control.part));
    mask[0] = (bits & (yInOrder ? kEdgeBitY0 : kEdgeBitY1)) != 0;
    mask[1] = (bits & (xInOrder ? kEdgeBitX1 : kEdgeBitX0)) != 0;
    mask[2] = (bits & (yInOrder ? kEdgeBitY1 : kEdgeBitY0)) != 0;
    mask[3] = (bits & (xInOrder ? kEdgeBitX0 : kEdgeBitX1)) != 0;
  }
  draw.frameUniforms(programs::kQuadControl, model);
  draw.registry.setUniform4f(draw.location(shader_ids::kQuadRect), sorted.x, sorted.y, sorted.z,
                             sorted.w);
  draw.colour(shader_ids::kHandleColour, kNormalColour);
  draw.colour(shader_ids::kHighlightColour, kHighlightColour);
  draw.registry.setUniform1f(draw.location(shader_ids::kLineWidth), 1.5f);
  draw.registry.setUniform4i(draw.location(shader_ids::kHighlightMask), mask[0], mask[1], mask[2],
                             mask[3]);
  const float growX = 3.0f * draw.view.viewScale.x;
  const float growY = 3.0f * draw.view.viewScale.y;
  drawBlended(
      draw, frameBox(draw, sorted.x - growX, sorted.y - growY, sorted.z + growX, sorted.w + growY));

  genVec2 at;
  float angle = 0.0f;
  if (!draw.anyHot && !draw.stickyHover &&
      resizeArrowPlacement(control.part, r, flipped, at, angle)) {
    const float s = draw.maxViewScale();
    const float reach = 20.0f * s + 2.5f;
    drawDoubleArrow(draw, programs::kDirectionScaleControl, model, at, angle, 10.0f * s, 1.0f,
                    {reach, reach});
  }
  if (!draw.anyHot && control.part != ControlPart::None) draw.anyHot = true;
}

// Markers are drawn in viewport pixels, five scaled pixels beside the pointer.
void drawPointerMarker(const OverlayDraw& draw, const char* program) {
  const float* p = draw.context.projection;
  const genVec2 pointer = draw.instance.pointerPosition;
  const float clipX = p[0] * pointer.x + p[4] * pointer.y + p[12];
  const float clipY = p[1] * pointer.x + p[5] * pointer.y + p[13];
  const float clipW = p[3] * pointer.x + p[7] * pointer.y + p[15];
  const float ndcX = clipW != 0.0f ? clipX / clipW : clipX;
  const float ndcY = clipW != 0.0f ? clipY / clipW : clipY;
  GLint viewport[4] = {0, 0, 0, 0};
  glGetIntegerv(GL_VIEWPORT, viewport);
  const float width = static_cast<float>(viewport[2]);
  const float height = static_cast<float>(viewport[3]);
  const float offset = kMarkerOffset * draw.view.uiScale;

  const EffectData& registry = draw.registry;
  registry.useProgram(program);
  registry.setUniformMatrix(draw.location(shader_ids::kProjectionMatrix), 4, 1, false, kIdentity);
  registry.setUniformMatrix(draw.location(shader_ids::kModelViewMatrix), 4, 1, false, kIdentity);
  registry.setUniform2f(draw.location(shader_ids::kTexScale), width, height);
  registry.setUniform2f(draw.location(shader_ids::kHandleCentre),
                        (ndcX + 1.0f) / 2.0f * width + offset,
                        (ndcY + 1.0f) / 2.0f * height + offset);
  registry.setUniform1f(draw.location(shader_ids::kMarkerSize), 5.0f * draw.view.uiScale);
  draw.colour(shader_ids::kHandleColour, kMarkerColour);
  const TexturedQuad quad = {TexturedVertex{-1, -1, 0, 0}, TexturedVertex{1, -1, 1, 0},
                             TexturedVertex{-1, 1, 0, 1}, TexturedVertex{1, 1, 1, 1}};
  drawBlended(draw, quad);
}

}  // namespace

int drawOverlay(WispHost* host, tagWispAPI* api) {
  EffectInstance* instance = instanceOf(api);
  const auto* context = static_cast<const WispViewerContext*>(api ? api->renderContext : nullptr);
  if (!instance || !context || !programsBuilt(static_cast<const EffectData*>(api->pluginData)))
    return 1;
  // A named context is a secondary view of the host's; handles belong to the main viewer only.
  if (context->name && context->name[0] != '\0') return 1;

  OverlayDraw draw{host,
                   api,
                   *static_cast<const EffectData*>(api->pluginData),
                   *context,
                   *instance,
                   viewerMeasuresOf(*context),
                   api->GetHostId(host) == kHostProductTouch};
  const CutLayout layout = readCutLayout(host, api, draw.view.time);

  if (!layout.radial)
    for (int i = 0; i < layout.cutCount; ++i)
      drawCutPositionHandle(draw, instance->cutPositionControls[static_cast<size_t>(i)]);

  for (int i = 0; i < layout.cutCount; ++i) {
    const RotationControl& control = instance->cutDirectionControls[static_cast<size_t>(i)];
    // Radial handles sit wherever the pointer is; only the one under it is shown.
    if (layout.radial && !(control.hot && !draw.anyHot)) continue;
    const HandleCircle circle =
        cutDirectionHandle(host, api, draw.view, layout.radial, i, instance->pointerPosition);
    drawRotationHandle(draw, control, circle);
  }

  const int selected = instance->selectedInput;
  if (inputHandlesLive(selected, layout.cutCount)) {
    const InputHandle handle = selectedInputHandle(host, api, draw.view, selected);
    if (!draw.stickyHover)
      drawRotationHandle(draw, instance->inputRotationControls[static_cast<size_t>(selected)],
                         handle.circle);
    drawInputRectangle(draw, instance->inputQuadControls[static_cast<size_t>(selected)],
                       handle.rotation);
  }

  if (!draw.anyHot) {
    if (instance->shiftDown && layout.cutCount < kMaxCuts)
      drawPointerMarker(draw, programs::kCutHandle);
    else if (instance->regionHover)
      drawPointerMarker(draw, programs::kMoveHandle);
  }
  return 1;
}

}  // namespace veltrane
