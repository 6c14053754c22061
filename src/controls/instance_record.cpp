// Instance lifetime. The storage is zero-filled before construction so that every byte of the
// record, padding included, has a defined value from the start.
#include "controls/instance_record.h"

#include <cstddef>
#include <cstring>
#include <new>
#include <utility>

#include "controls/parameter_accessors.h"

namespace veltrane {
namespace {

// Builds an array of N controls from make(i), in index order. Should one throw, those
// already built are destroyed in reverse order on the way out.
template <typename Control, std::size_t... I, typename Make>
std::array<Control, sizeof...(I)> buildControls(std::index_sequence<I...>, Make make) {
  return {make(static_cast<int>(I))...};
}

template <typename Control, std::size_t N, typename Make>
std::array<Control, N> buildControls(Make make) {
  return buildControls<Control>(std::make_index_sequence<N>{}, make);
}

}  // namespace

EffectInstance::EffectInstance()
    : cutPositionControls(buildControls<SplitScreenCutPositionControl, kMaxCuts>([](int i) {
        return SplitScreenCutPositionControl(cutPositionSetter(), cutPositionGetter(), i);
      })),
      cutDirectionControls(buildControls<RotationControl, kMaxCuts>([](int i) {
        return RotationControl(cutDirectionSetter(i), cutDirectionGetter(i), 0,
                               HandleMode::OnCircle, kCutDirectionHandleSize);
      })),
      inputRotationControls(buildControls<RotationControl, kInputCount>([](int i) {
        return RotationControl(inputRotationSetter(i), inputRotationGetter(i), 0,
                               HandleMode::Outside, kInputRotationHandleSize);
      })),
      inputQuadControls(buildControls<AAQuadControl, kInputCount>(
          [](int i) { return AAQuadControl(inputRectSetter(i), inputRectGetter(i), 0); })) {}

void createInstance(tagWispAPI* api) {
  void* storage = ::operator new(sizeof(EffectInstance));
  std::memset(storage, 0, sizeof(EffectInstance));
  try {
    api->instanceData = new (storage) EffectInstance();
  } catch (...) {
    ::operator delete(storage);
    throw;
  }
}

void destroyInstance(tagWispAPI* api) {
  auto* instance = instanceOf(api);
  if (!instance) return;
  instance->~EffectInstance();
  ::operator delete(instance);
  api->instanceData = nullptr;
}

void copyInstance(tagWispAPI* api, const EffectInstance* source) {
  auto* instance = instanceOf(api);
  if (!instance || !source || source == instance) return;
  *instance = *source;
}

}  // namespace veltrane
