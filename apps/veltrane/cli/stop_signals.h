// Stopping a command that writes files on SIGINT, SIGTERM or SIGHUP without leaving anything
// behind: the handler only notes the signal; the command looks between frames and unwinds, and
// unwinding deletes its temporaries.
#pragma once

#include <stdexcept>

namespace veltrane_cli {

// The command was asked to stop; the dispatcher exits with 128 + the signal's number.
class Stopped : public std::runtime_error {
 public:
  explicit Stopped(int signal);
  int signal() const { return signal_; }

 private:
  int signal_;
};

// From here on the stop signals are noted instead of ending the process. A second one of the
// same kind ends it at once, for when the first is not answered soon enough.
void noteStopSignals();

// Throws Stopped when a stop signal arrived.
void throwIfStopped();

}  // namespace veltrane_cli
