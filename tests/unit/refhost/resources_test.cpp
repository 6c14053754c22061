// Host resources with a real GL context: textures, buffers and the vertex array and their
// accounting, the texture pool, frame fetches and layer queries, with refusals.
#include <GL/glew.h>
#include <gtest/gtest.h>

#include <cstring>

#include "refhost/pipeline/frame_readback.h"
#include "support/gl_host.h"

namespace refhost {
namespace {

const char* const kClip = "11111111-2222-3333-4444-555555555555";

using HostResources = testsupport::GlHostTest;

// The sizes and formats of the textures show in the module's render targets and renders; here
// that the plug-in's binding stays, the count, and what a stray release is.
TEST_F(HostResources, TexturesAreCountedAndLeaveBindingsAlone) {
  const TextureRecord mine = host().createTexture(4, 4);
  glActiveTexture(GL_TEXTURE0);
  glBindTexture(GL_TEXTURE_2D, mine.id);
  std::vector<uint32_t> ids;
  for (int32_t size : {64, 1, 0, 320}) {
    int32_t width = -1, height = -1;
    ids.push_back(api()->AllocateTexture(handle(), nullptr, size, size, GL_RGBA, GL_RGBA,
                                         GL_UNSIGNED_BYTE, nullptr, &width, &height));
    EXPECT_NE(ids.back(), 0u);
    EXPECT_EQ(width, size);
    GLint bound = 0;
    glGetIntegerv(GL_TEXTURE_BINDING_2D, &bound);
    EXPECT_EQ(static_cast<uint32_t>(bound), mine.id) << "the plug-in's binding stays";
  }
  EXPECT_EQ(host().outstandingTextures(), 4);
  api()->ReleaseTexture(handle(), nullptr, ids[1]);
  EXPECT_EQ(host().outstandingTextures(), 3);
  EXPECT_TRUE(host().problems().empty());

  // An impossible size is refused with id 0 and nothing to give back; a texture released twice,
  // id 0 and one of the host's own are not the plug-in's to give back.
  int32_t width = -1, height = -1;
  EXPECT_EQ(api()->AllocateTexture(handle(), nullptr, -4, 10, GL_RGBA, GL_RGBA, GL_UNSIGNED_BYTE,
                                   nullptr, &width, &height),
            0u);
  EXPECT_EQ(width, 0);
  for (uint32_t id : {ids[0], ids[2], ids[3]}) api()->ReleaseTexture(handle(), nullptr, id);
  for (uint32_t id : {ids[1], 0u, mine.id}) api()->ReleaseTexture(handle(), nullptr, id);
  EXPECT_EQ(host().outstandingTextures(), 0);
  EXPECT_EQ(host().problems().size(), 4u);
  host().clearProblems();
  host().deleteTexture(mine.id);
}

// The texture pool: textures given back are handed out again for the same size and format, as
// new ones would be.
TEST_F(HostResources, GivenBackTexturesAreReusedBySizeAndFormatWithFreshSampling) {
  auto allocate = [&](int32_t width, uint32_t format) {
    int32_t w = 0, h = 0;
    return api()->AllocateTexture(handle(), nullptr, width, 8, format, GL_RGBA, GL_UNSIGNED_BYTE,
                                  nullptr, &w, &h);
  };
  const uint32_t first = allocate(16, GL_RGBA);
  glBindTexture(GL_TEXTURE_2D, first);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);  // as a plug-in may leave it
  glBindTexture(GL_TEXTURE_2D, 0);
  api()->ReleaseTexture(handle(), nullptr, first);
  glFinish();  // the fence of the texture given back is passed

