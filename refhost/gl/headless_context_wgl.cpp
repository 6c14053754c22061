// WGL context on a hidden window: a legacy context on the window's pixel format lends
// wglCreateContextAttribsARB, which then makes the 4.1 debug context the host keeps.
#include <windows.h>
// GLEW's headers come after windows.h, which they expect for the WGL types.
#include <GL/glew.h>
#include <GL/wglew.h>

#include <stdexcept>
#include <string>

#include "refhost/gl/headless_context.h"

namespace refhost {
namespace {

constexpr wchar_t kWindowClass[] = L"VeltraneHostGlWindow";

std::runtime_error wglError(const char* step) {
  return std::runtime_error("cannot create an OpenGL context: " + std::string(step) +
                            " failed (Windows error " + std::to_string(GetLastError()) + ")");
}

// The window is never shown: it exists for its device context, which carries the pixel format
// every context of the window shares. Host rendering goes to framebuffer objects.
HWND createHiddenWindow() {
  static const ATOM windowClass = [] {
    WNDCLASSW description{};
    description.style = CS_OWNDC;
    description.lpfnWndProc = DefWindowProcW;
    description.hInstance = GetModuleHandleW(nullptr);
    description.lpszClassName = kWindowClass;
    return RegisterClassW(&description);
  }();
  if (!windowClass) throw wglError("RegisterClassW");
  HWND window = CreateWindowExW(0, kWindowClass, L"", WS_OVERLAPPEDWINDOW, 0, 0, 16, 16, nullptr,
                                nullptr, GetModuleHandleW(nullptr), nullptr);
  if (!window) throw wglError("CreateWindowExW");
  return window;
}

void setPixelFormat(HDC deviceContext) {
  PIXELFORMATDESCRIPTOR format{};
  format.nSize = sizeof format;
  format.nVersion = 1;
  format.dwFlags = PFD_DRAW_TO_WINDOW | PFD_SUPPORT_OPENGL | PFD_DOUBLEBUFFER;
  format.iPixelType = PFD_TYPE_RGBA;
  format.cColorBits = 32;
  format.cAlphaBits = 8;
  format.cDepthBits = 24;
  format.cStencilBits = 8;
  format.iLayerType = PFD_MAIN_PLANE;
  const int chosen = ChoosePixelFormat(deviceContext, &format);
  if (!chosen) throw wglError("ChoosePixelFormat");
  if (!SetPixelFormat(deviceContext, chosen, &format)) throw wglError("SetPixelFormat");
}

// wglCreateContextAttribsARB is only reachable with some context current.
PFNWGLCREATECONTEXTATTRIBSARBPROC contextCreator(HDC deviceContext) {
  HGLRC legacy = wglCreateContext(deviceContext);
  if (!legacy) throw wglError("wglCreateContext");
  PFNWGLCREATECONTEXTATTRIBSARBPROC creator = nullptr;
  if (wglMakeCurrent(deviceContext, legacy)) {
    // Through void(*)(), the generic function pointer type, as every GL loader casts PROC.
    creator = reinterpret_cast<PFNWGLCREATECONTEXTATTRIBSARBPROC>(
        reinterpret_cast<void (*)()>(wglGetProcAddress("wglCreateContextAttribsARB")));
  }
  wglMakeCurrent(nullptr, nullptr);
  wglDeleteContext(legacy);
  if (!creator) throw wglError("wglGetProcAddress(wglCreateContextAttribsARB)");
  return creator;
}

class WglContext : public PlatformContext {
 public:
  explicit WglContext(GlProfile profile) {
    window_ = createHiddenWindow();
    deviceContext_ = GetDC(window_);
    try {
      if (!deviceContext_) throw wglError("GetDC");
      setPixelFormat(deviceContext_);
      const int attributes[] = {WGL_CONTEXT_MAJOR_VERSION_ARB,
                                4,
                                WGL_CONTEXT_MINOR_VERSION_ARB,
                                1,
                                WGL_CONTEXT_PROFILE_MASK_ARB,
                                profile == GlProfile::Core
                                    ? WGL_CONTEXT_CORE_PROFILE_BIT_ARB
                                    : WGL_CONTEXT_COMPATIBILITY_PROFILE_BIT_ARB,
                                WGL_CONTEXT_FLAGS_ARB,
                                WGL_CONTEXT_DEBUG_BIT_ARB,
                                0};
      context_ = contextCreator(deviceContext_)(deviceContext_, nullptr, attributes);
      if (!context_) throw wglError("wglCreateContextAttribsARB (OpenGL 4.1)");
      makeCurrent();
    } catch (...) {
      release();
      throw;
    }
  }
  ~WglContext() override { release(); }
  WglContext(const WglContext&) = delete;
  WglContext& operator=(const WglContext&) = delete;

  void makeCurrent() override {
    if (!wglMakeCurrent(deviceContext_, context_)) throw wglError("wglMakeCurrent");
  }

 private:
  void release() {
    if (context_) {
      wglMakeCurrent(nullptr, nullptr);
      wglDeleteContext(context_);
      context_ = nullptr;
    }
    if (deviceContext_) ReleaseDC(window_, deviceContext_);
    DestroyWindow(window_);
    deviceContext_ = nullptr;
    window_ = nullptr;
  }

  HWND window_ = nullptr;
  HDC deviceContext_ = nullptr;
  HGLRC context_ = nullptr;
};

}  // namespace

std::unique_ptr<GlContext> makeHeadlessContext(GlProfile profile) {
  return std::make_unique<GlContext>(profile, std::make_unique<WglContext>(profile));
}

}  // namespace refhost
