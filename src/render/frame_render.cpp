// One frame of the split screen: every region's input composed into an offscreen target, a
// distance field of the cut segments drawn with MIN blending into a second one, and both
// combined into the host's output with an anti-aliased border.
#include "render/frame_render.h"

#include <GL/glew.h>

#include <utility>
#include <vector>

#include "common/param_ids.h"
#include "geometry/border_mesh.h"
#include "geometry/cut_model.h"
#include "geometry/cut_segments.h"
#include "geometry/input_transform.h"
#include "geometry/region_partition.h"
#include "gl/draws.h"
#include "gl/effect_data.h"
#include "gl/render_target.h"
#include "gl/texture_units.h"
#include "gl/textured_quad.h"
#include "render/gl_startup.h"
#include "render/input_capture.h"
#include "shaders/program_names.h"
#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace {

using plugin_glsl_types::genVec2;

// Row-major, uploaded transposed: the identity, then the move from centred frame coordinates
// to the host's pixel coordinates.
struct CentringMatrix {
  float values[16] = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
  void translate(float x, float y) {
    values[3] += x;
    values[7] += y;
  }
};

// The clear colour belongs to the host: it is put back however the render ends. The render
// starts from a transparent clear.
class ClearColourGuard {
 public:
  ClearColourGuard() {
    glGetFloatv(GL_COLOR_CLEAR_VALUE, saved_);
    glClearColor(0.0f, 0.0f, 0.0f, 0.0f);
  }
  ~ClearColourGuard() { glClearColor(saved_[0], saved_[1], saved_[2], saved_[3]); }
  ClearColourGuard(const ClearColourGuard&) = delete;
  ClearColourGuard& operator=(const ClearColourGuard&) = delete;

 private:
  GLfloat saved_[4];
};

// What the passes draw, built from the parameters before any GL call: the regions and the
// visible segment of every cut.
struct FrameGeometry {
  RegionList regions;
  std::vector<CutSegment> segments;
};

void setMatrix(const EffectData& registry, const char* name, const float* values, bool transpose) {
  registry.setUniformMatrix(registry.uniformLocation(name), 4, 1, transpose, values);
}

void setSampling(const EffectData& registry, const InputSampling& sampling) {
  registry.setUniform3f(registry.uniformLocation(shader_ids::kTint), sampling.tint[0],
                        sampling.tint[1], sampling.tint[2]);
  registry.setUniform2f(registry.uniformLocation(shader_ids::kSampleOffset),
                        sampling.sampleOffset.x, sampling.sampleOffset.y);
  registry.setUniform1f(registry.uniformLocation(shader_ids::kSampleRotation),
                        sampling.sampleRotation);
  registry.setUniform1f(registry.uniformLocation(shader_ids::kInverseScale), sampling.inverseScale);
  registry.setUniform1f(registry.uniformLocation(shader_ids::kAspectRatio), sampling.aspectRatio);
}

void setSourceTexture(const EffectData& registry, const TextureRecord& texture) {
  bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, texture.id, true);
  registry.setUniform1i(registry.uniformLocation(shader_ids::kSourceTexture), 0);
  registry.setUniform2f(registry.uniformLocation(shader_ids::kSourceExtent), texture.s1,
                        texture.t1);
}

std::vector<TexturedVertex> regionVertices(const Region& region) {
  std::vector<TexturedVertex> vertices;
  vertices.reserve(region.triangles.size() * 3);
  for (const RegionTriangle& triangle : region.triangles)
    for (const RegionVertex& vertex : triangle.vertices)
      vertices.push_back({vertex.x, vertex.y, vertex.s, vertex.t});
  return vertices;
}

