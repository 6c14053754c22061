// Host resources with a real GL context: textures, buffers and the vertex array handed to the
// plug-in and their accounting; frame fetches, layer states and timing, with refusals.
#include <GL/glew.h>
#include <gtest/gtest.h>

#include <cstring>

#include "support/gl_host.h"

namespace refhost {
namespace {

const char* const kClip = "11111111-2222-3333-4444-555555555555";

Layer makeLayer(const std::string& guid, const std::string& name, int32_t kind,
                int32_t firstFrame = 0, int32_t frameCount = 1, int32_t width = 1920,
                int32_t height = 1080) {
  Layer layer;
  layer.guid = guid;
  layer.name = name;
  layer.kind = kind;
  layer.firstFrame = firstFrame;
  layer.frameCount = frameCount;
  layer.width = width;
  layer.height = height;
  return layer;
}

using HostResources = testsupport::GlHostTest;

TEST_F(HostResources, TexturesAreAllocatedAtTheirSizeCountedAndLeaveBindingsAlone) {
  const struct {
    int32_t width, height;
    uint32_t format;
  } sizes[] = {{64, 36, GL_RGBA}, {1, 1, GL_RGBA16F}, {0, 0, GL_RGBA}, {320, 180, GL_RGBA}};
  const TextureRecord mine = host().createTexture(4, 4);
  glActiveTexture(GL_TEXTURE0);
  glBindTexture(GL_TEXTURE_2D, mine.id);
  std::vector<uint32_t> ids;
  for (const auto& size : sizes) {
    int32_t width = -1, height = -1;
    const uint32_t id =
        api()->AllocateTexture(handle(), nullptr, size.width, size.height, size.format, GL_RGBA,
                               GL_UNSIGNED_BYTE, nullptr, &width, &height);
    EXPECT_NE(id, 0u);
    EXPECT_EQ(width, size.width);
    EXPECT_EQ(height, size.height);
    GLint bound = 0;
    glGetIntegerv(GL_TEXTURE_BINDING_2D, &bound);
    EXPECT_EQ(static_cast<uint32_t>(bound), mine.id) << "the plug-in's binding stays";
    glBindTexture(GL_TEXTURE_2D, id);
    GLint stored = 0;
    glGetTexLevelParameteriv(GL_TEXTURE_2D, 0, GL_TEXTURE_WIDTH, &stored);
    EXPECT_EQ(stored, size.width);
    glBindTexture(GL_TEXTURE_2D, mine.id);
    ids.push_back(id);
  }
  EXPECT_EQ(host().callLog()[0], "AllocateTexture 64 36 0x1908 0x1908 0x1401 null");
  EXPECT_EQ(host().outstandingTextures(), 4);
  api()->ReleaseTexture(handle(), nullptr, ids[1]);
  EXPECT_EQ(host().outstandingTextures(), 3);
  EXPECT_TRUE(host().problems().empty());

  // An impossible size is refused with id 0 and nothing to give back.
  int32_t width = -1, height = -1;
  EXPECT_EQ(api()->AllocateTexture(handle(), nullptr, -4, 10, GL_RGBA, GL_RGBA, GL_UNSIGNED_BYTE,
                                   nullptr, &width, &height),
            0u);
  EXPECT_EQ(width, 0);
  for (uint32_t id : {ids[0], ids[2], ids[3]}) api()->ReleaseTexture(handle(), nullptr, id);
  api()->ReleaseTexture(handle(), nullptr, ids[1]);  // twice
  api()->ReleaseTexture(handle(), nullptr, 0);
  EXPECT_EQ(host().problems().size(), 3u);  // the size, the second release and id 0
  host().clearProblems();
  host().deleteTexture(mine.id);
}

// The texture pool: textures given back are handed out again for the same size and format,
// as new ones would be, while the accounting stays exactly as without it.
TEST_F(HostResources, GivenBackTexturesAreReusedBySizeAndFormatWithFreshSampling) {
  tagWispAPI& api = host().api();
  auto allocate = [&](int32_t width, uint32_t format) {
    int32_t w = 0, h = 0;
    return api.AllocateTexture(host().handle(), nullptr, width, 8, format, GL_RGBA,
                               GL_UNSIGNED_BYTE, nullptr, &w, &h);
  };
  const uint32_t first = allocate(16, GL_RGBA);
  glBindTexture(GL_TEXTURE_2D, first);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);  // as a plug-in may leave it
  glBindTexture(GL_TEXTURE_2D, 0);
  api.ReleaseTexture(host().handle(), nullptr, first);
  glFinish();  // the fence of the texture given back is passed

