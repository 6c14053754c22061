// Escape is taken on key down only when there is a selection to clear, so the host can use an
// unclaimed Escape itself; the selection is cleared on key up.
#include "controls/key_handling.h"

namespace veltrane {

int onKeyDown(WispHost* host, tagWispAPI* api, uint32_t keyCode) {
  EffectInstance* instance = instanceOf(api);
  if (!instance) return 0;
  if (keyCode == kKeyLeftShift) {
    instance->shiftDown = 1;
    api->Redraw(host, 0);
    return 0;
  }
  if (keyCode == kKeyEscape) return instance->selectedInput >= 0 ? 1 : 0;
  return 0;
}

int onKeyUp(WispHost* host, tagWispAPI* api, uint32_t keyCode) {
  EffectInstance* instance = instanceOf(api);
  if (!instance) return 0;
  if (keyCode == kKeyLeftShift) {
    instance->shiftDown = 0;
    api->Redraw(host, 0);
    return 0;
  }
  if (keyCode == kKeyEscape && instance->selectedInput >= 0) {
    instance->selectedInput = -1;
    api->Redraw(host, 0);
    return 1;
  }
  return 0;
}

int pointerOverSelectedInput(const EffectInstance& instance) {
  return instance.selectedInput >= 0 && instance.selectedInput == instance.activeIndex &&
                 instance.regionHover
             ? 1
             : 0;
}

}  // namespace veltrane
