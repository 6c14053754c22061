// The border distance field drawn from the cap and strip meshes with minimum blending, checked
// against exact distances, with primitive restart (compatibility profile) and without (core).
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <vector>

#include "geometry/border_mesh.h"
#include "gl/render_target.h"
#include "support/gl_host.h"

namespace {

using namespace veltrane;

constexpr int kWidth = 96;
constexpr int kHeight = 64;

struct Segment {
  float x0, y0, x1, y1;
};

float distanceToSegment(float px, float py, const Segment& s) {
  const float dx = s.x1 - s.x0, dy = s.y1 - s.y0;
  const float lengthSquared = dx * dx + dy * dy;
  const float t = lengthSquared > 0
                      ? std::clamp(((px - s.x0) * dx + (py - s.y0) * dy) / lengthSquared, 0.f, 1.f)
                      : 0.0f;
  return std::hypot(px - (s.x0 + t * dx), py - (s.y0 + t * dy));
}

class DistanceField : public testsupport::GlHostTest {
 protected:
  void SetUp() override {}  // each case starts its own host, in the profile it needs

  // The red channel of the field of `segments`, rows from the bottom; `restart` tells whether
  // the context let the meshes use primitive restart.
  std::vector<float> render(refhost::GlProfile profile, const std::vector<Segment>& segments,
                            float radius, bool* restart) {
    if (!startHost(profile, kWidth, kHeight)) return {};
    buildPrograms();
    glPrimitiveRestartIndex(7);
    *restart = restartUsable();
    GLint index = -1;
    glGetIntegerv(GL_PRIMITIVE_RESTART_INDEX, &index);
    EXPECT_EQ(index, *restart ? 0 : 7) << "the restart index is set only when restart is used";

    std::vector<float> records;
    for (const Segment& s : segments)
      records.insert(records.end(), {s.x0, s.y0, 0, 0, s.x1, s.y1, 0, 0});
    const SegmentList list{records.data(), segments.size()};
    const float centring[16] = {1, 0, 0, kWidth / 2.0f, 0, 1, 0, kHeight / 2.0f, 0, 0, 1, 0, 0,
                                0, 0, 1};
    // A float target keeps the comparison free of 8-bit steps.
    RenderTarget target = createRenderTarget(handle(), api(), true);
    attachRenderTarget(target.texture, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
    glClearColor(1, 1, 1, 0);
    glClear(GL_COLOR_BUFFER_BIT);
    glEnable(GL_BLEND);
    glBlendEquation(GL_MIN);
    glBlendFunc(GL_ONE, GL_ONE);
    buildCutCaps(handle(), api(), centring, list, radius);
    buildCutStrips(handle(), api(), centring, list, radius);
    glBlendEquation(GL_FUNC_ADD);
    glDisable(GL_BLEND);
    EXPECT_FALSE(glIsEnabled(GL_PRIMITIVE_RESTART));

    std::vector<float> red;
    const std::vector<float> rgba = readImage(target.texture);
    for (size_t i = 0; i < rgba.size(); i += 4) red.push_back(rgba[i]);
    releaseRenderTarget(target);
    finishHost();
    return red;
  }
};

TEST_F(DistanceField, MatchesExactDistancesWithAndWithoutPrimitiveRestart) {
  const std::vector<Segment> layout = {
      {-40, -20, 30, 10},  // diagonal
      {10, -30, 10, 30},   // vertical, crossing the diagonal
      {-25, 18, -25, 18},  // zero length: a disc from its two caps
  };
  const struct {
    const char* label;
    float radius;
    std::vector<Segment> segments;
  } cases[] = {{"wide border", 6, layout}, {"no border width", 1, layout}, {"no segments", 6, {}}};
  for (const auto& c : cases) {
    SCOPED_TRACE(c.label);
    bool coreRestart = true, compatibilityRestart = false;
    const auto runs = render(refhost::GlProfile::Core, c.segments, c.radius, &coreRestart);
    const auto restarted =
        render(refhost::GlProfile::Compatibility, c.segments, c.radius, &compatibilityRestart);
    EXPECT_FALSE(coreRestart) << "core profiles do not list GL_NV_primitive_restart";
    EXPECT_TRUE(compatibilityRestart);
    ASSERT_EQ(runs.size(), static_cast<size_t>(kWidth * kHeight));
    ASSERT_EQ(restarted.size(), runs.size());

    int compared = 0;
    for (int y = 0; y < kHeight; ++y) {
      for (int x = 0; x < kWidth; ++x) {
        const size_t i = static_cast<size_t>(y * kWidth + x);
        ASSERT_NEAR(restarted[i], runs[i], 1e-6f) << "paths differ at " << x << "," << y;
        float nearest = 1e30f;
        for (const Segment& s : c.segments) {
          nearest = std::min(
              nearest, distanceToSegment(x + 0.5f - kWidth / 2.0f, y + 0.5f - kHeight / 2.0f, s));
        }
        const float expected = std::min(nearest / c.radius, 1.0f);
        // The caps are 32-sided polygons inside their circle: near the rim their linear value
        // runs up to 0.5 % above the true distance, and just inside the circle they may not
        // reach at all. Values up to 0.8 and the far field are exact within 1/255.
        if (expected > 0.8f && expected < 1.0f) continue;
        ASSERT_NEAR(runs[i], expected, 1.0f / 255) << "pixel " << x << "," << y;
        ++compared;
      }
    }
    EXPECT_GT(compared, kWidth * kHeight * 3 / 4);
  }
}

}  // namespace