  const std::size_t created = host().texturePool().created();
  uint32_t again = allocate(16, GL_RGBA);
  EXPECT_EQ(again, first);
  EXPECT_EQ(host().texturePool().created(), created);
  GLint filter = 0;
  glBindTexture(GL_TEXTURE_2D, again);
  glGetTexParameteriv(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, &filter);
  EXPECT_EQ(filter, GL_LINEAR);
  // Another size or format is another texture; the one held is not handed out twice.
  const uint32_t others[] = {allocate(16, GL_RGBA16F), allocate(32, GL_RGBA),
                             allocate(16, GL_RGBA)};
  for (uint32_t other : others) EXPECT_NE(other, first);
  EXPECT_EQ(host().outstandingTextures(), 4);

  // Host textures share the pool: uploads land in a reused texture intact.
  const std::vector<uint8_t> pixels(16 * 8 * 4, 77);
  host().deleteTexture(host().createTexture(16, 8).id);
  glFinish();
  TextureRecord uploaded = host().createTexture(16, 8, pixels.data());
  EXPECT_EQ(host().readTexture(uploaded.id, 16, 8), pixels);
  api.ReleaseTexture(host().handle(), nullptr, uploaded.id);  // not the plug-in's to give back
  EXPECT_EQ(host().problems().size(), 1u);
  EXPECT_EQ(host().outstandingTextures(), 4);
  host().clearProblems();
  host().deleteTexture(uploaded.id);
  for (uint32_t id : {again, others[0], others[1], others[2]})
    api.ReleaseTexture(host().handle(), nullptr, id);
}

TEST_F(HostResources, BuffersHoldTheirDataAndAreCounted) {
  const float vertices[] = {0, 0, 0.5f, 0.25f, 1, 1, 0.75f, 1};
  uint32_t hostOutput = 0;
  const uint32_t vertexArray = api()->CreateVertexArray(handle());
  EXPECT_NE(vertexArray, 0u);
  EXPECT_EQ(api()->CreateVertexArray(handle()), vertexArray);  // one per host, reused
  glBindVertexArray(vertexArray);
  const uint32_t buffer = api()->AcquireBuffer(handle(), GL_ARRAY_BUFFER, sizeof vertices, vertices,
                                               GL_DYNAMIC_DRAW, &hostOutput);
  const uint32_t indices = api()->AcquireBuffer(handle(), GL_ELEMENT_ARRAY_BUFFER, 12, nullptr,
                                                GL_DYNAMIC_DRAW, nullptr);
  ASSERT_NE(buffer, 0u);
  GLint bound = 0;
  glGetIntegerv(GL_ARRAY_BUFFER_BINDING, &bound);
  EXPECT_EQ(static_cast<uint32_t>(bound), buffer);
  float readBack[8] = {};
  glGetBufferSubData(GL_ARRAY_BUFFER, 0, sizeof readBack, readBack);
  EXPECT_EQ(std::memcmp(readBack, vertices, sizeof vertices), 0);
  EXPECT_EQ(host().outstandingBuffers(), 2);
  EXPECT_EQ(host().callsTo("AcquireBuffer")[0], "AcquireBuffer 0x8892 32 data 0x88E8");

  api()->ReleaseBuffer(handle(), buffer);
  api()->ReleaseBuffer(handle(), indices);
  api()->ReleaseBuffer(handle(), indices);
  glBindVertexArray(0);
  EXPECT_EQ(host().outstandingBuffers(), 0);
  EXPECT_EQ(host().problems().size(), 1u);
  host().clearProblems();
}

TEST_F(HostResources, FramesCarryTheirIndexAndAreTheHosts) {
  host().addLayer(makeLayer(kClip, "Clip", 0, 100, 50, 16, 8));
  WispRenderContext context{};
  context.width = 32;
  context.height = 18;

  TextureRecord source{};
  ASSERT_EQ(api()->GetSourceFrame(handle(), &context, 300, &source), 0);
  EXPECT_EQ(source.imageWidth, 32);
  EXPECT_EQ(source.s1, 1.0f);
  const std::vector<uint8_t> pixels = host().readTexture(source.id, 32, 18);
  EXPECT_EQ(pixels[0], 300 % 256);
  EXPECT_EQ(pixels[1], 300 / 256);
  EXPECT_EQ(pixels[2], 0);

  TextureRecord layer{};
  ASSERT_EQ(api()->RenderLayerFrame(handle(), &context, kClip, 7, &layer), 0);
  EXPECT_EQ(layer.imageWidth, 16);
  EXPECT_EQ(host().readTexture(layer.id, 16, 8)[2], 1);  // the first layer's tag
  EXPECT_EQ(host().outstandingTextures(), 0);
  EXPECT_EQ(host().outstandingFrames(), 2);
  api()->ReleaseTexture(handle(), nullptr, layer.id);
  EXPECT_EQ(host().outstandingFrames(), 1);

  TextureRecord refused{};
  EXPECT_NE(api()->RenderLayerFrame(handle(), &context, kNoLayer, 7, &refused), 0);
  host().setRefuseSourceFrames(true);
  host().setRefuseLayerFrames(true);
  EXPECT_NE(api()->GetSourceFrame(handle(), &context, 1, &refused), 0);
  EXPECT_NE(api()->RenderLayerFrame(handle(), &context, kClip, 7, &refused), 0);
  EXPECT_EQ(host().outstandingFrames(), 1);
  api()->ReleaseTexture(handle(), nullptr, source.id);
}

TEST_F(HostResources, LayerStatesAndTimingFollowTheComposition) {
  Layer layer = makeLayer(kClip, "Clip", 4, 100, 50, 640, 360);
  layer.is3D = true;
  layer.placement[12] = -320;
  host().addLayer(layer);
  host().addLayer(makeLayer("aaaaaaaa-bbbb-cccc-dddd-eeeeeeeeeeee", "Camera", 2));

  EXPECT_EQ(api()->GetLayerCount(handle()), 2);
  char guid[40] = {}, name[5] = {};
  int32_t kind = -1;
  api()->GetLayerInfo(handle(), 1, guid, name, sizeof name, &kind);
  EXPECT_STREQ(guid, "aaaaaaaa-bbbb-cccc-dddd-eeeeeeeeeeee");
  EXPECT_STREQ(name, "Came");  // bounded by the buffer size, terminated
  EXPECT_EQ(kind, 2);

  LayerState state;
  std::memset(&state, 0xAB, sizeof state);
  ASSERT_EQ(api()->QueryLayerState(handle(), kClip, 4000, &state), 0);
  EXPECT_EQ(state.type, 4u);
  EXPECT_EQ(state.firstFrame, 100);
  EXPECT_EQ(state.frameCount, 50);
  EXPECT_EQ(state.is3D, 1);
  EXPECT_EQ(state.width, 640);
  EXPECT_EQ(state.height, 360);
  EXPECT_EQ(state.placement[12], -320.0f);
  EXPECT_EQ(state.secondMatrix[15], 1.0f);
  EXPECT_EQ(api()->QueryLayerState(handle(), "ffffffff-ffff-ffff-ffff-ffffffffffff", 0, &state), 1);

  WispTimeInfo time{};
  host().setTimeInfo(320, 180, 30.0);
  ASSERT_EQ(api()->GetTimeInfo(handle(), &time), 0);
  EXPECT_EQ(time.width, 320);
  EXPECT_EQ(time.frameRate, 30.0);
  host().setFailLayerQueries(true);
  host().setFailTimeInfo(true);
  EXPECT_NE(api()->QueryLayerState(handle(), kClip, 4000, &state), 0);
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
