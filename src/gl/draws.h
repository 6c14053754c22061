// The draws every pass uses: textured vertices as one array draw, and the rules by which an
// index array whose primitives are separated by index 0 is drawn with restart or run by run.
#pragma once

#include <GL/glew.h>

#include <cstddef>
#include <cstdint>
#include <vector>

#include "gl/textured_quad.h"
#include "host/wisp_api.h"

namespace veltrane {

// Uploads `count` vertices into a host buffer and draws them as `mode`: position to attribute 0,
// texture coordinate to attribute 8.
void drawTexturedVertices(tagWispAPI* api, WispHost* host, const TexturedVertex* vertices,
                          int count, GLenum mode);

// A stretch of the index array drawn as one primitive.
struct IndexRun {
  std::size_t first = 0;
  std::size_t count = 0;
};

// The maximal runs of non-zero indices, each shortened to a whole number of triangles for
// GL_TRIANGLES and dropped when it holds fewer than 3 indices: exactly the primitives a restart
// draw of the same array would make.
std::vector<IndexRun> indexRuns(const std::vector<uint32_t>& indices, GLenum mode);

// How many indices a restart draw of `indexCount` indices hands to GL (0: no draw).
std::size_t restartDrawCount(std::size_t indexCount, GLenum mode);

}  // namespace veltrane
