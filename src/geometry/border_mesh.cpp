// Building and drawing the border distance meshes, and the one GL decision they need: whether
// primitive restart may separate their strips and fans.
#include "geometry/border_mesh.h"

#include <GL/glew.h>

#include <cmath>
#include <string>

#include "gl/buffer_scopes.h"
#include "gl/draws.h"
#include "gl/effect_data.h"
#include "gl/extensions.h"
#include "shaders/program_names.h"
#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace {

using plugin_glsl_types::genVec2;

constexpr float kCapStep = 0.19634955f;  // pi / 16
constexpr int kCapPoints = 33;
constexpr float kCapDummyX = -1e10f;  // far outside any frame; never referenced
constexpr GLuint kPosition = shader_ids::kPositionLocation;

uint32_t appendVertex(BorderMesh& mesh, float x, float y, float value) {
  mesh.vertices.push_back(MeshVertex{x, y, value});
  const auto index = static_cast<uint32_t>(mesh.vertices.size() - 1);
  return index;
}

void appendIndexedVertex(BorderMesh& mesh, float x, float y, float value) {
  mesh.indices.push_back(appendVertex(mesh, x, y, value));
}

BorderMesh startMesh(uint32_t mode, bool restart, float dummyX) {
  BorderMesh mesh;
  mesh.mode = mode;
  mesh.restart = restart;
  appendVertex(mesh, dummyX, 0.0f, 0.0f);
  mesh.indices.push_back(0);
  return mesh;
}

std::string lowerCase(const char* text) {
  std::string lower = text != nullptr ? text : "";
  for (char& c : lower) {
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  }
  return lower;
}

const char* glText(GLenum name) { return reinterpret_cast<const char*>(glGetString(name)); }

const void* byteOffset(std::size_t bytes) { return reinterpret_cast<const void*>(bytes); }

void enableMeshPosition() {
  glEnableVertexAttribArray(kPosition);
  glVertexAttribPointer(kPosition, 3, GL_FLOAT, GL_FALSE, sizeof(MeshVertex), byteOffset(0));
}

void drawElements(tagWispAPI* api, WispHost* host, GLenum mode, const uint32_t* indices,
                  std::size_t count) {
  BufferScope elements(api, host, GL_ELEMENT_ARRAY_BUFFER, count * sizeof(uint32_t), indices,
                       GL_DYNAMIC_DRAW);
  glDrawElements(mode, static_cast<GLsizei>(count), GL_UNSIGNED_INT, byteOffset(0));
}

void drawWithRestart(const BorderMesh& mesh, tagWispAPI* api, WispHost* host) {
  const std::size_t count = restartDrawCount(mesh.indices.size(), mesh.mode);
  if (count == 0) return;
  VertexArrayScope scope(api, host, mesh.vertices.data(),
                         mesh.vertices.size() * sizeof(MeshVertex));
  glEnable(GL_PRIMITIVE_RESTART);
  enableMeshPosition();
  drawElements(api, host, mesh.mode, mesh.indices.data(), count);
  glDisableVertexAttribArray(kPosition);
  glFlush();
  glDisable(GL_PRIMITIVE_RESTART);
}

void drawRunByRun(const BorderMesh& mesh, tagWispAPI* api, WispHost* host) {
  VertexArrayScope scope(api, host, mesh.vertices.data(),
                         mesh.vertices.size() * sizeof(MeshVertex));
  enableMeshPosition();
  for (const IndexRun& run : indexRuns(mesh.indices, mesh.mode)) {
    drawElements(api, host, mesh.mode, mesh.indices.data() + run.first, run.count);
  }
  glDisableVertexAttribArray(kPosition);
}

void drawDistanceMesh(WispHost* host, tagWispAPI* api, const float* modelView,
                      const BorderMesh& mesh) {
  auto* registry = static_cast<EffectData*>(api->pluginData);
  const auto* context = static_cast<const WispRenderContext*>(api->renderContext);
  if (registry == nullptr || context == nullptr) return;  // nothing to draw with
  registry->useProgram(programs::kDistanceField);
  registry->setUniformMatrix(registry->uniformLocation(shader_ids::kProjectionMatrix), 4, 1, false,
                             context->projection);
  registry->setUniformMatrix(registry->uniformLocation(shader_ids::kModelViewMatrix), 4, 1, true,
                             modelView);
  drawMesh(mesh, api, host);
  registry->releaseProgram();
}

}  // namespace

std::vector<MeshVertex> makeCapTemplate(float radius) {
  std::vector<MeshVertex> points;
  points.reserve(kCapPoints);
  const float c = std::cos(kCapStep);
  const float s = std::sin(kCapStep);
  MeshVertex point{-radius, 0.0f, 1.0f};
  points.push_back(point);
  for (int k = 1; k < kCapPoints; ++k) {
    point = MeshVertex{c * point.x - s * point.y, s * point.x + c * point.y, point.value};
    points.push_back(point);
  }
  return points;
}

