// Render targets and the textured draw on Mesa through the reference host.
#include <gtest/gtest.h>

#include <algorithm>
#include <vector>

#include "gl/draws.h"
#include "gl/render_target.h"
#include "gl/texture_units.h"
#include "gl/textured_quad.h"
#include "shaders/shader_identifiers.h"
#include "support/gl_host.h"

namespace {

using namespace veltrane;

using RenderTargets = testsupport::GlHostTest;

TEST_F(RenderTargets, TemplateFollowsTheTextureFormatMode) {
  context_.output.scaleX = 2.0f;
  context_.second.format = GL_RGBA8;
  context_.second.pixelType = GL_UNSIGNED_SHORT;
  context_.second.imageWidth = 40;
  context_.second.imageHeight = 20;
  const struct {
    uint32_t mode;
    bool floatFormat;
    uint32_t format, pixelType;
    int width, height;
    float scaleX;
    const char* allocation;  // as the host logs it: size, formats, type, data
  } cases[] = {
      {0, false, GL_RGBA, GL_UNSIGNED_BYTE, 64, 36, 2, "64 36 0x1908 0x1908 0x1401 null"},
      {0, true, GL_RGBA16F, GL_UNSIGNED_BYTE, 64, 36, 2, "64 36 0x881A 0x1908 0x1401 null"},
      {2, true, GL_RGBA8, GL_UNSIGNED_SHORT, 40, 20, 0, "40 20 0x8058 0x1908 0x1401 null"},
      {1, false, GL_RGBA, GL_FLOAT, 0, 0, 1, "0 0 0x1908 0x1908 0x1401 null"},
      {7, true, GL_RGBA16F, GL_FLOAT, 0, 0, 1, "0 0 0x881A 0x1908 0x1401 null"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(testing::Message() << "mode " << c.mode << " float " << c.floatFormat);
    host_->clearCallLog();
    api()->textureFormatMode = c.mode;
    RenderTarget target = createRenderTarget(handle(), api(), c.floatFormat);
    EXPECT_EQ(host_->callsTo("AllocateTexture"),
              std::vector<std::string>{std::string("AllocateTexture ") + c.allocation});
    EXPECT_TRUE(target.owned);
    EXPECT_EQ(target.texture.format, c.format);
    EXPECT_EQ(target.texture.pixelType, c.pixelType);
    EXPECT_EQ(target.texture.imageWidth, c.width);
    EXPECT_EQ(target.texture.imageHeight, c.height);
    EXPECT_EQ(target.texture.allocatedWidth, c.width) << "this host allocates exact sizes";
    EXPECT_FLOAT_EQ(target.texture.s1, c.width ? 1.0f : 0.0f);
    EXPECT_FLOAT_EQ(target.texture.scaleX, c.scaleX);
  }  // each target gives its texture back as it goes
}

using TexturedDraw = testsupport::GlHostTest;

// The frame quad over the image part of a larger source texture, drawn through the copy
// program, reproduces that image texel for texel: positions reach attribute 0, texture
// coordinates attribute 8, and the corners sit in strip order.
TEST_F(TexturedDraw, FrameQuadCopiesTheImagePartExactly) {
  buildPrograms();
  std::vector<float> texels;
  for (int y = 0; y < 64; ++y) {
    for (int x = 0; x < 128; ++x)
      texels.insert(texels.end(), {x / 255.f, y / 255.f, (x * 7 + y * 3) % 256 / 255.f, 1});
  }
  context_.source = makeTexture(64, 36, 128, 64, GL_RGBA8, texels);
  RenderTarget target = createRenderTarget(handle(), api(), false);
  attachRenderTarget(target.texture, 0, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D);
  registry_->useProgram("glCopy");
  const float identity[16] = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
  registry_->setUniformMatrix(registry_->uniformLocation(shader_ids::kProjectionMatrix), 4, 1,
                              false, context_.projection);
  registry_->setUniformMatrix(registry_->uniformLocation(shader_ids::kModelViewMatrix), 4, 1, true,
                              identity);
  bindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, context_.source.id, true);
  const TexturedQuad quad = makeFrameQuad(context_);
  drawTexturedVertices(api(), handle(), quad.data(), 4, GL_TRIANGLE_STRIP);
  drawTexturedVertices(api(), handle(), quad.data(), 0, GL_TRIANGLE_STRIP);  // draws nothing
  unbindTextureUnit(GL_TEXTURE0, GL_TEXTURE_2D, true);
  registry_->releaseProgram();
  EXPECT_EQ(host_->callsTo("AcquireBuffer").size(), 1u);

  const std::vector<float> pixels = readImage(target.texture);
  for (int y = 0; y < 36; ++y) {
    for (int x = 0; x < 64; ++x) {
      for (int k = 0; k < 4; ++k) {
        ASSERT_FLOAT_EQ(pixels[static_cast<size_t>((y * 64 + x) * 4 + k)],
                        texels[static_cast<size_t>((y * 128 + x) * 4 + k)])
            << x << "," << y << " channel " << k;
      }
    }
  }
}

}  // namespace
