// The parameter panel: 69 parameters in 20 groups. The not-in-use flag marks the parameters the
// default layout (one Local cut, inputs 0 and 1) leaves unused; cut directions and input
// rotations add their angle flags.
#include "effect/param_declaration.h"

#include <string>

#include "common/param_ids.h"
#include "common/plugin_exception.h"

namespace veltrane {
namespace {

// The preset is a placeholder for the host's own presets; the global position is used only by
// Radial cuts, which the default layout does not have.
constexpr int32_t kPresetFlags = kParamFlagHostPresets | kParamFlagNotSaved | kParamFlagNotInUse;
constexpr int32_t kGlobalPositionFlags =
    kParamFlagHostHandle | kParamFlagNotInUse | kParamFlagAnimated;
constexpr float kFirstCutDirectionDegrees = 225.0f;

// The default layout uses the first cut and the two inputs on either side of it.
int32_t cutFlags(int cutIndex) {
  return cutIndex == 0 ? kParamFlagAnimated : kParamFlagAnimated | kParamFlagNotInUse;
}
int32_t inputFlags(int inputIndex) {
  return inputIndex <= 1 ? kParamFlagAnimated : kParamFlagAnimated | kParamFlagNotInUse;
}

// Every host call is checked at once: the first refusal stops the declaration.
void check(int32_t result) {
  if (result != 0) throw PluginException(kDeclarationRefused);
}

class Declarer {
 public:
  Declarer(WispHost* host, tagWispAPI* api) : host_(host), api_(api) {}

  void run() {
    const int32_t presetDefault = 0;
    check(api_->AddChoiceParam(host_, L"Preset", param::kPreset, kPresetFlags, L"N/A",
                               &presetDefault, 0));
    declareCuts();
    declareInputs();
    declareBorder();
  }

 private:
  void declareCuts() {
    check(api_->BeginParamGroup(host_, L"Cuts"));
    const int32_t cutTypeDefault = 0;
    check(api_->AddChoiceParam(host_, L"Cut Type", param::kCutType, kParamFlagsNone,
                               L"Local|Radial", &cutTypeDefault, 0));
    check(api_->AddIntParam(host_, L"Number of Cuts", L"", param::kNumberOfCuts, kParamFlagsNone, 1,
                            kMaxCuts, 1));
    check(api_->AddBoolParam(host_, L"View Cut Regions", param::kViewCutRegions, kParamFlagAnimated,
                             0));
    check(api_->AddPointParam(host_, L"Position", param::kCutPositionGlobal, kGlobalPositionFlags,
                              0.0f, 0.0f));
    for (int i = 0; i < kMaxCuts; ++i) {
      const std::wstring group = L"Cut " + std::to_wstring(i + 1);
      check(api_->BeginParamGroup(host_, group.c_str()));
      const std::string position = cutParamId(param::kCutPositionPrefix, i);
      check(api_->AddPointParam(host_, L"Position", position.c_str(), cutFlags(i), 0.0f, 0.0f));
      const std::string direction = cutParamId(param::kCutDirectionPrefix, i);
      check(api_->AddAngleParam(host_, L"Direction", direction.c_str(),
                                cutFlags(i) | kParamFlagsDirection, 1,
                                i == 0 ? kFirstCutDirectionDegrees : 0.0f));
      check(api_->EndParamGroup(host_));
    }
    check(api_->EndParamGroup(host_));
  }

  void declareInputs() {
    check(api_->BeginParamGroup(host_, L"Input Layers/Frames"));
    for (int j = 0; j < kInputCount; ++j) {
      const std::wstring group = L"Input " + std::to_wstring(j);
      check(api_->BeginParamGroup(host_, group.c_str()));
      const int32_t flags = inputFlags(j);
      const std::wstring layerName = hostNumbersLayerLabels(api_->GetHostId(host_))
                                         ? L"Layer " + std::to_wstring(j)
                                         : std::wstring(L"Layer");
      const std::string layer = inputParamId(param::kInputLayerPrefix, j);
      check(api_->AddLayerParam(host_, layerName.c_str(), layer.c_str(), flags));
      const std::string shift = inputParamId(param::kInputFrameShiftPrefix, j);
      check(api_->AddIntParam(host_, L"Frame Shift", L"", shift.c_str(), flags, -100000, 10000, 0));
      const std::string translation = inputParamId(param::kInputFrameTranslationPrefix, j);
      check(api_->AddPointParam(host_, L"Translation", translation.c_str(), flags, 0.0f, 0.0f));
      const std::string scale = inputParamId(param::kInputFrameScalePrefix, j);
      check(api_->AddFloatParam(host_, L"Scale", L"%", scale.c_str(), flags, 1.0f, 1000.0f, 100.0f,
                                1));
      const std::string rotation = inputParamId(param::kInputFrameRotationPrefix, j);
      check(api_->AddAngleParam(host_, L"Rotation", rotation.c_str(), flags | kParamFlagsRotation,
                                1, 0.0f));
      check(api_->EndParamGroup(host_));
    }
    check(api_->EndParamGroup(host_));
  }

  void declareBorder() {
    check(api_->BeginParamGroup(host_, L"Border"));
    check(api_->AddFloatParam(host_, L"Width", L"px", param::kBorderWidth, kParamFlagAnimated, 0.0f,
                              200.0f, 2.0f, 1));
    check(api_->AddColorParam(host_, L"Color", param::kBorderColor, kParamFlagAnimated, 0.0f, 0.0f,
                              0.0f));
    check(api_->AddFloatParam(host_, L"Alpha", L"", param::kBorderAlpha, kParamFlagAnimated, 0.0f,
                              1.0f, 1.0f, 2));
    check(api_->EndParamGroup(host_));
  }

  WispHost* host_;
  tagWispAPI* api_;
};

}  // namespace

bool hostNumbersLayerLabels(int32_t hostId) {
  return hostId == kHostProductCompositor || hostId == kHostProductCompositorPro ||
         hostId == kHostProductRenderNode || hostId == kHostProductCompositorPreview;
}

int declareParameters(WispHost* host, tagWispAPI* api) {
  Declarer(host, api).run();
  return 1;
}

}  // namespace veltrane
