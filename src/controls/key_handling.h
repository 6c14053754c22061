// Keys in the viewer (left Shift arms cut insertion, Escape deselects) and the query whether
// the pointer is over the selected input's region.
#pragma once

#include <cstdint>

#include "controls/instance_record.h"
#include "host/wisp_api.h"

namespace veltrane {

int onKeyDown(WispHost* host, tagWispAPI* api, uint32_t keyCode);
int onKeyUp(WispHost* host, tagWispAPI* api, uint32_t keyCode);
// 1 when an input is selected, the pointer is over a region and that region shows it.
int pointerOverSelectedInput(const EffectInstance& instance);

}  // namespace veltrane
