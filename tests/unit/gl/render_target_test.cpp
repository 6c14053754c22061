// Render targets on Mesa through the reference host: the texture each asks for follows the
// host's texture format mode.
#include "gl/render_target.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

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
      {7, true, GL_RGBA16F, GL_FLOAT, 0, 0, 1, "0 0 0x881A 0x1908 0x1401 null"}};
  for (const auto& c : cases) {
    SCOPED_TRACE(testing::Message() << "mode " << c.mode << " float " << c.floatFormat);
    host_->clearCallLog();
    host().setTextureFormatMode(c.mode);
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

}  // namespace
