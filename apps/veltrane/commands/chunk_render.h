// The render of one chunk of a farm job (`veltrane render --plan FILE --chunk I`) and the check
// that a plan still fits its scene, which the assembly shares.
#pragma once

#include <string>
#include <vector>

#include "commands/farm_plan.h"

namespace veltrane_cli {

// True when the render's arguments name a plan.
bool isChunkRender(const std::vector<std::string>& args);

// Renders the chunk --chunk I of the plan --plan FILE into the chunk's file, replacing one a
// failed or earlier run left. A chunk out of range (UsageError) or a scene changed since the plan
// was made (std::runtime_error) stops it before anything is written.
int renderChunk(const std::vector<std::string>& args);

// The plan, when its scene file still has the checksum it was planned with; else throws
// std::runtime_error saying to make the plan again.
const FarmPlan& checkedAgainstScene(const FarmPlan& plan);

}  // namespace veltrane_cli
