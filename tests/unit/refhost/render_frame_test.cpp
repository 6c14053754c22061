// Render contexts as the host builds them for one frame of a composition: the fields the
// plug-in reads, the textures they name, and pictures that come back upright.
#include "refhost/render_frame.h"

#include <GL/glew.h>
#include <gtest/gtest.h>

#include "refhost/composition.h"
#include "support/gl_host.h"

namespace refhost {
namespace {

std::array<float, 4> transform(const Matrix4& m, float x, float y) {
  std::array<float, 4> out{};
  const float in[4] = {x, y, 0, 1};
  for (int row = 0; row < 4; ++row) {
    for (int k = 0; k < 4; ++k) out[row] += m[4 * k + row] * in[k];  // column-major
  }
  return out;
}

TEST(RenderFrame, PixelProjectionMapsTheFrameOntoClipSpace) {
  Matrix4 projection = pixelProjection(64, 36);
  struct Case {
    float x, y, clipX, clipY;
  };
  for (const Case& c :
       {Case{0, 0, -1, -1}, Case{64, 36, 1, 1}, Case{32, 18, 0, 0}, Case{16, 27, -0.5f, 0.5f}}) {
    std::array<float, 4> clip = transform(projection, c.x, c.y);
    EXPECT_FLOAT_EQ(clip[0], c.clipX) << c.x << "," << c.y;
    EXPECT_FLOAT_EQ(clip[1], c.clipY) << c.x << "," << c.y;
    EXPECT_FLOAT_EQ(clip[3], 1.0f);
  }
}

TEST(RenderFrame, MillisecondsFollowTheFrameRate) {
  struct Case {
    int32_t frame;
    double rate;
    int32_t ms;
  };
  for (const Case& c : {Case{0, 25, 0}, Case{25, 25, 1000}, Case{1, 30, 33}, Case{2, 30, 67},
                        Case{1, 29.97, 33}, Case{3, 0, 120}, Case{-1, 25, -39}}) {
    EXPECT_EQ(frameToMilliseconds(c.frame, c.rate), c.ms) << c.frame << " at " << c.rate;
  }
}

using RenderFrameWithGl = testsupport::GlHostTest;

TEST_F(RenderFrameWithGl, ContextDescribesTheFrameAndItsTextures) {
  Composition composition;
  composition.width = 64;
  composition.height = 36;
  composition.frameRate = 30;
  composition.duration = 90;
  composition.pixelAspect = 2.0f;
  composition.source = MediaSpec::ofPattern(Pattern::Counter);
  InstalledComposition installed = installComposition(host(), composition);
  EXPECT_EQ(installed.sourceFrameCount, 90);
  ASSERT_EQ(host().layers().size(), 1u);  // the own layer
  EXPECT_EQ(host().layers()[0].guid, kDefaultOwnLayerGuid);
  EXPECT_EQ(host().timeInfo().frameRate, 30.0);

  FrameSettings settings{64, 36, 30.0, 2.0f, 90, composition.ownLayerGuid};
  RenderFrame frame(host(), settings, 45);
  const WispRenderContext& c = frame.context();
  EXPECT_EQ(c.time, 45);
  EXPECT_EQ(c.frameNumber, 45u);
  EXPECT_EQ(c.sourceFrameIndex, 45);
  EXPECT_EQ(c.sourceFrameCount, 90);
  EXPECT_EQ(c.currentTimeMs, 1500);
  EXPECT_EQ(c.layerTimeMs, 1500);
  EXPECT_EQ(c.pixelAspect, 2.0f);
  EXPECT_EQ(c.hasPixelAspect, 1);
  EXPECT_STREQ(c.ownLayerGuid, kDefaultOwnLayerGuid);
  EXPECT_EQ(c.modelView[0] + c.modelView[5] + c.modelView[10] + c.modelView[15], 4.0f);
  for (const TextureRecord* texture : {&c.source, &c.output, &c.second}) {
    EXPECT_NE(texture->id, 0u);
    EXPECT_EQ(texture->imageWidth, 64);
    EXPECT_EQ(texture->imageHeight, 36);
    EXPECT_EQ(texture->s1, 1.0f);
    EXPECT_EQ(texture->t1, 1.0f);
  }
  EXPECT_EQ(host().outstandingTextures(), 0);  // the host's, not the plug-in's

  RgbaImage source;
  source.width = 64;
  source.height = 36;
  source.pixels = flipRows(host().readTexture(c.source.id, 64, 36), 64, 36);
  EXPECT_EQ(readCounterCode(source), 45);
}

// What the plug-in leaves in the output texture comes back with the frame's top edge first.
TEST_F(RenderFrameWithGl, OutputReadsBackUpright) {
  host().setSourceFrames(frameSourceOf(openMediaSource(MediaSpec::ofPattern(Pattern::Gradient))));
  FrameSettings settings{64, 36, 25.0, 1.0f, 1, kDefaultOwnLayerGuid};
  RenderFrame frame(host(), settings, 0);
  const WispRenderContext& c = frame.context();
  glCopyImageSubData(c.source.id, GL_TEXTURE_2D, 0, 0, 0, 0, c.output.id, GL_TEXTURE_2D, 0, 0, 0, 0,
                     64, 36, 1);
  RgbaImage output = frame.readOutput();
  EXPECT_EQ(output.pixels, generatePattern(Pattern::Gradient, 0, 64, 36).pixels);
  EXPECT_EQ(output.pixel(0, 0), (Rgba8{0, 255, 128, 255}));  // top left: green is full at the top
}

TEST_F(RenderFrameWithGl, LayersComeFromTheirMedia) {
  Composition composition;
  composition.width = 64;
  composition.height = 36;
  composition.duration = 10;
  CompositionLayer counter;
  counter.layer.guid = "aaaaaaaa-0000-4000-8000-000000000001";
  counter.layer.name = "Counter";
  counter.layer.width = 32;
  counter.layer.height = 18;
  counter.media = MediaSpec::ofPattern(Pattern::Counter);
  composition.layers.push_back(counter);
  installComposition(host(), composition);
  ASSERT_EQ(host().layers().size(), 2u);
  EXPECT_EQ(host().layers()[1].name, "Counter");

  TextureRecord texture{};
  ASSERT_EQ(host().api().RenderLayerFrame(host().handle(), nullptr, counter.layer.guid.c_str(), 7,
                                          &texture),
            0);
  EXPECT_EQ(texture.imageWidth, 32);
  RgbaImage picture;
  picture.width = 32;
  picture.height = 18;
  picture.pixels = flipRows(host().readTexture(texture.id, 32, 18), 32, 18);
  EXPECT_EQ(readCounterCode(picture), 7);
  host().api().ReleaseTexture(host().handle(), nullptr, texture.id);
}

}  // namespace
}  // namespace refhost
