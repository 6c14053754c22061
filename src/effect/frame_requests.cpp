// Frame requests name the current frame only: frame shifts are resolved at render time, when
// an out-of-range frame simply shows transparent black.
#include "effect/frame_requests.h"

#include <cstring>

#include "common/param_ids.h"

namespace veltrane {

int requestFrames(WispHost* host, tagWispAPI* api) {
  const auto* context = static_cast<const WispRenderContext*>(api->renderContext);
  const uint32_t frame = context ? context->frameNumber : 0;
  const int32_t time = context ? context->time : 0;
  const uint32_t frames[2] = {frame, frame};
  api->RequestFrames(host, 2, frames);

  const int numberOfCuts = api->GetIntParam(host, param::kNumberOfCuts, 0);
  const bool radial = api->GetChoiceParam(host, param::kCutType, 0) == kCutTypeRadial;
  for (int j = 0; j < kInputCount; ++j) {
    if (!inputInUse(j, numberOfCuts, radial)) continue;
    char guid[kGuidBufferSize] = {};
    api->GetLayerParam(host, inputParamId(param::kInputLayerPrefix, j).c_str(), time, guid);
    guid[kGuidBufferSize - 1] = '\0';
    if (guid[0] == '\0' || std::strcmp(guid, kNullLayerGuid) == 0) continue;
    api->RequestLayerFrames(host, guid, 2, frames);
  }
  return 1;
}

}  // namespace veltrane
