// Fixture for render tests: the real module with a GL context, a small frame, solid-colour
// inputs and a render context filled the way the host fills it for message 10.
#pragma once

#include <GL/glew.h>
#include <gtest/gtest.h>

#include <array>
#include <memory>
#include <string>
#include <vector>

#include "loaded_plugin.h"
#include "refhost/engine/render_frame.h"
#include "refhost/gl/headless_context.h"
#include "refhost/pipeline/frame_readback.h"
#include "support/engine_fixture.h"
#include "support/instrumented_host.h"

using Rgba = refhost::Rgba8;
constexpr Rgba kRed{255, 0, 0, 255}, kGreen{0, 255, 0, 255}, kBlue{0, 0, 255, 255};
constexpr Rgba kClear{0, 0, 0, 0};

// The GL state the render and the overlay leave for the host: blending off with GL_FUNC_ADD and
// GL_ONE/GL_ONE, no program in use, and the clear colour as the host had set it.
inline void expectGlStateLeftForTheHost(const std::array<float, 4>& clearColour) {
  GLint equation = 0, source = 0, destination = 0, program = -1;
  glGetIntegerv(GL_BLEND_EQUATION_RGB, &equation);
  glGetIntegerv(GL_BLEND_SRC_RGB, &source);
  glGetIntegerv(GL_BLEND_DST_RGB, &destination);
  glGetIntegerv(GL_CURRENT_PROGRAM, &program);
  EXPECT_FALSE(glIsEnabled(GL_BLEND));
  EXPECT_EQ(equation, GL_FUNC_ADD);
  EXPECT_EQ(source, GL_ONE);
  EXPECT_EQ(destination, GL_ONE);
  EXPECT_EQ(program, 0);
  std::array<float, 4> clear{};
  glGetFloatv(GL_COLOR_CLEAR_VALUE, clear.data());
  EXPECT_EQ(clear, clearColour);
}

class RenderFixture {
 public:
  static constexpr int32_t kWidth = 64;
  static constexpr int32_t kHeight = 36;
  static constexpr const char* kOwnLayer = "0000000a-0000-4000-8000-00000000000a";

  explicit RenderFixture(refhost::GlProfile profile = refhost::GlProfile::Core,
                         int32_t width = kWidth, int32_t height = kHeight)
      : width_(width), height_(height) {
    host_ = std::make_unique<testsupport::InstrumentedHost>(module_);
    host_->attachGl(refhost::makeHeadlessContext(profile));
    host_->setTimeInfo(width, height, 25.0);
    refhost::Layer own;
    own.guid = kOwnLayer;
    own.name = "Effect layer";
    own.width = width;
    own.height = height;
    own.frameCount = 100;
    host_->addLayer(own);
    EXPECT_EQ(host_->send(kMessageLoad), 1);
    EXPECT_EQ(host_->send(kMessageDeclareParameters), 1);
    EXPECT_EQ(host_->send(kMessageCreateInstance), 1);
    EXPECT_EQ(host_->send(kMessagePrepareGl), 1);
  }

  ~RenderFixture() {
    host_->send(kMessageDestroyInstance);
    host_->send(kMessageUnload);
    host_.reset();
  }

  testsupport::InstrumentedHost& host() { return *host_; }

  // Adds a layer the size of the frame, placed like the effect's own layer.
  void addSolidLayer(const std::string& guid, Rgba colour, int32_t firstFrame = 0,
                     int32_t frameCount = 100) {
    refhost::Layer layer = testsupport::solidLayer(guid, width_, height_, colour);
    layer.firstFrame = firstFrame;
    layer.frameCount = frameCount;
    host_->addLayer(layer);
  }

  // Renders frame `frame` with a source of the given colour (or the source callback) and
  // returns the output's RGBA8 pixels, rows from the bottom. Checks resource balance and GL
  // errors after the message.
  std::vector<uint8_t> render(Rgba sourceColour, int32_t frame = 10,
                              const refhost::FrameSource& sourceFrames = {}) {
    host_->setSourceFrames(sourceFrames ? sourceFrames : testsupport::solidSource(sourceColour));
    std::vector<uint8_t> pixels;
    {
      refhost::RenderFrame target(*host_, {width_, height_, 25.0, pixelAspect, 100, kOwnLayer},
                                  frame);
      host_->setRenderContext(&target.context());
      EXPECT_EQ(host_->send(kMessageRequestFrames), 1);
      glClearColor(0.25f, 0.5f, 0.75f, 1.0f);
      EXPECT_EQ(host_->send(kMessageRender), 1);
      host_->setRenderContext(nullptr);
      // Besides, unit 0 is left active with the source bound and filtering nearest.
      expectGlStateLeftForTheHost({0.25f, 0.5f, 0.75f, 1.0f});
      GLint unit = 0, bound = 0, minifying = 0, magnifying = 0;
      glGetIntegerv(GL_ACTIVE_TEXTURE, &unit);
      glGetIntegerv(GL_TEXTURE_BINDING_2D, &bound);
      glGetTexParameteriv(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, &minifying);
      glGetTexParameteriv(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, &magnifying);
      EXPECT_EQ(unit, GL_TEXTURE0);
      EXPECT_EQ(static_cast<uint32_t>(bound), target.context().source.id);
      EXPECT_EQ(minifying, GL_NEAREST);
      EXPECT_EQ(magnifying, GL_NEAREST);
      // Read back as the host reads its frames, then in GL's row order like the sources.
      pixels = refhost::flipRows(
          refhost::readBack(target.context().output.id, width_, height_).pixels, width_, height_);
    }
    EXPECT_EQ(host_->outstandingTextures(), 0);
    EXPECT_EQ(host_->outstandingBuffers(), 0);
    for (const std::string& problem : host_->problems()) ADD_FAILURE() << "host: " << problem;
    host_->clearProblems();
    for (const auto& error : host_->gl()->errors()) ADD_FAILURE() << "GL error: " << error.text;
    host_->gl()->clearErrors();
    return pixels;
  }

  // Pixel at corner-space pixel column x, row y (row 0 at the bottom).
  Rgba pixel(const std::vector<uint8_t>& pixels, int x, int y) const {
    const size_t at =
        (static_cast<size_t>(y) * static_cast<size_t>(width_) + static_cast<size_t>(x)) * 4;
    return {pixels[at], pixels[at + 1], pixels[at + 2], pixels[at + 3]};
  }

  int32_t width() const { return width_; }
  float pixelAspect = 1.0f;  // of the frames rendered
  int32_t height() const { return height_; }

 private:
  refhost::Module module_{VELTRANE_MODULE_PATH};
  int32_t width_;
  int32_t height_;
  std::unique_ptr<testsupport::InstrumentedHost> host_;
};

// The fixture of the core profile and the small frame, as a googletest fixture.
class RenderTest : public ::testing::Test, public RenderFixture {};
