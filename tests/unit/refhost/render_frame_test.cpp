// Render contexts as the host builds them for one frame of a composition: the fields the
// plug-in reads, the textures they name, and layers fed by their media.
#include "refhost/render_frame.h"

#include <gtest/gtest.h>

#include "refhost/composition.h"
#include "support/gl_host.h"

namespace refhost {
namespace {

TEST(RenderFrame, MillisecondsFollowTheFrameRate) {
  const struct {
    int32_t frame;
    double rate;
    int32_t ms;
  } cases[] = {{0, 25, 0},     {25, 25, 1000}, {1, 30, 33},  {2, 30, 67},
               {1, 29.97, 33}, {3, 0, 120},    {-1, 25, -39}};
  for (const auto& c : cases)
    EXPECT_EQ(frameToMilliseconds(c.frame, c.rate), c.ms) << c.frame << " at " << c.rate;
}

// Reads a host texture as an upright picture.
RgbaImage uprightPicture(Host& host, uint32_t texture, int32_t width, int32_t height) {
  RgbaImage picture(width, height);
  picture.pixels = flipRows(host.readTexture(texture, width, height), width, height);
  return picture;
}

using RenderFrameWithGl = testsupport::GlHostTest;

TEST_F(RenderFrameWithGl, ContextDescribesTheFrameItsTexturesAndLayers) {
  Composition composition;
  composition.width = 64;
  composition.height = 36;
  composition.frameRate = 30;
  composition.duration = 90;
  composition.pixelAspect = 2.0f;
  composition.source = MediaSpec::ofPattern(Pattern::Counter);
  CompositionLayer counter;
  counter.layer.guid = "aaaaaaaa-0000-4000-8000-000000000001";
  counter.layer.width = 32;
  counter.layer.height = 18;
  counter.media = MediaSpec::ofPattern(Pattern::Counter);
  composition.layers.push_back(counter);
  const InstalledComposition installed = installComposition(host(), composition);
  EXPECT_EQ(installed.sourceFrameCount, 90);
  ASSERT_EQ(host().layers().size(), 2u);  // the own layer first
  EXPECT_EQ(host().layers()[0].guid, kDefaultOwnLayerGuid);
  EXPECT_EQ(host().timeInfo().frameRate, 30.0);

  RenderFrame frame(host(), {64, 36, 30.0, 2.0f, 90, composition.ownLayerGuid}, 45);
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
  for (const TextureRecord* texture : {&c.source, &c.output, &c.second}) {
    EXPECT_NE(texture->id, 0u);
    EXPECT_EQ(texture->imageWidth, 64);
    EXPECT_EQ(texture->t1, 1.0f);
  }
  EXPECT_EQ(readCounterCode(uprightPicture(host(), c.source.id, 64, 36)), 45);

  TextureRecord layer{};
  ASSERT_EQ(api()->RenderLayerFrame(handle(), nullptr, counter.layer.guid.c_str(), 7, &layer), 0);
  EXPECT_EQ(layer.imageWidth, 32);
  EXPECT_EQ(readCounterCode(uprightPicture(host(), layer.id, 32, 18)), 7);
  api()->ReleaseTexture(handle(), nullptr, layer.id);
}

}  // namespace
}  // namespace refhost
