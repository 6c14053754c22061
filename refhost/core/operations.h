// Fills a host record with the C callbacks that forward each operation to its Host.
#pragma once

#include "host/wisp_api.h"

namespace refhost {

void installOperations(tagWispAPI& api);

}  // namespace refhost
