// POSIX side of the fault guard: signal dispositions are process-wide and belong to the host,
// so a library does not take SIGSEGV over; the step simply runs.
#include "plugin/fault_guard.h"

namespace veltrane {

bool runCatchingMachineFaults(void (*action)(void*), void* argument) {
  action(argument);
  return true;
}

}  // namespace veltrane
