// Running one step so that a machine fault inside it (an access violation, an illegal
// instruction, a division by zero) is reported back instead of ending the host's process.
#pragma once

namespace veltrane {

// Runs action(argument). Returns false when a machine fault interrupted it: the step is
// abandoned where it faulted, without unwinding, so whatever it held at that moment is leaked.
// Returns true when it completed. C++ exceptions pass through unchanged. Where the platform
// gives a library no sound way to take a fault back (POSIX signals belong to the process), the
// action runs unguarded.
bool runCatchingMachineFaults(void (*action)(void*), void* argument);

}  // namespace veltrane
