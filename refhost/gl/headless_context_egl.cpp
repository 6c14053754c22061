// Headless EGL context: the device platform where an NVIDIA GPU is present, Mesa surfaceless
// otherwise.
#include <EGL/egl.h>
#include <EGL/eglext.h>

#include <cstdio>
#include <stdexcept>

#include "refhost/gl/headless_context.h"

namespace refhost {
namespace {

std::string eglErrorText(const char* step) {
  char buffer[128];
  std::snprintf(buffer, sizeof buffer, "%s failed (EGL error 0x%04X)", step, eglGetError());
  return std::string("cannot create a headless OpenGL context: ") + buffer;
}

EGLDisplay openDisplay() {
  auto getPlatformDisplay = reinterpret_cast<PFNEGLGETPLATFORMDISPLAYEXTPROC>(
      eglGetProcAddress("eglGetPlatformDisplayEXT"));
  if (!getPlatformDisplay) return EGL_NO_DISPLAY;
  // A real GPU exposed as an EGL device comes first; Mesa's surfaceless platform otherwise.
  auto queryDevices =
      reinterpret_cast<PFNEGLQUERYDEVICESEXTPROC>(eglGetProcAddress("eglQueryDevicesEXT"));
  if (queryDevices) {
    EGLDeviceEXT devices[8];
    EGLint count = 0;
    if (queryDevices(8, devices, &count) && count > 0) {
      auto queryDeviceString = reinterpret_cast<PFNEGLQUERYDEVICESTRINGEXTPROC>(
          eglGetProcAddress("eglQueryDeviceStringEXT"));
      for (EGLint i = 0; i < count && queryDeviceString; ++i) {
        const char* extensions = queryDeviceString(devices[i], EGL_EXTENSIONS);
        // Mesa's software device carries this extension; a hardware device does not.
        if (extensions &&
            std::string(extensions).find("EGL_MESA_device_software") != std::string::npos)
          continue;
        EGLDisplay display = getPlatformDisplay(EGL_PLATFORM_DEVICE_EXT, devices[i], nullptr);
        EGLint major = 0, minor = 0;
        if (display != EGL_NO_DISPLAY && eglInitialize(display, &major, &minor)) return display;
      }
    }
  }
  EGLDisplay display =
      getPlatformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr);
  EGLint major = 0, minor = 0;
  if (display == EGL_NO_DISPLAY || !eglInitialize(display, &major, &minor)) return EGL_NO_DISPLAY;
  return display;
}

class EglContext : public PlatformContext {
 public:
  explicit EglContext(GlProfile profile) {
    display_ = openDisplay();
    if (display_ == EGL_NO_DISPLAY) throw std::runtime_error(eglErrorText("eglInitialize"));
    if (!eglBindAPI(EGL_OPENGL_API)) throw std::runtime_error(eglErrorText("eglBindAPI"));
    const EGLint attributes[] = {EGL_CONTEXT_MAJOR_VERSION,
                                 4,
                                 EGL_CONTEXT_MINOR_VERSION,
                                 1,
                                 EGL_CONTEXT_OPENGL_PROFILE_MASK,
                                 profile == GlProfile::Core
                                     ? EGL_CONTEXT_OPENGL_CORE_PROFILE_BIT
                                     : EGL_CONTEXT_OPENGL_COMPATIBILITY_PROFILE_BIT,
                                 EGL_CONTEXT_OPENGL_DEBUG,
                                 EGL_TRUE,
                                 EGL_NONE};
    context_ = eglCreateContext(display_, EGL_NO_CONFIG_KHR, EGL_NO_CONTEXT, attributes);
    if (context_ == EGL_NO_CONTEXT)
      throw std::runtime_error(eglErrorText("eglCreateContext (OpenGL 4.1)"));
    makeCurrent();
  }
  ~EglContext() override {
    eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
    eglDestroyContext(display_, context_);
    // The display is shared per process by EGL; terminating it would pull it from under any
    // other live context, so it is left initialised.
  }
  EglContext(const EglContext&) = delete;
  EglContext& operator=(const EglContext&) = delete;

  void makeCurrent() override {
    if (!eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, context_))
      throw std::runtime_error(eglErrorText("eglMakeCurrent"));
  }

 private:
  EGLDisplay display_ = EGL_NO_DISPLAY;
  EGLContext context_ = EGL_NO_CONTEXT;
};

}  // namespace

std::unique_ptr<GlContext> makeHeadlessContext(GlProfile profile) {
  return std::make_unique<GlContext>(profile, std::make_unique<EglContext>(profile));
}

}  // namespace refhost
