// Textured draws on Mesa: the frame quad through the copy program, and the split-screen sample
// stage compared pixel by pixel with a CPU model of its formula.
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "gl/draws.h"
#include "gl/render_target.h"
#include "gl/texture_units.h"
#include "gl/textured_quad.h"
#include "shaders/shader_identifiers.h"
#include "support/gl_host.h"

namespace {

using namespace veltrane;
namespace ids = veltrane::shader_ids;

constexpr int kWidth = 64;
constexpr int kHeight = 36;
// Source texels are linear ramps over the whole allocation, so bilinear sampling reproduces the
// ramp exactly between texel centres and the model needs no filtering of its own; the frame's
// image is its lower-left part.
constexpr int kSourceWidth = 128;
constexpr int kSourceHeight = 64;
float ramp(float coordinate, int size, float step) {
  return step * std::fmin(std::fmax(coordinate * size - 0.5f, 0.0f), size - 1.0f) / 255.0f;
}

class TexturedDraw : public testsupport::GlHostTest {
 protected:
  void SetUp() override {
    GlHostTest::SetUp();
    buildPrograms();
    std::vector<float> texels;
    for (int j = 0; j < kSourceHeight; ++j) {
      for (int i = 0; i < kSourceWidth; ++i)
        texels.insert(texels.end(), {2 * i / 255.0f, 4 * j / 255.0f, 0.5f, 1});
    }
    source_ = makeTexture(kWidth, kHeight, kSourceWidth, kSourceHeight, GL_RGBA8, texels);
  }

  void select(const char* program) {
    const float identity[16] = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
    registry_->useProgram(program);
    registry_->setUniformMatrix(uniform(ids::kProjectionMatrix), 4, 1, false, context_.projection);
    registry_->setUniformMatrix(uniform(ids::kModelViewMatrix), 4, 1, true, identity);
  }
  GLint uniform(const char* name) { return registry_->uniformLocation(name); }

  // Draws the quad with the selected program into a new target and reads it back.
  std::vector<float> drawFrame(const TexturedQuad& quad) {
    RenderTarget target = createRenderTarget(handle(), api(), false);
    attachRenderTarget(target.texture, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
    glClearColor(0, 0, 0, 0);
    glClear(GL_COLOR_BUFFER_BIT);
    drawTexturedVertices(api(), handle(), quad.data(), 4, GL_TRIANGLE_STRIP);
    drawTexturedVertices(api(), handle(), quad.data(), 0, GL_TRIANGLE_STRIP);  // draws nothing
    registry_->releaseProgram();
    return readImage(target.texture);
  }

  TextureRecord source_{};
};

// The frame quad over the image part of the source, drawn through the copy program, reproduces
// that image texel for texel: positions reach attribute 0, texture coordinates attribute 8, and
// the corners sit in strip order. Only the draw of vertices takes a buffer.
TEST_F(TexturedDraw, FrameQuadCopiesTheImagePartExactly) {
  context_.source = source_;
  select("glCopy");
  bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, source_.id, true);
  const std::vector<float> pixels = drawFrame(makeFrameQuad(context_));
  unbindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, true);
  EXPECT_EQ(host().callsTo("AcquireBuffer").size(), 1u);
  EXPECT_TRUE(pixels == readImage(source_)) << "the copy differs from the image";
}

TEST_F(TexturedDraw, SplitScreenSampleMatchesTheModel) {
  const float aspect = static_cast<float>(kWidth) / kHeight;
  const struct {
    const char* label;
    float offsetX, offsetY, rotation, inverseScale, aspect, tint[3];
  } cases[] = {{"identity", 0, 0, 0, 1, 1, {1, 1, 1}},
               {"half size", 0, 0, 0, 2, 1, {1, 1, 1}},
               {"moved and tinted", 0.1f, -0.05f, 0, 1, 1, {0.5f, 1, 0.25f}},
               {"turned and enlarged", 0, 0, 0.7f, 0.8f, aspect, {1, 1, 1}},
               {"quarter turn", 0.05f, 0, -1.5707964f, 1.25f, aspect, {1, 1, 1}}};
  for (const auto& c : cases) {
    SCOPED_TRACE(c.label);
    select("splitScreen");
    bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, source_.id, true);
    registry_->setUniform1i(uniform(ids::kSourceTexture), 0);
    registry_->setUniform2f(uniform(ids::kSourceExtent), source_.s1, source_.t1);
    registry_->setUniform3f(uniform(ids::kTint), c.tint[0], c.tint[1], c.tint[2]);
    registry_->setUniform2f(uniform(ids::kSampleOffset), c.offsetX, c.offsetY);
    registry_->setUniform1f(uniform(ids::kSampleRotation), c.rotation);
    registry_->setUniform1f(uniform(ids::kInverseScale), c.inverseScale);
    registry_->setUniform1f(uniform(ids::kAspectRatio), c.aspect);
    TextureRecord unitSquare{};  // texture coordinates 0..1, as a region covering the frame has
    unitSquare.s1 = unitSquare.t1 = 1.0f;
    const std::vector<float> pixels = drawFrame(makeTextureQuad(unitSquare, kWidth, kHeight));

    int compared = 0, outside = 0;
    for (int y = 0; y < kHeight; ++y) {
      for (int x = 0; x < kWidth; ++x) {
        const float px = ((x + 0.5f) / kWidth - 0.5f + c.offsetX) * c.inverseScale * c.aspect;
        const float py = ((y + 0.5f) / kHeight - 0.5f + c.offsetY) * c.inverseScale;
        const float cr = std::cos(c.rotation), sr = std::sin(c.rotation);
        const float u = (cr * px + sr * py) / c.aspect + 0.5f;
        const float v = -sr * px + cr * py + 0.5f;
        const auto onEdge = [](float w) {
          return std::fabs(w) < 1e-3f || std::fabs(w - 1) < 1e-3f;
        };
        if (onEdge(u) || onEdge(v)) continue;  // either answer is right on the boundary
        const bool inside = u >= 0 && u <= 1 && v >= 0 && v <= 1;
        const float expected[4] = {inside ? ramp(u * source_.s1, kSourceWidth, 2) * c.tint[0] : 0,
                                   inside ? ramp(v * source_.t1, kSourceHeight, 4) * c.tint[1] : 0,
                                   inside ? 0.5f * c.tint[2] : 0, inside ? 1.0f : 0};
        for (int k = 0; k < 4; ++k) {
          // 8-bit output and the source's own rounding of 0.5
          ASSERT_NEAR(pixels[static_cast<size_t>((y * kWidth + x) * 4 + k)], expected[k],
                      1.5f / 255)
              << "pixel " << x << "," << y << " channel " << k;
        }
        ++compared;
        outside += inside ? 0 : 1;
      }
    }
    EXPECT_GT(compared, kWidth * kHeight * 9 / 10);
    if (c.inverseScale == 2) {
      EXPECT_GT(outside, kWidth * kHeight / 2) << "beyond a quarter frame from the centre";
    }
  }
  unbindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, true);
}

}  // namespace
