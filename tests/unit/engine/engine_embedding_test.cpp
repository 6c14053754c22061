// The engine embedded by another host framework: a GL context the test made itself with EGL
// and textures the test uploaded, with none of the reference host's media layer in between.
#include <EGL/egl.h>
#include <EGL/eglext.h>
#include <GL/glew.h>
#include <gtest/gtest.h>

#include <vector>

#include "refhost/engine.h"
#include "refhost/pipeline/frame_readback.h"

namespace refhost {
namespace {

constexpr int32_t kWidth = 64;
constexpr int32_t kHeight = 36;

// A surfaceless 4.1 core context of the test's own, current while the object lives.
class OwnContext {
 public:
  OwnContext() {
    display_ = eglGetPlatformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr);
    EGLint major = 0, minor = 0;
    if (display_ == EGL_NO_DISPLAY || !eglInitialize(display_, &major, &minor) ||
        !eglBindAPI(EGL_OPENGL_API))
      return;
    const EGLint attributes[] = {EGL_CONTEXT_MAJOR_VERSION,
                                 4,
                                 EGL_CONTEXT_MINOR_VERSION,
                                 1,
                                 EGL_CONTEXT_OPENGL_PROFILE_MASK,
                                 EGL_CONTEXT_OPENGL_CORE_PROFILE_BIT,
                                 EGL_NONE};
    context_ = eglCreateContext(display_, EGL_NO_CONFIG_KHR, EGL_NO_CONTEXT, attributes);
    if (context_ != EGL_NO_CONTEXT) makeCurrent();
  }
  ~OwnContext() {
    if (context_ == EGL_NO_CONTEXT) return;
    eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
    eglDestroyContext(display_, context_);
  }
  bool made() const { return context_ != EGL_NO_CONTEXT; }
  void makeCurrent() { eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, context_); }

 private:
  EGLDisplay display_ = EGL_NO_DISPLAY;
  EGLContext context_ = EGL_NO_CONTEXT;
};

TextureRecord uploaded(const std::vector<uint8_t>& rgba) {
  TextureRecord record{};
  glGenTextures(1, &record.id);
  glBindTexture(GL_TEXTURE_2D, record.id);
  glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA8, kWidth, kHeight, 0, GL_RGBA, GL_UNSIGNED_BYTE,
               rgba.empty() ? nullptr : rgba.data());
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_LINEAR);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_LINEAR);
  record.pixelType = GL_UNSIGNED_BYTE;
  record.format = GL_RGBA;
  record.allocatedWidth = record.imageWidth = kWidth;
  record.allocatedHeight = record.imageHeight = kHeight;
  record.s1 = record.t1 = record.scaleX = record.scaleY = 1.0f;
  return record;
}

TEST(EngineEmbedding, RendersFromTheCallersContextAndTextures) {
  OwnContext own;
  ASSERT_TRUE(own.made()) << "no EGL context: the embedding test needs one to run";
  {
    EngineOptions options;
    options.modulePath = VELTRANE_MODULE_PATH;
    options.context = GlContext::adoptCurrent(GlProfile::Core, [&] { own.makeCurrent(); });
    Engine engine(std::move(options));
    FrameSettings settings;
    settings.width = kWidth;
    settings.height = kHeight;
    settings.frameRate = 30.0;
    engine.setFrameSettings(settings);
    engine.start();
    engine.createInstance();

    // A picture no generator of the host makes: every pixel its own value.
    std::vector<uint8_t> picture(static_cast<std::size_t>(kWidth) * kHeight * 4);
    for (std::size_t i = 0; i < picture.size(); ++i)
      picture[i] = i % 4 == 3 ? 255 : static_cast<uint8_t>(i * 13 % 251);
    const TextureRecord source = uploaded(picture);
    const TextureRecord output = uploaded({});

    // Without a border every region shows the own source unmoved: the picture comes back.
    engine.setParam("borderWidth", ParamValue::ofFloat(0));
    engine.render(7, CallerTextures{source, output});
    own.makeCurrent();
    RgbaImage rendered = readBack(output.id, kWidth, kHeight);
    EXPECT_EQ(flipRows(rendered.pixels, kWidth, kHeight), picture);

    // With one, the cut through the centre is drawn in its colour.
    engine.setParam("borderWidth", ParamValue::ofFloat(6));
    engine.setParam("borderColor", ParamValue::ofColor(0, 1, 0));
    engine.setParam("borderAlpha", ParamValue::ofFloat(1));
    engine.render(8, CallerTextures{source, output});
    own.makeCurrent();
    rendered = readBack(output.id, kWidth, kHeight);
    EXPECT_EQ(rendered.pixel(kWidth / 2, kHeight / 2), (Rgba8{0, 255, 0, 255}));
    EXPECT_NE(flipRows(rendered.pixels, kWidth, kHeight), picture);

    // The caller's textures stay the caller's.
    EXPECT_TRUE(glIsTexture(source.id));
    EXPECT_TRUE(glIsTexture(output.id));
    glDeleteTextures(1, &source.id);
    glDeleteTextures(1, &output.id);
    engine.finish();
  }
}

}  // namespace
}  // namespace refhost
