// Textured vertex draws through host buffers, and the index runs every mesh draw splits into;
// every buffer goes back to the host before the draw returns.
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

}  // namespace veltrane
