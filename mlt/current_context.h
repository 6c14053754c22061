// Borrowing the calling thread for our own GL context: whatever context the application had
// current (EGL or GLX) is put aside while the bridge draws and made current again afterwards.
#pragma once

#include <functional>

namespace veltrane_mlt {

// While it lives, nothing of the application's is current on this thread; its destructor makes
// current again exactly what was current when it was made (display, surfaces, context and bound
// EGL API, or the GLX context and its drawables), or releases ours when nothing was.
class BorrowedThread {
 public:
  BorrowedThread();
  ~BorrowedThread();
  BorrowedThread(const BorrowedThread&) = delete;
  BorrowedThread& operator=(const BorrowedThread&) = delete;

  // False when the application's GLX context could not be put aside (the thread then keeps it,
  // and no EGL context can be made current here).
  bool ready() const { return ready_; }

 private:
  void restoreEgl();
  void restoreGlx();

  // EGL state (opaque handles, so that this header needs no EGL).
  unsigned api_ = 0;
  void* display_ = nullptr;
  void* draw_ = nullptr;
  void* read_ = nullptr;
  void* context_ = nullptr;
  // GLX state.
  void* glxDisplay_ = nullptr;
  unsigned long glxDraw_ = 0;
  unsigned long glxRead_ = 0;
  void* glxContext_ = nullptr;
  bool ready_ = true;
};

}  // namespace veltrane_mlt