  const std::size_t created = host().texturePool().created();
  const uint32_t again = allocate(16, GL_RGBA);
  EXPECT_EQ(again, first);
  EXPECT_EQ(host().texturePool().created(), created);
  GLint filter = 0;
  glBindTexture(GL_TEXTURE_2D, again);
  glGetTexParameteriv(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, &filter);
  EXPECT_EQ(filter, GL_LINEAR);
  // Another size or format is another texture, and the one held is not handed out twice.
  for (uint32_t other : {allocate(16, GL_RGBA16F), allocate(32, GL_RGBA), allocate(16, GL_RGBA)}) {
    EXPECT_NE(other, again);
    api()->ReleaseTexture(handle(), nullptr, other);
  }
  api()->ReleaseTexture(handle(), nullptr, again);
}

// What buffers hold and how they are bound shows in every draw of the module; here the one
// vertex array, the log line and the count.
TEST_F(HostResources, BuffersAreCountedUnderOneVertexArray) {
  const uint32_t vertexArray = api()->CreateVertexArray(handle());
  EXPECT_NE(vertexArray, 0u);
  EXPECT_EQ(api()->CreateVertexArray(handle()), vertexArray);  // one per host, reused
  glBindVertexArray(vertexArray);
  uint32_t hostOutput = 0;
  const uint32_t buffer =
      api()->AcquireBuffer(handle(), GL_ARRAY_BUFFER, 32, nullptr, GL_DYNAMIC_DRAW, &hostOutput);
  const uint32_t indices = api()->AcquireBuffer(handle(), GL_ELEMENT_ARRAY_BUFFER, 12, nullptr,
                                                GL_DYNAMIC_DRAW, nullptr);
  EXPECT_NE(buffer, 0u);
  EXPECT_EQ(host().callsTo("AcquireBuffer")[0], "AcquireBuffer 0x8892 32 null 0x88E8");
  EXPECT_EQ(host().outstandingBuffers(), 2);
  api()->ReleaseBuffer(handle(), buffer);
  api()->ReleaseBuffer(handle(), indices);
  api()->ReleaseBuffer(handle(), indices);
  glBindVertexArray(0);
  EXPECT_EQ(host().outstandingBuffers(), 0);
  EXPECT_EQ(host().problems().size(), 1u);
  host().clearProblems();
}

TEST_F(HostResources, FramesCarryTheirIndexAndAreTheHosts) {
  Layer clip;
  clip.guid = kClip;
  clip.width = 16;
  clip.height = 8;
  host().addLayer(clip);
  WispRenderContext context{};
  context.width = 32;
  context.height = 18;

  TextureRecord source{};
  ASSERT_EQ(api()->GetSourceFrame(handle(), &context, 300, &source), 0);
  EXPECT_EQ(source.imageWidth, 32);
  const std::vector<uint8_t> pixels = refhost::readBack(source.id, 32, 18).pixels;
  EXPECT_EQ(pixels[0], 300 % 256);
  EXPECT_EQ(pixels[1], 300 / 256);
  EXPECT_EQ(pixels[2], 0);

  TextureRecord layer{};
  ASSERT_EQ(api()->RenderLayerFrame(handle(), &context, kClip, 7, &layer), 0);
  EXPECT_EQ(layer.imageWidth, 16);
  EXPECT_EQ(refhost::readBack(layer.id, 16, 8).pixels[2], 1);  // the first layer's tag
  EXPECT_EQ(host().outstandingTextures(), 0);
  EXPECT_EQ(host().outstandingFrames(), 2);
  api()->ReleaseTexture(handle(), nullptr, layer.id);
  EXPECT_EQ(host().outstandingFrames(), 1);

  TextureRecord refused{};
  EXPECT_NE(api()->RenderLayerFrame(handle(), &context, kNoLayer, 7, &refused), 0);
  host().faults().refuseSourceFrames = true;
  host().faults().refuseLayerFrames = true;
  EXPECT_NE(api()->GetSourceFrame(handle(), &context, 1, &refused), 0);
  EXPECT_NE(api()->RenderLayerFrame(handle(), &context, kClip, 7, &refused), 0);
  EXPECT_EQ(host().outstandingFrames(), 1);
  api()->ReleaseTexture(handle(), nullptr, source.id);
}

// The layer states and timing the module reads show in its renders and its layer menu; here
// what they leave alone: names cut to the buffer, the second matrix, and failures on request.
TEST_F(HostResources, LayerQueriesBoundNamesAndFailOnRequest) {
  Layer camera;
  camera.guid = kClip;
  camera.name = "Camera";
  camera.kind = 4;
  host().addLayer(camera);
  char guid[40] = {}, name[5] = {};
  int32_t kind = -1;
  api()->GetLayerInfo(handle(), 0, guid, name, sizeof name, &kind);
  EXPECT_STREQ(name, "Came");  // bounded by the buffer size, terminated
  LayerState state;
  std::memset(&state, 0xAB, sizeof state);
  ASSERT_EQ(api()->QueryLayerState(handle(), kClip, 4000, &state), 0);
  EXPECT_EQ(state.type, 4u);
  EXPECT_EQ(state.secondMatrix[15], 1.0f);

  host().faults().failLayerQueries = true;
  host().faults().failTimeInfo = true;
  EXPECT_NE(api()->QueryLayerState(handle(), kClip, 4000, &state), 0);
  WispTimeInfo time{};
  EXPECT_NE(api()->GetTimeInfo(handle(), &time), 0);
}

TEST(HostWithoutGl, RefusesGlResourcesAndSaysWhy) {
  Host host;
  int32_t width = -1, height = -1;
  EXPECT_EQ(host.api().AllocateTexture(host.handle(), nullptr, 8, 8, GL_RGBA, GL_RGBA,
                                       GL_UNSIGNED_BYTE, nullptr, &width, &height),
            0u);
  EXPECT_EQ(host.api().AcquireBuffer(host.handle(), GL_ARRAY_BUFFER, 8, nullptr, GL_DYNAMIC_DRAW,
                                     nullptr),
            0u);
  TextureRecord frame{};
  EXPECT_NE(host.api().GetSourceFrame(host.handle(), nullptr, 0, &frame), 0);
  EXPECT_EQ(host.outstandingTextures() + host.outstandingBuffers() + host.outstandingFrames(), 0);
  EXPECT_EQ(host.problems().size(), 3u);
}

}  // namespace
}  // namespace refhost
