// Vertex uploads and draw calls through host buffers; every buffer goes back to the host before
// the draw returns.
#include "gl/draws.h"

#include "gl/buffer_scopes.h"
#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace {

constexpr GLuint kPosition = shader_ids::kPositionLocation;
constexpr GLuint kTexCoord = shader_ids::kTexCoordLocation;

std::size_t usableCount(std::size_t count, GLenum mode) {
  if (mode == GL_TRIANGLES) count -= count % 3;
  return count < 3 ? 0 : count;
}

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

}  // namespace

std::size_t restartDrawCount(std::size_t indexCount, GLenum mode) {
  return usableCount(indexCount, mode);
}

std::vector<IndexRun> indexRuns(const std::vector<uint32_t>& indices, GLenum mode) {
  std::vector<IndexRun> runs;
  std::size_t i = 0;
  while (i < indices.size()) {
    if (indices[i] == 0) {
      ++i;
      continue;
    }
    const std::size_t first = i;
    while (i < indices.size() && indices[i] != 0) ++i;
    const std::size_t count = usableCount(i - first, mode);
    if (count > 0) runs.push_back(IndexRun{first, count});
  }
  return runs;
}

void drawTexturedVertices(tagWispAPI* api, WispHost* host, const TexturedVertex* vertices,
                          int count, GLenum mode) {
  if (count <= 0) return;
  VertexArrayScope scope(api, host, vertices,
                         static_cast<std::size_t>(count) * sizeof(TexturedVertex));
  glEnableVertexAttribArray(kPosition);
  glVertexAttribPointer(kPosition, 2, GL_FLOAT, GL_FALSE, sizeof(TexturedVertex), byteOffset(0));
  glEnableVertexAttribArray(kTexCoord);
  glVertexAttribPointer(kTexCoord, 2, GL_FLOAT, GL_FALSE, sizeof(TexturedVertex),
                        byteOffset(2 * sizeof(float)));
  glDrawArrays(mode, 0, count);
  glDisableVertexAttribArray(kPosition);
  glDisableVertexAttribArray(kTexCoord);
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

}  // namespace veltrane
