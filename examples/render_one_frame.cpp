// The smallest front end of the engine, built on the engine core alone (no media libraries, no
// headless context of the reference host's): it makes its own GL context and textures as an
// editor or a player embedding the effect would, loads the plug-in module, sets two parameters,
// renders one frame of its own picture into its own texture and writes it as a PNG. A new host
// front end needs no more of the reference host than refhost/engine.h and this.
//
//   render_one_frame MODULE.so OUT.png
#include <EGL/egl.h>
#include <EGL/eglext.h>
#include <GL/glew.h>
#include <stb/stb_image_write.h>

#include <cstdio>
#include <exception>
#include <stdexcept>
#include <vector>

#include "refhost/engine.h"

namespace {

constexpr int32_t kWidth = 320;
constexpr int32_t kHeight = 180;

// The front end's own context: a surfaceless OpenGL 4.1 core context through EGL, current while
// it lives. An editor would hand over its window's context here instead.
class OwnContext {
 public:
  OwnContext() {
    display_ = eglGetPlatformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr);
    EGLint major = 0, minor = 0;
    if (display_ == EGL_NO_DISPLAY || !eglInitialize(display_, &major, &minor) ||
        !eglBindAPI(EGL_OPENGL_API))
      throw std::runtime_error("no EGL display");
    const EGLint attributes[] = {EGL_CONTEXT_MAJOR_VERSION,
                                 4,
                                 EGL_CONTEXT_MINOR_VERSION,
                                 1,
                                 EGL_CONTEXT_OPENGL_PROFILE_MASK,
                                 EGL_CONTEXT_OPENGL_CORE_PROFILE_BIT,
                                 EGL_NONE};
    context_ = eglCreateContext(display_, EGL_NO_CONFIG_KHR, EGL_NO_CONTEXT, attributes);
    if (context_ == EGL_NO_CONTEXT) throw std::runtime_error("no OpenGL 4.1 context");
    makeCurrent();
  }
  ~OwnContext() {
    eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
    eglDestroyContext(display_, context_);
  }
  OwnContext(const OwnContext&) = delete;
  OwnContext& operator=(const OwnContext&) = delete;
  void makeCurrent() { eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, context_); }

 private:
  EGLDisplay display_ = EGL_NO_DISPLAY;
  EGLContext context_ = EGL_NO_CONTEXT;
};

// A texture of the frame's size holding `rgba` (rows from the bottom, as GL stores them), or
// empty storage, described as the engine expects.
TextureRecord makeTexture(const std::vector<uint8_t>& rgba) {
  TextureRecord record{};
  glGenTextures(1, &record.id);
  glBindTexture(GL_TEXTURE_2D, record.id);
  glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA8, kWidth, kHeight, 0, GL_RGBA, GL_UNSIGNED_BYTE,
               rgba.empty() ? nullptr : rgba.data());
  glBindTexture(GL_TEXTURE_2D, 0);
  record.pixelType = GL_UNSIGNED_BYTE;
  record.format = GL_RGBA;
  record.allocatedWidth = record.imageWidth = kWidth;
  record.allocatedHeight = record.imageHeight = kHeight;
  record.s1 = record.t1 = record.scaleX = record.scaleY = 1.0f;
  return record;
}

// The front end's picture: a horizontal ramp, whatever its decoder would deliver.
std::vector<uint8_t> ramp() {
  std::vector<uint8_t> rows(static_cast<std::size_t>(kWidth) * kHeight * 4);
  for (std::size_t i = 0; i < rows.size(); i += 4) {
    const auto x = static_cast<uint8_t>((i / 4) % kWidth * 255 / (kWidth - 1));
    rows[i] = x;
    rows[i + 1] = 255 - x;
    rows[i + 2] = 128;
    rows[i + 3] = 255;
  }
  return rows;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3) {
    std::fprintf(stderr, "usage: render_one_frame MODULE.so OUT.png\n");
    return 2;
  }
  try {
    OwnContext own;
    refhost::EngineOptions options;
    options.modulePath = argv[1];
    options.context =
        refhost::GlContext::adoptCurrent(refhost::GlProfile::Core, [&] { own.makeCurrent(); });
    refhost::Engine engine(std::move(options));  // loads the module
    refhost::FrameSettings settings;             // 8-bit frames, square pixels
    settings.width = kWidth;
    settings.height = kHeight;
    settings.frameRate = 25.0;
    engine.setFrameSettings(settings);
    // Time-shifted inputs would fetch other frames of the source through this; a front end
    // answers with its decoder's frames, rows from the bottom.
    engine.setSourceFrames([](int32_t, int32_t, int32_t, refhost::PixelFormat) { return ramp(); });

    engine.start();  // the module declares its parameter panel
    const refhost::EffectVocabulary& roles = engine.vocabulary();
    engine.setParam(roles.id(refhost::EffectParam::BorderWidth), refhost::ParamValue::ofFloat(8));
    engine.setParam(roles.id(refhost::EffectParam::BorderColor),
                    refhost::ParamValue::ofColor(1, 1, 1));
    engine.createInstance();  // the instance and its GL programs; the values are reported

    refhost::CallerTextures textures{makeTexture(ramp()), makeTexture({})};
    engine.render(0, textures);

    std::vector<uint8_t> pixels(static_cast<std::size_t>(kWidth) * kHeight * 4);
    GLuint framebuffer = 0;
    glGenFramebuffers(1, &framebuffer);
    glBindFramebuffer(GL_FRAMEBUFFER, framebuffer);
    glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, textures.output.id,
                           0);
    glReadPixels(0, 0, kWidth, kHeight, GL_RGBA, GL_UNSIGNED_BYTE, pixels.data());
    glDeleteFramebuffers(1, &framebuffer);
    engine.finish();
    glDeleteTextures(1, &textures.source.id);
    glDeleteTextures(1, &textures.output.id);

    // GL's rows run from the bottom; PNG's from the top.
    stbi_flip_vertically_on_write(1);
    if (!stbi_write_png(argv[2], kWidth, kHeight, 4, pixels.data(), kWidth * 4))
      throw std::runtime_error(std::string("cannot write ") + argv[2]);
    std::printf("wrote %s\n", argv[2]);
    return 0;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "render_one_frame: %s\n", error.what());
    return 1;
  }
}
