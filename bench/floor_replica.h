// The lower bound for a frame render: the effect's passes drawn by bare GL in the current
// context, with no host operations and no module, so a benchmark can show what the host adds.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

namespace veltrane_bench {

// What the passes cover: the frame, how many region draws share it, and the cut segments the
// border follows (frame space: origin at the centre, y up).
struct FloorLayout {
  int32_t width = 0;
  int32_t height = 0;
  int regions = 1;
  std::vector<std::array<float, 4>> segments;  // x0, y0, x1, y1
  float borderRadius = 1;
};

// The border segments of Local cuts through the positions (inside the frame) along the
// directions (degrees, 0 along +y, 90 along +x), clipped as the effect clips them.
std::vector<std::array<float, 4>> cutSegments(int32_t width, int32_t height,
                                              const std::vector<std::array<float, 2>>& positions,
                                              const std::vector<float>& directions);

// Owns its programs, two targets of the frame's size, a framebuffer and static vertex data; one
// render() makes the effect's GL calls for a frame whose every input is its own source: the
// source copied into the composition, one draw per region, the distance field with MIN
// blending, the combine into the output, with the effect's state changes in between. Left out
// are the host operations: parameter reads, texture and buffer requests (the vertices are
// uploaded once) and frame fetches.
class FloorReplica {
 public:
  // Needs a current GL context; `source` and `output` are RGBA textures of the layout's size.
  FloorReplica(const FloorLayout& layout, uint32_t source, uint32_t output);
  ~FloorReplica();
  FloorReplica(const FloorReplica&) = delete;
  FloorReplica& operator=(const FloorReplica&) = delete;

  void render();

 private:
  struct Program {
    uint32_t id = 0;
    int32_t projection = -1, modelView = -1;
  };
  void drawComposition();
  void drawDistance();
  void drawCombine();
  void setMatrices(const Program& program, const float* modelView, bool transpose) const;

  FloorLayout layout_;
  uint32_t source_, output_;
  uint32_t composition_ = 0, distance_ = 0, framebuffer_ = 0;
  uint32_t vertexArray_ = 0, texturedBuffer_ = 0, meshBuffer_ = 0;
  Program split_, field_, combine_;
  int32_t regionFirst_ = 0;
  std::array<float, 16> projection_{};
};

}  // namespace veltrane_bench
