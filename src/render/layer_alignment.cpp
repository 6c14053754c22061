// The chosen layer's quad is turned by its own placement, brought into the own layer's axes,
// moved to its centre there and projected from the camera onto the own layer's plane. The quad
// is drawn as a 19 x 19 grid so the per-vertex projection follows the perspective.
#include "render/layer_alignment.h"

#include <GL/glew.h>

#include <cstring>

#include "common/param_ids.h"
#include "gl/buffer_scopes.h"
#include "gl/effect_data.h"
#include "gl/render_target.h"
#include "gl/texture_units.h"
#include "gl/textured_quad.h"
#include "render/matrix_math.h"
#include "shaders/program_names.h"
#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace {

constexpr int kGridCells = 19;
// The lens term turns the view's focal element into the camera distance of a flat layer.
constexpr float kLensDivisor = 2.7777791f;
constexpr float kReferenceHeight = 720.0f;

Matrix4 toMatrix(const float* values) {
  Matrix4 m;
  std::memcpy(m.data(), values, sizeof m);
  return m;
}

void fixDegenerate(float* m) {
  if (m[8] == 0.0f && m[9] == 0.0f && m[10] == 0.0f && m[11] == 0.0f) m[10] = 1.0f;
  if (m[12] == 0.0f && m[13] == 0.0f && m[14] == 0.0f && m[15] == 0.0f) m[15] = 1.0f;
}

// A flat layer seen beside a 3D one is placed in camera space at the lens distance.
void promoteIntoCameraSpace(WispHost* host, tagWispAPI* api, const WispRenderContext& context,
                            LayerState& state) {
  WispTimeInfo info{context.width, context.height, 25.0};
  if (api->GetTimeInfo(host, &info) != 0) info.height = context.height;
  const float pixelAspect = context.hasPixelAspect ? context.pixelAspect : 1.0f;
  Matrix4 aspect = identityMatrix4();
  aspect[0] = pixelAspect;
  const float depth = -(context.view.lens[5] / kLensDivisor * 1000.0f *
                        static_cast<float>(info.height) / kReferenceHeight);
  const Matrix4 inverseView = inverseMatrix4(toMatrix(context.view.view));
  const Matrix4 placement = multiplyColumnMajor(
      inverseView, multiplyColumnMajor(translationMatrix4(0.0f, 0.0f, depth),
                                       multiplyColumnMajor(aspect, toMatrix(state.placement))));
  std::memcpy(state.placement, placement.data(), sizeof state.placement);
}

std::array<float, 3> translationOf(const Matrix4& m) { return {m[12], m[13], m[14]}; }

TexturedVertex gridVertex(const TexturedQuad& quad, float u, float v) {
  // Bilinear over the quad's corners: 0 bottom-left, 1 bottom-right, 2 top-left, 3 top-right.
  auto mix = [](float a, float b, float t) { return a + (b - a) * t; };
  TexturedVertex bottom{mix(quad[0].x, quad[1].x, u), mix(quad[0].y, quad[1].y, u),
                        mix(quad[0].s, quad[1].s, u), mix(quad[0].t, quad[1].t, u)};
  TexturedVertex top{mix(quad[2].x, quad[3].x, u), mix(quad[2].y, quad[3].y, u),
                     mix(quad[2].s, quad[3].s, u), mix(quad[2].t, quad[3].t, u)};
  return {mix(bottom.x, top.x, v), mix(bottom.y, top.y, v), mix(bottom.s, top.s, v),
          mix(bottom.t, top.t, v)};
}

void drawGrid(WispHost* host, tagWispAPI* api, const TexturedQuad& quad) {
  std::array<TexturedVertex, 2 * (kGridCells + 1)> row;
  VertexArrayScope scope(api, host, nullptr, sizeof row);
  glEnableVertexAttribArray(shader_ids::kPositionLocation);
  glVertexAttribPointer(shader_ids::kPositionLocation, 2, GL_FLOAT, GL_FALSE,
                        sizeof(TexturedVertex), nullptr);
  glEnableVertexAttribArray(shader_ids::kTexCoordLocation);
  glVertexAttribPointer(shader_ids::kTexCoordLocation, 2, GL_FLOAT, GL_FALSE,
                        sizeof(TexturedVertex), reinterpret_cast<const void*>(8));
  for (int i = 0; i < kGridCells; ++i) {
    const float v0 = static_cast<float>(i) / kGridCells;
    const float v1 = static_cast<float>(i + 1) / kGridCells;
    for (int j = 0; j <= kGridCells; ++j) {
      const float u = static_cast<float>(j) / kGridCells;
      row[2 * j] = gridVertex(quad, u, v0);
      row[2 * j + 1] = gridVertex(quad, u, v1);
    }
    glBufferSubData(GL_ARRAY_BUFFER, 0, sizeof row, row.data());
    glDrawArrays(GL_TRIANGLE_STRIP, 0, static_cast<GLsizei>(row.size()));
  }
  glDisableVertexAttribArray(shader_ids::kPositionLocation);
  glDisableVertexAttribArray(shader_ids::kTexCoordLocation);
}

}  // namespace

