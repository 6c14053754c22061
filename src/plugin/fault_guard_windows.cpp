// Windows side of the fault guard: a vectored exception handler, registered only while the step
// runs, redirects the faulting thread to a landing function that jumps back to the guard with
// GCC's __builtin_longjmp. docs/windows.md explains why this is sound under mingw-w64 g++.
#include <windows.h>

#include "plugin/fault_guard.h"

#if !defined(__x86_64__)
#error "the fault guard resumes x86-64 thread contexts only"
#endif

namespace veltrane {
namespace {

// The one armed guard. Messages reach the plug-in one at a time, so one slot is enough; the
// thread id keeps faults of the host's other threads out of it.
void* jumpBuffer[5];  // what __builtin_setjmp stores: frame, resume address, stack
volatile DWORD guardedThread = 0;
volatile bool armed = false;

// Faults raised by the processor or the memory manager. Software exceptions (C++ throws travel
// as SEH exceptions under this compiler), breakpoints and stack overflow are left alone: a
// stack overflow leaves no guard page to run the landing on safely.
bool isMachineFault(DWORD code) {
  switch (code) {
    case EXCEPTION_ACCESS_VIOLATION:
    case EXCEPTION_IN_PAGE_ERROR:
    case EXCEPTION_ILLEGAL_INSTRUCTION:
    case EXCEPTION_PRIV_INSTRUCTION:
    case EXCEPTION_INT_DIVIDE_BY_ZERO:
    case EXCEPTION_INT_OVERFLOW:
    case EXCEPTION_ARRAY_BOUNDS_EXCEEDED:
    case EXCEPTION_DATATYPE_MISALIGNMENT:
    case EXCEPTION_FLT_DIVIDE_BY_ZERO:
    case EXCEPTION_FLT_INVALID_OPERATION:
    case EXCEPTION_FLT_OVERFLOW:
    case EXCEPTION_FLT_UNDERFLOW:
    case EXCEPTION_FLT_INEXACT_RESULT:
    case EXCEPTION_FLT_DENORMAL_OPERAND:
    case EXCEPTION_FLT_STACK_CHECK:
      return true;
    default:
      return false;
  }
}

// Entered on the faulting thread after the system has left its exception dispatch, as an
// ordinary function: the jump back to the guard's frame is then a plain non-local goto.
[[noreturn]] __attribute__((noinline)) void landAfterFault() { __builtin_longjmp(jumpBuffer, 1); }

LONG CALLBACK onException(EXCEPTION_POINTERS* info) {
  if (!armed || GetCurrentThreadId() != guardedThread ||
      !isMachineFault(info->ExceptionRecord->ExceptionCode))
    return EXCEPTION_CONTINUE_SEARCH;
  armed = false;
  // Resume in landAfterFault on the same stack, well below the frame that faulted, with the
  // stack aligned as a call leaves it (16-byte boundary minus the return-address slot).
  CONTEXT* context = info->ContextRecord;
  const DWORD64 stack = (context->Rsp - 512) & ~static_cast<DWORD64>(15);
  context->Rsp = stack - 8;
  context->Rip = reinterpret_cast<DWORD64>(&landAfterFault);
  return EXCEPTION_CONTINUE_EXECUTION;
}

// Removes the handler on every way out, exceptions included.
class HandlerRegistration {
 public:
  HandlerRegistration() : handle_(AddVectoredExceptionHandler(1, onException)) {}
  ~HandlerRegistration() {
    armed = false;
    if (handle_) RemoveVectoredExceptionHandler(handle_);
  }
  HandlerRegistration(const HandlerRegistration&) = delete;
  HandlerRegistration& operator=(const HandlerRegistration&) = delete;

 private:
  void* handle_;
};

// Kept out of line and free of locals, so nothing it holds can be stale after the jump back.
__attribute__((noinline)) bool runArmed(void (*action)(void*), void* argument) {
  if (__builtin_setjmp(jumpBuffer) != 0) return false;
  guardedThread = GetCurrentThreadId();
  armed = true;
  action(argument);
  armed = false;
  return true;
}

}  // namespace

bool runCatchingMachineFaults(void (*action)(void*), void* argument) {
  HandlerRegistration registration;
  return runArmed(action, argument);
}

}  // namespace veltrane
