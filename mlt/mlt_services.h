// The services this MLT module registers.
#pragma once

#include <framework/mlt.h>

namespace veltrane_mlt {

// The name both services are registered by.
extern const char* const kServiceName;

// `modulePath`, when given (the service's argument), sets the `plugin` property.
mlt_transition makeTransition(const char* modulePath);
mlt_filter makeFilter(const char* modulePath);

}  // namespace veltrane_mlt