// Draws every region with its input's picture into the composition target. With the cut
// regions shown, region i of N is tinted i / N, a ramp of greys over the inputs.
void drawRegions(const RegionList& regions, WispHost* host, tagWispAPI* api,
                 const CentringMatrix& centring, const RenderTarget& composition) {
  const EffectData& registry = *static_cast<const EffectData*>(api->pluginData);
  const WispRenderContext& context = *static_cast<const WispRenderContext*>(api->renderContext);
  const bool showRegions = api->GetBoolParam(host, param::kViewCutRegions, context.time) != 0;
  const float step = regions.empty() ? 1.0f : 1.0f / static_cast<float>(regions.size());
  float grey = step;
  for (const Region& region : regions) {
    InputSampling sampling =
        readInputSampling(host, api, context.time, context.width, context.height,
                          context.hasPixelAspect != 0, context.pixelAspect, region.id);
    if (showRegions) sampling.tint = {grey, grey, grey};

    attachRenderTarget(context.output, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
    bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, context.source.id, true);
    setTextureUnitNearest(GL_TEXTURE0, GL_TEXTURE_2D, true);
    registry.releaseProgram();

    RenderTarget input;
    fetchInputFrame(region.id, input, host, api);

    attachRenderTarget(composition.texture, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
    registry.useProgram(programs::kSplitScreen);
    setMatrix(registry, shader_ids::kProjectionMatrix, context.projection, false);
    setMatrix(registry, shader_ids::kModelViewMatrix, centring.values, true);
    setSourceTexture(registry, input.texture);
    setSampling(registry, sampling);
    if (!region.triangles.empty()) {
      const std::vector<TexturedVertex> vertices = regionVertices(region);
      drawTexturedVertices(api, host, vertices.data(), static_cast<int>(vertices.size()),
                           GL_TRIANGLES);
    }
    grey += step;
  }
}

FrameGeometry readFrameGeometry(WispHost* host, tagWispAPI* api, const WispRenderContext& context) {
  const genVec2 frameSize{static_cast<float>(context.width), static_cast<float>(context.height)};
  const CutList cuts = readCutList(host, api, context.time, frameSize, context.hasPixelAspect != 0,
                                   context.pixelAspect);
  const int32_t cutType = api->GetChoiceParam(host, param::kCutType, 0);
  // The partition starts from a cut; with none the frame shows the plain source.
  RegionList regions = cuts.empty() ? RegionList{} : partitionFrame(cuts, frameSize, cutType);
  return FrameGeometry{std::move(regions), clipCutSegments(cuts, frameSize)};
}

// The source copied into the composition: the picture wherever no region draws. Returns the
// centring matrix moved to the frame centre, which every later draw places its geometry with.
CentringMatrix copySource(WispHost* host, tagWispAPI* api, const RenderTarget& composition) {
  const EffectData& registry = *static_cast<const EffectData*>(api->pluginData);
  const WispRenderContext& context = *static_cast<const WispRenderContext*>(api->renderContext);
  CentringMatrix centring;
  attachRenderTarget(composition.texture, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
  registry.useProgramAt(programs::kSplitScreenIndex);
  glClear(GL_COLOR_BUFFER_BIT);
  setMatrix(registry, shader_ids::kProjectionMatrix, context.projection, false);
  setMatrix(registry, shader_ids::kModelViewMatrix, centring.values, true);
  centring.translate(static_cast<float>(context.width) / 2.0f,
                     static_cast<float>(context.height) / 2.0f);
  setSourceTexture(registry, context.source);
  setSampling(registry, InputSampling{});
  const TexturedQuad frameQuad = makeFrameQuad(context);
  drawTexturedVertices(api, host, frameQuad.data(), 4, GL_TRIANGLE_STRIP);
  setMatrix(registry, shader_ids::kModelViewMatrix, centring.values, true);
  return centring;
}

// The region pass: the source, then every region with its input's picture.
CentringMatrix composeRegions(WispHost* host, tagWispAPI* api, const RegionList& regions,
                              const RenderTarget& composition) {
  const CentringMatrix centring = copySource(host, api, composition);
  drawRegions(regions, host, api, centring, composition);
  return centring;
}

// The distance field: every pixel keeps, by MIN blending, its distance to the nearest cut
// segment in units of the border's reach, or 1 where no mesh reaches.
RenderTarget drawDistanceField(WispHost* host, tagWispAPI* api, const CentringMatrix& centring,
                               const std::vector<CutSegment>& segments) {
  const WispRenderContext& context = *static_cast<const WispRenderContext*>(api->renderContext);
  RenderTarget distance = createRenderTarget(host, api, false);
  attachRenderTarget(distance.texture, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
  glClearColor(1.0f, 1.0f, 1.0f, 0.0f);
  glClear(GL_COLOR_BUFFER_BIT);
  glEnable(GL_BLEND);
  glBlendEquation(GL_MIN);
  glBlendFunc(GL_ONE, GL_ONE);
  const float radius = api->GetFloatParam(host, param::kBorderWidth, context.time) * 0.5f + 1.0f;
  const SegmentList segmentList{reinterpret_cast<const float*>(segments.data()), segments.size()};
  buildCutCaps(host, api, centring.values, segmentList, radius);
  buildCutStrips(host, api, centring.values, segmentList, radius);
  glBlendEquation(GL_FUNC_ADD);
  glBlendFunc(GL_ONE, GL_ONE);
  glDisable(GL_BLEND);
  glClearColor(0.0f, 0.0f, 0.0f, 0.0f);
  return distance;
}

// The border combine: the composition into the host's output, with the border colour laid
// over it wherever the distance field says a pixel lies within half the border width.
void combineBorder(WispHost* host, tagWispAPI* api, const RenderTarget& composition,
                   const RenderTarget& distance) {
  const EffectData& registry = *static_cast<const EffectData*>(api->pluginData);
  const WispRenderContext& context = *static_cast<const WispRenderContext*>(api->renderContext);
  attachRenderTarget(context.output, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
  glClear(GL_COLOR_BUFFER_BIT);
  // borderWidth is asked again rather than handed over from the distance pass: hosts get the
  // same reads, in the same order, from every render of this effect, and this is the second.
  const float borderWidth = api->GetFloatParam(host, param::kBorderWidth, context.time);
  float colour[4] = {0.0f, 0.0f, 0.0f, 1.0f};
  api->GetColorParam(host, param::kBorderColor, context.time, &colour[0], &colour[1], &colour[2]);
  const float alpha = api->GetFloatParam(host, param::kBorderAlpha, context.time);
  registry.useProgram(programs::kCombineBorder);
  setMatrix(registry, shader_ids::kProjectionMatrix, context.projection, false);
  setMatrix(registry, shader_ids::kModelViewMatrix, context.modelView, false);
  bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, composition.texture.id, true);
  registry.setUniform1i(registry.uniformLocation(shader_ids::kSourceTexture), 0);
  bindTextureUnit(GL_TEXTURE1, GL_TEXTURE_2D, distance.texture.id, true);
  registry.setUniform1i(registry.uniformLocation(shader_ids::kDistanceTexture), 1);
  registry.setUniform2f(registry.uniformLocation(shader_ids::kDistanceScale),
                        distance.texture.s1 / composition.texture.s1,
                        distance.texture.t1 / composition.texture.t1);
  registry.setUniform1f(registry.uniformLocation(shader_ids::kBorderHalfWidth), borderWidth * 0.5f);
  registry.setUniform4f(registry.uniformLocation(shader_ids::kBorderColour), colour[0] * alpha,
                        colour[1] * alpha, colour[2] * alpha, colour[3] * alpha);
  const TexturedQuad outputQuad = makeTextureQuad(
      composition.texture, static_cast<float>(context.width), static_cast<float>(context.height));
  drawTexturedVertices(api, host, outputQuad.data(), 4, GL_TRIANGLE_STRIP);
}

// Leaves unit 1 empty and unit 0 holding the source with nearest filtering, no program in use.
void resetTextureUnits(const EffectData& registry, const WispRenderContext& context) {
  unbindTextureUnit(GL_TEXTURE1, GL_TEXTURE_2D, true);
  setTextureUnitNearest(GL_TEXTURE0, GL_TEXTURE_2D, true);
  bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, context.source.id, true);
  setTextureUnitNearest(GL_TEXTURE0, GL_TEXTURE_2D, true);
  registry.releaseProgram();
}

}  // namespace

int renderFrame(WispHost* host, tagWispAPI* api) {
  if (!api->renderContext || !programsBuilt(static_cast<const EffectData*>(api->pluginData)))
    return 1;
  const WispRenderContext& context = *static_cast<const WispRenderContext*>(api->renderContext);
  // A frame without pixels has nothing to show, and a target of its size could not even be
  // drawn into: an empty texture leaves the framebuffer incomplete.
  if (context.width <= 0 || context.height <= 0) return 1;
  const FrameGeometry geometry = readFrameGeometry(host, api, context);

  RenderTarget composition = createRenderTarget(host, api, false);
  ClearColourGuard clearColour;
  const CentringMatrix centring = composeRegions(host, api, geometry.regions, composition);
  RenderTarget distance = drawDistanceField(host, api, centring, geometry.segments);
  combineBorder(host, api, composition, distance);
  resetTextureUnits(*static_cast<const EffectData*>(api->pluginData), context);

  releaseRenderTarget(distance);
  // Leaving the scope restores the clear colour and then gives the composition back, in that
  // order, here and on every exit by exception.
  return 1;
}

}  // namespace veltrane