bool placementsDiffer(const LayerState& own, const LayerState& chosen) {
  return own.width != chosen.width || own.height != chosen.height || own.is3D != chosen.is3D ||
         std::memcmp(own.placement, chosen.placement, sizeof own.placement) != 0;
}

void alignLayer(WispHost* host, tagWispAPI* api, const WispRenderContext& context,
                TextureRecord& texture, LayerState ownState, LayerState chosenState) {
  const EffectData& registry = *static_cast<const EffectData*>(api->pluginData);
  const TextureRecord& output = context.output;

  TextureRecord aligned = output;
  aligned.id = api->AllocateTexture(host, api->renderContext, output.imageWidth, output.imageHeight,
                                    output.format, GL_RGBA, output.pixelType, nullptr,
                                    &aligned.allocatedWidth, &aligned.allocatedHeight);
  aligned.s0 = aligned.t0 = 0.0f;
  aligned.s1 = aligned.allocatedWidth ? static_cast<float>(aligned.imageWidth) /
                                            static_cast<float>(aligned.allocatedWidth)
                                      : 0.0f;
  aligned.t1 = aligned.allocatedHeight ? static_cast<float>(aligned.imageHeight) /
                                             static_cast<float>(aligned.allocatedHeight)
                                       : 0.0f;
  // Owned from here on, so an exception below still gives the texture back.
  RenderTarget holder;
  holder.texture = aligned;
  holder.owned = true;
  holder.host = host;
  holder.api = api;

  attachRenderTarget(aligned, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
  bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, texture.id, true);

  fixDegenerate(chosenState.placement);
  fixDegenerate(ownState.placement);
  if ((ownState.is3D != 0) != (chosenState.is3D != 0))
    promoteIntoCameraSpace(host, api, context, ownState.is3D ? chosenState : ownState);

  const float w = static_cast<float>(chosenState.width);
  const float h = static_cast<float>(chosenState.height);
  Matrix4 own = toMatrix(ownState.placement);
  Matrix4 chosen = toMatrix(chosenState.placement);
  const Matrix4 view = toMatrix(context.view.view);
  const Matrix4 ownInverse = inverseMatrix4(own);

  const std::array<float, 3> viewTranslation = translationOf(view);
  const std::array<float, 3> eyeDirection = applyLinear3(inverseMatrix4(view), viewTranslation);
  const std::array<float, 4> camera =
      applyMatrix4(ownInverse, {-eyeDirection[0], -eyeDirection[1], -eyeDirection[2], 1.0f});

  const std::array<float, 3> chosenLocal =
      applyLinear3(inverseMatrix4(chosen), translationOf(chosen));
  const std::array<float, 3> centre =
      applyLinear3(chosen, {chosenLocal[0] + w / 2.0f, chosenLocal[1] + h / 2.0f, chosenLocal[2]});
  const std::array<float, 3> ownTranslation = translationOf(own);
  const std::array<float, 3> offset =
      applyLinear3(ownInverse, {centre[0] - ownTranslation[0], centre[1] - ownTranslation[1],
                                centre[2] - ownTranslation[2]});

  clearTranslation(own);
  clearTranslation(chosen);
  const Matrix4 layerMatrix = inverseMatrix4(own);

  registry.useProgram(programs::kLayerAlignment);
  registry.setUniformMatrix(registry.uniformLocation(shader_ids::kProjectionMatrix), 4, 1, false,
                            context.projection);
  registry.setUniformMatrix(registry.uniformLocation(shader_ids::kModelViewMatrix), 4, 1, false,
                            chosen.data());
  registry.setUniformMatrix(registry.uniformLocation(shader_ids::kLayerMatrix), 4, 1, false,
                            layerMatrix.data());
  registry.setUniform3f(registry.uniformLocation(shader_ids::kLayerOffset), offset[0], offset[1],
                        offset[2]);
  registry.setUniform3f(registry.uniformLocation(shader_ids::kCameraPosition), camera[0], camera[1],
                        camera[2]);
  registry.setUniform1i(registry.uniformLocation(shader_ids::kSourceTexture), 0);

  TexturedQuad quad = makeTextureQuad(texture, w, h);
  for (TexturedVertex& vertex : quad) {
    vertex.x -= w / 2.0f;
    vertex.y -= h / 2.0f;
  }
  glClear(GL_COLOR_BUFFER_BIT);
  drawGrid(host, api, quad);

  attachRenderTarget(output, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
  bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, context.source.id, true);
  texture = aligned;
  holder.owned = false;  // handed to the caller
}

}  // namespace veltrane