void appendSegmentStrip(BorderMesh& mesh, genVec2 start, genVec2 end, float startValue,
                        float endValue, float startEdgeValue, float endEdgeValue, float radius) {
  const float dx = end.x - start.x;
  const float dy = end.y - start.y;
  const float dv = endValue - startValue;
  if (!(dx * dx + dy * dy + dv * dv > 0.0f)) return;
  // The band's side direction: the segment turned a quarter clockwise.
  const float length = std::sqrt(dx * dx + dy * dy);
  if (!(length > 0.0f)) return;  // values differ along a point: no band to draw
  const float ox = radius * dy / length;
  const float oy = radius * -dx / length;
  appendIndexedVertex(mesh, start.x + ox, start.y + oy, startEdgeValue);
  appendIndexedVertex(mesh, end.x + ox, end.y + oy, endEdgeValue);
  appendIndexedVertex(mesh, start.x, start.y, startValue);
  appendIndexedVertex(mesh, end.x, end.y, endValue);
  appendIndexedVertex(mesh, start.x - ox, start.y - oy, startEdgeValue);
  appendIndexedVertex(mesh, end.x - ox, end.y - oy, endEdgeValue);
  mesh.indices.push_back(0);
}

void appendCapFan(BorderMesh& mesh, genVec2 point, float centreValue, float rimValue,
                  const std::vector<MeshVertex>& capTemplate) {
  appendIndexedVertex(mesh, point.x, point.y, centreValue);
  if (capTemplate.empty()) return;
  const auto firstRim = static_cast<uint32_t>(mesh.vertices.size());
  for (const MeshVertex& rim : capTemplate) {
    appendIndexedVertex(mesh, point.x + rim.x, point.y + rim.y, rimValue);
  }
  mesh.indices.push_back(firstRim);
  mesh.indices.push_back(0);
}

BorderMesh buildCapMesh(const SegmentList& segments, float radius, bool restart) {
  const std::vector<MeshVertex> capTemplate = makeCapTemplate(radius);
  BorderMesh mesh = startMesh(GL_TRIANGLE_FAN, restart, kCapDummyX);
  for (std::size_t i = 0; i < segments.count; ++i) {
    appendCapFan(mesh, segments.start(i), 0.0f, 1.0f, capTemplate);
    appendCapFan(mesh, segments.end(i), 0.0f, 1.0f, capTemplate);
  }
  return mesh;
}

BorderMesh buildStripMesh(const SegmentList& segments, float radius, bool restart) {
  BorderMesh mesh = startMesh(GL_TRIANGLE_STRIP, restart, 0.0f);
  for (std::size_t i = 0; i < segments.count; ++i) {
    appendSegmentStrip(mesh, segments.start(i), segments.end(i), 0.0f, 0.0f, 1.0f, 1.0f, radius);
  }
  return mesh;
}

void drawMesh(const BorderMesh& mesh, tagWispAPI* api, WispHost* host) {
  if (mesh.vertices.empty() || mesh.indices.empty()) return;
  if (mesh.restart) {
    drawWithRestart(mesh, api, host);
    return;
  }
  drawRunByRun(mesh, api, host);
  glFlush();
}

void buildCutCaps(WispHost* host, tagWispAPI* api, const float* modelView,
                  const SegmentList& segments, float radius) {
  const bool restart = restartUsable();
  drawDistanceMesh(host, api, modelView, buildCapMesh(segments, radius, restart));
}

void buildCutStrips(WispHost* host, tagWispAPI* api, const float* modelView,
                    const SegmentList& segments, float radius) {
  const bool restart = restartUsable();
  drawDistanceMesh(host, api, modelView, buildStripMesh(segments, radius, restart));
}

bool isIntelHd4000(const char* vendor, const char* renderer) {
  const std::string v = lowerCase(vendor);
  const std::string r = lowerCase(renderer);
  const auto contains = [](const std::string& text, const char* part) {
    return text.find(part) != std::string::npos;
  };
  const bool intel = contains(v, "intel") || contains(r, "intel");
  const bool model = contains(v, "4000") || contains(r, "4000");
  return intel && model;
}

bool isIntelHd4000() { return isIntelHd4000(glText(GL_VENDOR), glText(GL_RENDERER)); }

bool restartAllowed(bool extensionListed, bool entryPointPresent, const char* vendor,
                    const char* renderer) {
  return extensionListed && entryPointPresent && !isIntelHd4000(vendor, renderer);
}

bool restartUsable() {
  const bool allowed =
      restartAllowed(isExtensionSupported("GL_NV_primitive_restart"),
                     glPrimitiveRestartIndex != nullptr, glText(GL_VENDOR), glText(GL_RENDERER));
  if (allowed) glPrimitiveRestartIndex(0);
  return allowed;
}

}  // namespace veltrane
