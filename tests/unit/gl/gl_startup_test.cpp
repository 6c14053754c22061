// GL start-up builds the thirteen programs at fixed indices on Mesa, and every GLSL source of
// the project is valid GLSL 4.10 for the reference compiler as well.
#include "render/gl_startup.h"

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <string>

#include "shaders/control_shaders.h"
#include "shaders/effect_shaders.h"
#include "support/gl_host.h"
#include "support/temp_paths.h"

namespace {

using GlStartup = testsupport::GlHostTest;

TEST_F(GlStartup, BuildsTheProgramsInTheirFixedOrderAndOnlyTheHelpersOnce) {
  const char* const order[] = {"splitScreen",
                               "combineBorder",
                               "distanceField",
                               "layerAlignment",
                               "glClear",
                               "glCopy",
                               "SplitScreenCutPositionControl",
                               "SplitScreenCutMoveHandle",
                               "RotationControl",
                               "MoveHandle",
                               "CutHandle",
                               "AAQuadControl",
                               "DirectionScaleControl"};
  testing::internal::CaptureStdout();
  buildPrograms();
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "") << "silent unless verbose";
  ASSERT_EQ(registry_->programCount(), 13);
  for (int index = 0; index < 13; ++index) {
    EXPECT_EQ(registry_->programIndex(order[index]), index) << order[index];
    EXPECT_TRUE(registry_->program(index).linked) << order[index];
  }
  EXPECT_EQ(glGetAttribLocation(registry_->program(2).id, "vertexPosition"), 0);

  // A second start-up, verbose: the banner, no logs (Mesa has nothing to say about these
  // sources), every program but the two helpers again, the new ones found first by name.
  api()->verbose = 1;
  const int32_t clearId = registry_->programId("glClear");
  testing::internal::CaptureStdout();
  EXPECT_EQ(veltrane::prepareGl(handle(), api()), 1);
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "Veltrane Plugin\n");
  EXPECT_EQ(registry_->programCount(), 24);
  EXPECT_EQ(registry_->programId("glClear"), clearId);
  EXPECT_EQ(registry_->programIndex("splitScreen"), 13);
  EXPECT_EQ(registry_->programIndex("distanceField"), 15);
  EXPECT_TRUE(registry_->program(15).linked) << "bound and linked by name";
  EXPECT_EQ(registry_->programIndex("DirectionScaleControl"), 23);
}

// Runs glslangValidator on `path`; returns its exit status and collects its output.
int validate(const std::string& path, std::string* output) {
  FILE* pipe = popen(("glslangValidator " + path + " 2>&1").c_str(), "r");
  if (pipe == nullptr) return -1;
  char buffer[512];
  while (fgets(buffer, sizeof buffer, pipe) != nullptr) *output += buffer;
  const int status = pclose(pipe);
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

TEST(ShaderSources, EveryStageIsValidGlsl410ForTheReferenceCompiler) {
  namespace s = veltrane::shaders;
  const struct {
    const char* name;
    const char* stage;  // the validator takes the stage from the file suffix
    const std::string& text;
  } sources[] = {
      {"texturedVertex", "vert", s::kTexturedVertex},
      {"distanceVertex", "vert", s::kDistanceVertex},
      {"solidVertex", "vert", s::kSolidVertex},
      {"layerAlignmentVertex", "vert", s::kLayerAlignmentVertex},
      {"splitScreenFragment", "frag", s::kSplitScreenFragment},
      {"combineBorderFragment", "frag", s::kCombineBorderFragment},
      {"distanceFragment", "frag", s::kDistanceFragment},
      {"solidFragment", "frag", s::kSolidFragment},
      {"copyFragment", "frag", s::kCopyFragment},
      {"rotationHandleFragment", "frag", s::kRotationHandleFragment},
      {"doubleArrowFragment", "frag", s::kDoubleArrowFragment},
      {"quadEdgesFragment", "frag", s::kQuadEdgesFragment},
      {"cutMarkerFragment", "frag", s::kCutMarkerFragment},
      {"moveMarkerFragment", "frag", s::kMoveMarkerFragment},
  };
  const std::string directory = testsupport::makeTempDirectory("veltrane_glsl_");
  for (const auto& source : sources) {
    EXPECT_EQ(source.text.rfind("#version 410\n", 0), 0u) << source.name;
    const std::string path = std::string(directory) + "/" + source.name + "." + source.stage;
    std::ofstream(path) << source.text;
    std::string output;
    EXPECT_EQ(validate(path, &output), 0) << source.name << ":\n" << output << source.text;
    std::remove(path.c_str());
  }
  rmdir(directory.c_str());
}

}  // namespace
