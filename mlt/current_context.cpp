// Saving and restoring the thread's current GL context around the bridge's own drawing.
#include "current_context.h"

#include <EGL/egl.h>
#include <GL/glx.h>

namespace veltrane_mlt {

BorrowedThread::BorrowedThread() {
  api_ = eglQueryAPI();
  // The current context is kept per client API; ours is desktop OpenGL, so that is the one an
  // application's context would have to give way to. OpenGL ES shares its slot.
  eglBindAPI(EGL_OPENGL_API);
  display_ = eglGetCurrentDisplay();
  context_ = eglGetCurrentContext();
  draw_ = eglGetCurrentSurface(EGL_DRAW);
  read_ = eglGetCurrentSurface(EGL_READ);
  if (context_ == EGL_NO_CONTEXT && api_ != EGL_OPENGL_API) {
    eglBindAPI(api_);
    display_ = eglGetCurrentDisplay();
    context_ = eglGetCurrentContext();
    draw_ = eglGetCurrentSurface(EGL_DRAW);
    read_ = eglGetCurrentSurface(EGL_READ);
    eglBindAPI(EGL_OPENGL_API);
  }
  // An X11 application's GLX context blocks any EGL context on the same thread; it is put
  // aside for the call as an EGL one is.
  glxContext_ = glXGetCurrentContext();
  if (glxContext_) {
    glxDisplay_ = glXGetCurrentDisplay();
    glxDraw_ = glXGetCurrentDrawable();
    glxRead_ = glXGetCurrentReadDrawable();
    ready_ = glXMakeContextCurrent(static_cast<Display*>(glxDisplay_), None, None, nullptr);
  }
}

BorrowedThread::~BorrowedThread() {
  restoreEgl();
  restoreGlx();
}

void BorrowedThread::restoreEgl() {
  EGLDisplay ours = eglGetCurrentDisplay();
  if (context_ != EGL_NO_CONTEXT) {
    eglBindAPI(api_);
    eglMakeCurrent(static_cast<EGLDisplay>(display_), static_cast<EGLSurface>(draw_),
                   static_cast<EGLSurface>(read_), static_cast<EGLContext>(context_));
  } else if (ours != EGL_NO_DISPLAY) {
    eglMakeCurrent(ours, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
  }
  eglBindAPI(api_);
}

void BorrowedThread::restoreGlx() {
  if (!glxContext_ || !ready_) return;
  glXMakeContextCurrent(static_cast<Display*>(glxDisplay_), glxDraw_, glxRead_,
                        static_cast<GLXContext>(glxContext_));
}

}  // namespace veltrane_mlt
