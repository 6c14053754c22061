// The host's texture pool: textures given back are handed out again for the same size and
// format, as new ones would be, while the resource accounting stays exactly as without it.
#include <GL/glew.h>
#include <gtest/gtest.h>

#include "gl_host_test.h"

namespace refhost {
namespace {

using TexturePoolHost = GlHostTest;

TEST_F(TexturePoolHost, ReusesTexturesBySizeAndFormatWithFreshSampling) {
  tagWispAPI& api = host.api();
  auto allocate = [&](int32_t width, uint32_t format) {
    int32_t w = 0, h = 0;
    return api.AllocateTexture(host.handle(), nullptr, width, 8, format, GL_RGBA, GL_UNSIGNED_BYTE,
                               nullptr, &w, &h);
  };
  uint32_t first = allocate(16, GL_RGBA);
  glBindTexture(GL_TEXTURE_2D, first);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);  // as a plug-in may leave it
  glBindTexture(GL_TEXTURE_2D, 0);
  api.ReleaseTexture(host.handle(), nullptr, first);
  glFinish();  // the fence of the texture given back is passed

  const std::size_t created = host.texturePool().created();
  uint32_t again = allocate(16, GL_RGBA);
  EXPECT_EQ(again, first);
  EXPECT_EQ(host.texturePool().created(), created);
  GLint filter = 0;
  glBindTexture(GL_TEXTURE_2D, again);
  glGetTexParameteriv(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, &filter);
  EXPECT_EQ(filter, GL_LINEAR);
  // Another size or format is another texture; the one held is not handed out twice.
  EXPECT_NE(allocate(16, GL_RGBA16F), first);
  EXPECT_NE(allocate(32, GL_RGBA), first);
  EXPECT_NE(allocate(16, GL_RGBA), first);
  EXPECT_EQ(host.outstandingTextures(), 4);

  // Host textures share the pool: uploads land in a reused texture intact.
  const std::vector<uint8_t> pixels(16 * 8 * 4, 77);
  host.deleteTexture(host.createTexture(16, 8).id);
  glFinish();
  TextureRecord uploaded = host.createTexture(16, 8, pixels.data());
  EXPECT_EQ(host.readTexture(uploaded.id, 16, 8), pixels);
  api.ReleaseTexture(host.handle(), nullptr, uploaded.id);  // not the plug-in's to give back
  EXPECT_EQ(host.problems().size(), 1u);
  EXPECT_EQ(host.outstandingTextures(), 4);
}

}  // namespace
}  // namespace refhost
