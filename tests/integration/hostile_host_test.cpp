// Draw messages a host sends when nothing can be drawn: before GL start-up has built the
// programs, or for a frame without pixels. The plug-in answers as always, draws nothing,
// raises no GL error and keeps no texture or buffer.
#include "refhost/host.h"

#include <gtest/gtest.h>

#include "refhost/render_frame.h"

namespace {

TEST(HostileHost, DrawsWithoutProgramsOrPixelsAreEmpty) {
  refhost::Module module(VELTRANE_MODULE_PATH);
  refhost::Host host(module);
  refhost::GlContext& gl = host.attachGl();
  for (int32_t message : {0, 2, 3}) ASSERT_EQ(host.send(message), 1);
  refhost::RenderFrame picture(host, {64, 36, 25.0, 1.0f, 1, refhost::kNoLayer}, 0);
  host.setDrawTarget(picture.context().output.id, 64, 36);
  struct Case {
    const char* name;
    int32_t message, width, height;
  };
  const Case cases[] = {
      {"render before GL start-up", 10, 64, 36},
      {"overlay before GL start-up", 1003, 64, 36},
      {"render of no width", 10, 0, 36},
      {"render of no height", 10, 64, 0},
  };
  for (const Case& c : cases) {
    if (c.width == 0 || c.height == 0) {
      ASSERT_EQ(host.send(8), 1);
    }
    refhost::RenderFrame frame(host, {c.width, c.height, 25.0, 1.0f, 1, refhost::kNoLayer}, 0);
    WispViewerContext viewer = refhost::makeViewerContext(c.width, c.height, 1, 1, 1, 0);
    host.setRenderContext(c.message == 10 ? static_cast<void*>(&frame.context()) : &viewer);
    gl.clearErrors();
    EXPECT_EQ(host.send(c.message), 1) << c.name;
    EXPECT_TRUE(gl.errors().empty()) << c.name << ": " << gl.errors().front().text;
    EXPECT_EQ(host.outstandingTextures() + host.outstandingBuffers(), 0) << c.name;
    host.setRenderContext(nullptr);
  }
  host.send(4);
  host.send(1);
}

}  // namespace
