// Only the cut count and the cut type decide which parameters are in use; after a change to
// either, every cut and input parameter is told its state (62 calls), changed or not.
#include "effect/param_change.h"

#include <cstring>
#include <string>

#include "common/param_ids.h"

namespace veltrane {
namespace {

void setEnabled(WispHost* host, tagWispAPI* api, const std::string& id, bool usable) {
  const uint8_t state = usable ? 1 : 0;
  api->SetParamEnabled(host, id.c_str(), &state);
}

}  // namespace

int onParameterChanged(WispHost* host, tagWispAPI* api, const char* id) {
  if (!id || (std::strcmp(id, param::kNumberOfCuts) != 0 && std::strcmp(id, param::kCutType) != 0))
    return 1;
  const int numberOfCuts = api->GetIntParam(host, param::kNumberOfCuts, 0);
  const bool radial = api->GetChoiceParam(host, param::kCutType, 0) == kCutTypeRadial;

  setEnabled(host, api, param::kCutPositionGlobal, radial);
  for (int i = 0; i < kMaxCuts; ++i) {
    setEnabled(host, api, cutParamId(param::kCutPositionPrefix, i), i < numberOfCuts && !radial);
    setEnabled(host, api, cutParamId(param::kCutDirectionPrefix, i), i < numberOfCuts);
  }
  static constexpr const char* kInputPrefixes[] = {
      param::kInputLayerPrefix, param::kInputFrameShiftPrefix, param::kInputFrameTranslationPrefix,
      param::kInputFrameScalePrefix, param::kInputFrameRotationPrefix};
  for (int j = 0; j < kInputCount; ++j) {
    const bool usable = inputInUse(j, numberOfCuts, radial);
    for (const char* prefix : kInputPrefixes)
      setEnabled(host, api, inputParamId(prefix, j), usable);
  }
  return 1;
}

}  // namespace veltrane
