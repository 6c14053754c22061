// The menu lists the layers that carry an image. Effect layers are offered only from the own
// layer onwards in host order; choosing the own layer stores the null GUID, which shows the
// effect's own source. The choice is stored without an undo step of its own.
#include "effect/layer_picker.h"

#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

#include "common/param_ids.h"
#include "controls/instance_record.h"
#include "controls/key_handling.h"

namespace veltrane {
namespace {

constexpr int kLayerNameBufferSize = 256;

bool kindCarriesNoImage(int32_t kind) {
  return layerTypeIn(static_cast<uint32_t>(kind), kLayerTypesWithoutImage);
}

}  // namespace

int pickLayerForSelectedInput(WispHost* host, tagWispAPI* api) {
  EffectInstance* instance = instanceOf(api);
  if (!instance || !pointerOverSelectedInput(*instance)) return 0;

  const auto* context = static_cast<const WispLayerPickerContext*>(api->renderContext);
  const std::string ownGuid = context && context->ownLayerGuid ? context->ownLayerGuid : "";

  const int32_t count = api->GetLayerCount(host);
  std::vector<std::string> guids;
  std::vector<std::string> names;
  // Room for the host's count up front, within reason: a nonsense count must not turn into
  // one huge allocation before a single layer has been read.
  constexpr int32_t kReservedLayers = 256;
  if (count > 0) {
    guids.reserve(static_cast<size_t>(std::min(count, kReservedLayers)));
    names.reserve(static_cast<size_t>(std::min(count, kReservedLayers)));
  }
  bool ownLayerSeen = false;
  for (int32_t k = 0; k < count; ++k) {
    char guid[kGuidBufferSize] = {};
    std::strncpy(guid, kNullLayerGuid, kGuidBufferSize - 1);
    char name[kLayerNameBufferSize] = {};
    int32_t kind = 0;
    api->GetLayerInfo(host, k, guid, name, kLayerNameBufferSize, &kind);
    guid[kGuidBufferSize - 1] = '\0';
    name[kLayerNameBufferSize - 1] = '\0';
    const bool isOwnLayer = ownGuid == guid;
    if (isOwnLayer) ownLayerSeen = true;
    if (std::strcmp(guid, kNullLayerGuid) == 0) continue;
    if (kindCarriesNoImage(kind)) continue;
    if (kind == kLayerTypeEffect && !ownLayerSeen) continue;
    guids.emplace_back(isOwnLayer ? kNullLayerGuid : guid);
    names.emplace_back(name);
  }

  std::string menu;
  for (size_t i = 0; i < names.size(); ++i) {
    if (i > 0) menu += '|';
    menu += names[i];
  }
  const int32_t chosen = api->ShowPopupMenu(host, menu.c_str());
  if (chosen >= 0 && static_cast<size_t>(chosen) < guids.size()) {
    const std::string id = inputParamId(param::kInputLayerPrefix, instance->selectedInput);
    api->SetLayerParam(host, id.c_str(), 0, guids[static_cast<size_t>(chosen)].c_str(), 0);
  }
  return 1;
}

}  // namespace veltrane
