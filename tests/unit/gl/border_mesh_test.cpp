// Border meshes, the run split of the mesh draw and the primitive-restart decision, without GL.
#include "geometry/border_mesh.h"

#include <GL/glew.h>
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "gl/draws.h"
#include "gl/extensions.h"

namespace {

using namespace veltrane;

std::vector<float> segmentRecords(const std::vector<std::vector<float>>& points) {
  std::vector<float> records;
  for (const auto& p : points) records.insert(records.end(), {p[0], p[1], 0, 0, p[2], p[3], 0, 0});
  return records;
}

// The field's exact values, the band's among them, are checked on GL; here what a draw cannot
// show: the separators of the band and the closing of each cap's rim on itself.
TEST(BorderMesh, HorizontalSegmentGivesItsBandAndTwoCaps) {
  const std::vector<float> records = segmentRecords({{-10, 0, 10, 0}});
  const SegmentList segments{records.data(), 1};

  const BorderMesh strip = buildStripMesh(segments, 3.0f, false);
  EXPECT_EQ(strip.mode, static_cast<uint32_t>(GL_TRIANGLE_STRIP));
  EXPECT_EQ(strip.indices, (std::vector<uint32_t>{0, 1, 2, 3, 4, 5, 6, 0}));

  const BorderMesh caps = buildCapMesh(segments, 3.0f, true);
  EXPECT_EQ(caps.mode, static_cast<uint32_t>(GL_TRIANGLE_FAN));
  EXPECT_TRUE(caps.restart);
  EXPECT_FLOAT_EQ(caps.vertices[0].x, -1e10f);
  EXPECT_FLOAT_EQ(caps.vertices[1].x, -10);  // the first fan's centre, then its rim from -x
  EXPECT_FLOAT_EQ(caps.vertices[2].x, -13);
  EXPECT_NEAR(caps.vertices[34].x, -13.0f, 1e-5f) << "the rim closes on itself";
  EXPECT_NEAR(caps.vertices[34].y, 0.0f, 1e-5f);
  EXPECT_FLOAT_EQ(caps.vertices[35].x, 10) << "the end point's fan follows";
  std::vector<uint32_t> firstFan = {0};
  for (uint32_t i = 1; i <= 34; ++i) firstFan.push_back(i);
  firstFan.insert(firstFan.end(), {2, 0, 35});
  EXPECT_EQ(std::vector<uint32_t>(caps.indices.begin(), caps.indices.begin() + 38), firstFan);
  EXPECT_EQ(caps.indices.back(), 0u);
}

TEST(BorderMesh, SizesGrowBySegmentAndZeroLengthSegmentsKeepOnlyTheirCaps) {
  struct Case {
    std::vector<std::vector<float>> segments;
    size_t stripVertices, stripIndices, capVertices, capIndices;
  };
  const Case cases[] = {
      {{}, 1, 1, 1, 1},
      {{{5, 5, 5, 5}}, 1, 1, 69, 73},
      {{{0, 0, 1, 0}, {3, 3, 3, 3}}, 7, 8, 137, 145},
      {{{0, 0, 0.01f, 0}}, 7, 8, 69, 73},  // however short, a segment has its band
  };
  for (const Case& c : cases) {
    const std::vector<float> records = segmentRecords(c.segments);
    const SegmentList segments{records.data(), c.segments.size()};
    const BorderMesh strip = buildStripMesh(segments, 2.0f, false);
    const BorderMesh caps = buildCapMesh(segments, 2.0f, false);
    EXPECT_EQ(strip.vertices.size(), c.stripVertices) << c.segments.size();
    EXPECT_EQ(strip.indices.size(), c.stripIndices);
    EXPECT_EQ(caps.vertices.size(), c.capVertices);
    EXPECT_EQ(caps.indices.size(), c.capIndices);
    for (const MeshVertex& v : strip.vertices) EXPECT_TRUE(std::isfinite(v.x + v.y + v.value));
  }
  // A point whose value changes has no direction to build a band across: nothing is added.
  BorderMesh mesh;
  appendSegmentStrip(mesh, {1, 1}, {1, 1}, 0.0f, 1.0f, 1.0f, 1.0f, 2.0f);
  EXPECT_TRUE(mesh.vertices.empty());
  EXPECT_TRUE(mesh.indices.empty());
  // Without a template a fan is just its centre, with no separator.
  appendCapFan(mesh, {2, 3}, 0.5f, 1.0f, {});
  EXPECT_EQ(mesh.vertices.size(), 1u);
  EXPECT_EQ(mesh.indices, std::vector<uint32_t>{0});
}

TEST(PrimitiveRestartDecision, IntelHd4000IsRecognisedFromVendorOrRenderer) {
  const struct {
    const char* vendor;
    const char* renderer;
    bool hd4000;
  } cases[] = {
      {"INTEL CORPORATION", "hd 4000", true},
      {"Intel Open Source Technology Center", "Mesa DRI Intel(R) Ivybridge Desktop", false},
      {nullptr, "Intel HD Graphics 4000", true},
      {"Intel", nullptr, false},
      {"NVIDIA Corporation", "GeForce 4000", false},
      {"Mesa", "llvmpipe (LLVM 15.0.6, 256 bits)", false},
      {nullptr, nullptr, false}};
  for (const auto& c : cases) {
    EXPECT_EQ(isIntelHd4000(c.vendor, c.renderer), c.hd4000)
        << (c.vendor ? c.vendor : "(none)") << " / " << (c.renderer ? c.renderer : "(none)");
  }
}

TEST(ExtensionList, VersionDecidesWhichListIsSearched) {
  const std::vector<const char*> indexed = {"GL_ARB_one", "GL_NV_primitive_restart_extra",
                                            "GL_ARB_two"};
  const char* joined = "GL_ARB_one GL_NV_primitive_restart_extra GL_NV_primitive_restart";
  const struct {
    const char* version;
    int count;
    const char* spaceSeparated;
    const char* name;
    bool found;
  } cases[] = {{"2.1 Mesa", 0, joined, "GL_NV_primitive_restart", true},
               {"2.1", 0, joined, "GL_NV_primitive", false},
               {"2.1", 0, nullptr, "GL_ARB_one", false},
               {nullptr, 0, joined, "GL_ARB_one", true},
               {"4.1 Core", 3, joined, "GL_NV_primitive_restart", false},
               {"4.1 Core", 3, joined, "GL_ARB_two", true},
               {"4.1 Core", 0, joined, "GL_ARB_one", false},
               {"3.0", 2, joined, "GL_ARB_two", false}};
  for (const auto& c : cases) {
    bool joinedRead = false;
    ExtensionQueries queries;
    queries.version = [&] { return c.version; };
    queries.count = [&] { return c.count; };
    queries.indexed = [&](int i) { return indexed.at(static_cast<size_t>(i)); };
    queries.spaceSeparated = [&] {
      joinedRead = true;
      return c.spaceSeparated;
    };
    EXPECT_EQ(isExtensionListed(c.name, queries), c.found)
        << (c.version ? c.version : "(no version)") << " " << c.name;
    // From GL 3 on, the joined list is an error to ask for in a core profile.
    const bool modern = c.version != nullptr && c.version[0] >= '3';
    EXPECT_EQ(joinedRead, !modern);
  }
}

}  // namespace
