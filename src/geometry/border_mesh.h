// Meshes whose rasterised value is the distance to the cut segments over the border radius: a
// flat band along every segment and a round cap at each end. Drawn with minimum blending they
// leave each pixel its distance to the nearest segment (capped at 1), the border's field.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "common/glsl_types.h"
#include "host/wisp_api.h"

namespace veltrane {

// x, y in frame space; value = distance to the segment / radius.
struct MeshVertex {
  float x = 0.0f;
  float y = 0.0f;
  float value = 0.0f;
};

// Vertex 0 is a dummy no primitive uses, and index 0 ends every strip or fan, so the mesh can be
// drawn with primitive restart (index 0) or run by run with the same result.
struct BorderMesh {
  std::vector<MeshVertex> vertices;
  std::vector<uint32_t> indices;
  uint32_t mode = 0;  // GL_TRIANGLES, GL_TRIANGLE_STRIP or GL_TRIANGLE_FAN
  bool restart = false;
};

// 33 points on the circle of `radius` about the origin, starting at (-radius, 0) and turning by
// pi/16 each step; the last meets the first again, closing a 32-sided rim.
std::vector<MeshVertex> makeCapTemplate(float radius);

// Appends the band of half-width `radius` along start-end as a 6-vertex strip and a separator;
// the values run from the centre values on the segment to the edge values on its sides. Adds
// nothing for a segment of no length.
void appendSegmentStrip(BorderMesh& mesh, plugin_glsl_types::genVec2 start,
                        plugin_glsl_types::genVec2 end, float startValue, float endValue,
                        float startEdgeValue, float endEdgeValue, float radius);

// Appends a fan about `point`: its centre with `centreValue`, the template's rim moved to the
// point with `rimValue`, the first rim vertex again to close it, then a separator.
void appendCapFan(BorderMesh& mesh, plugin_glsl_types::genVec2 point, float centreValue,
                  float rimValue, const std::vector<MeshVertex>& capTemplate);

// The cut segments as the render lays them out: `count` records of eight floats each, start x,
// start y, 0, 0, end x, end y, 0, 0, in frame space.
struct SegmentList {
  const float* data = nullptr;
  std::size_t count = 0;

  plugin_glsl_types::genVec2 start(std::size_t i) const { return {data[8 * i], data[8 * i + 1]}; }
  plugin_glsl_types::genVec2 end(std::size_t i) const { return {data[8 * i + 4], data[8 * i + 5]}; }
};

// The two meshes of a segment list, built without touching GL.
BorderMesh buildCapMesh(const SegmentList& segments, float radius, bool restart);
BorderMesh buildStripMesh(const SegmentList& segments, float radius, bool restart);

// Draws the mesh's primitives (vertex value to attribute 0 as the z of a 3-float position):
// one indexed draw with restart index 0 when `mesh.restart`, else one draw per run.
void drawMesh(const BorderMesh& mesh, tagWispAPI* api, WispHost* host);

// Build the cap (respectively strip) mesh and draw it with the "distanceField" program: the
// host's projection as it comes, `modelView` (row by row) transposed.
void buildCutCaps(WispHost* host, tagWispAPI* api, const float* modelView,
                  const SegmentList& segments, float radius);
void buildCutStrips(WispHost* host, tagWispAPI* api, const float* modelView,
                    const SegmentList& segments, float radius);

// True when GL primitive restart can be used; it then sets the restart index to 0.
bool restartUsable();
// The decision alone: the extension is listed, the entry point exists and the chip is not the
// one whose restart is unreliable.
bool restartAllowed(bool extensionListed, bool entryPointPresent, const char* vendor,
                    const char* renderer);

// Whether the current GL context runs on an Intel HD Graphics 4000.
bool isIntelHd4000();
// The same test on given vendor and renderer strings (null counts as empty).
bool isIntelHd4000(const char* vendor, const char* renderer);

}  // namespace veltrane
