// The stop-signal handlers: POSIX sigaction where there is one, the C library's signal()
// (SIGINT and SIGTERM only) elsewhere.
#include "cli/stop_signals.h"

#include <atomic>
#include <csignal>
#include <string>

namespace veltrane_cli {
namespace {

// Written by the handler, read by the command's thread: lock-free atomics are safe in both.
std::atomic<int> stopSignal{0};
static_assert(std::atomic<int>::is_always_lock_free);

extern "C" void noteStop(int signal) { stopSignal.store(signal); }

std::string signalName(int signal) {
  switch (signal) {
    case SIGINT:
      return "SIGINT";
    case SIGTERM:
      return "SIGTERM";
#ifdef SIGHUP
    case SIGHUP:
      return "SIGHUP";
#endif
  }
  return "signal " + std::to_string(signal);
}

#ifdef _WIN32
void installHandlers() {
  std::signal(SIGINT, noteStop);  // reset to the default on delivery, as SA_RESETHAND below
  std::signal(SIGTERM, noteStop);
}
#else
void installHandlers() {
  struct sigaction action = {};
  action.sa_handler = noteStop;
  sigemptyset(&action.sa_mask);
  // Interrupted reads and writes carry on; the next signal takes the default action.
  action.sa_flags = SA_RESTART | SA_RESETHAND;
  for (int signal : {SIGINT, SIGTERM, SIGHUP}) sigaction(signal, &action, nullptr);
}
#endif

}  // namespace

Stopped::Stopped(int signal)
    : std::runtime_error("stopped by " + signalName(signal) + "; nothing was written"),
      signal_(signal) {}

void noteStopSignals() { installHandlers(); }

void throwIfStopped() {
  int signal = stopSignal.load();
  if (signal != 0) throw Stopped(signal);
}

}  // namespace veltrane_cli
