// The fixed build order gives every program a stable registry index: the render selects
// "splitScreen" as index 0. "glClear" and "glCopy" may already exist and are never doubled.
#include "render/gl_startup.h"

#include <GL/glew.h>

#include <iostream>

#include "gl/effect_data.h"
#include "shaders/control_shaders.h"
#include "shaders/effect_shaders.h"
#include "shaders/program_names.h"
#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace {

void buildEffectPrograms(EffectData& registry, bool verbose) {
  registry.addProgram(shaders::kTexturedVertex, shaders::kSplitScreenFragment, verbose,
                      programs::kSplitScreen, true, true);
  registry.addProgram(shaders::kTexturedVertex, shaders::kCombineBorderFragment, verbose,
                      programs::kCombineBorder, true, true);
  registry.createProgram(shaders::kDistanceVertex, shaders::kDistanceFragment, verbose,
                         programs::kDistanceField);
  registry.bindAttribute(programs::kDistanceField, shader_ids::kPositionLocation,
                         shader_ids::kVertexPosition);
  registry.linkProgram(programs::kDistanceField, verbose);
  registry.addProgram(shaders::kLayerAlignmentVertex, shaders::kCopyFragment, verbose,
                      programs::kLayerAlignment, true, true);
}

void buildHelperPrograms(EffectData& registry, bool verbose) {
  if (registry.programId(programs::kClear) == -1) {
    registry.createProgram(shaders::kSolidVertex, shaders::kSolidFragment, verbose,
                           programs::kClear);
    registry.bindAttribute(programs::kClear, shader_ids::kPositionLocation,
                           shader_ids::kVertexPosition);
    registry.linkProgram(programs::kClear, verbose);
  }
  if (registry.programId(programs::kCopy) == -1) {
    registry.addProgram(shaders::kTexturedVertex, shaders::kCopyFragment, verbose, programs::kCopy,
                        true, true);
  }
}

void buildControlPrograms(EffectData& registry, bool verbose) {
  const struct {
    const char* name;
    const std::string& fragment;
  } controls[] = {
      // The hot cut position handle is drawn by the move handle's program; the control's own
      // program, which no draw selects, gets the same arrow.
      {programs::kCutPositionControl, shaders::kDoubleArrowFragment},
      {programs::kCutMoveHandle, shaders::kDoubleArrowFragment},
      {programs::kRotationControl, shaders::kRotationHandleFragment},
      {programs::kMoveHandle, shaders::kMoveMarkerFragment},
      {programs::kCutHandle, shaders::kCutMarkerFragment},
      {programs::kQuadControl, shaders::kQuadEdgesFragment},
      {programs::kDirectionScaleControl, shaders::kDoubleArrowFragment},
  };
  for (const auto& control : controls) {
    registry.addProgram(shaders::kTexturedVertex, control.fragment, verbose, control.name, true,
                        true);
  }
}

}  // namespace

int prepareGl(WispHost* /*host*/, tagWispAPI* api) {
  glewExperimental = GL_TRUE;
  glewInit();  // headless contexts report a missing display yet load every entry point
  const bool verbose = api->verbose != 0;
  if (verbose) std::cout << "Veltrane Plugin" << std::endl;
  auto* registry = static_cast<EffectData*>(api->pluginData);
  if (registry == nullptr) return 1;
  buildEffectPrograms(*registry, verbose);
  buildHelperPrograms(*registry, verbose);
  buildControlPrograms(*registry, verbose);
  return 1;
}

bool programsBuilt(const EffectData* registry) {
  if (registry == nullptr) return false;
  for (const char* name :
       {programs::kSplitScreen, programs::kCombineBorder, programs::kDistanceField,
        programs::kLayerAlignment, programs::kClear, programs::kCopy, programs::kCutPositionControl,
        programs::kCutMoveHandle, programs::kRotationControl, programs::kMoveHandle,
        programs::kCutHandle, programs::kQuadControl, programs::kDirectionScaleControl}) {
    if (registry->programIndex(name) < 0) return false;
  }
  return true;
}

}  // namespace veltrane
