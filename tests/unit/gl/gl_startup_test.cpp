// GL start-up builds the thirteen programs at fixed indices on Mesa, and every stage of them is
// valid GLSL 4.10 for the reference compiler as well.
#include "render/gl_startup.h"

#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cstdio>
#include <fstream>
#include <string>

#include "support/gl_host.h"
#include "support/temp_paths.h"

namespace {

using GlStartup = testsupport::GlHostTest;

TEST_F(GlStartup, BuildsTheProgramsInTheirFixedOrderAndOnlyTheHelpersOnce) {
  testing::internal::CaptureStdout();
  buildPrograms();
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "") << "silent unless verbose";
  ASSERT_EQ(registry_->programCount(), 13);
  std::string order;  // the names by index
  for (int index = 0; index < 13; ++index) {
    for (const veltrane::ProgramName& name : registry_->programNames())
      if (name.index == index) order += name.name + " ";
    EXPECT_TRUE(registry_->program(index).linked) << index;
  }
  EXPECT_EQ(order,
            "splitScreen combineBorder distanceField layerAlignment glClear glCopy "
            "SplitScreenCutPositionControl SplitScreenCutMoveHandle RotationControl MoveHandle "
            "CutHandle AAQuadControl DirectionScaleControl ");
  EXPECT_EQ(glGetAttribLocation(registry_->program(2).id, "vertexPosition"), 0);

  // A second start-up, verbose: the banner, no logs (Mesa has nothing to say about these
  // sources), every program but the two helpers again, the new ones found first by name.
  host().setVerbose(true);
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

// The stages are read back from the built programs, so that none is left out.
TEST_F(GlStartup, EveryStageIsValidGlsl410ForTheReferenceCompiler) {
  buildPrograms();
  testsupport::ScratchDirectory folder;
  for (int index = 0; index < registry_->programCount(); ++index) {
    GLuint stages[3] = {};
    GLsizei count = 0;
    glGetAttachedShaders(registry_->program(index).id, 3, &count, stages);
    EXPECT_EQ(count, 2) << index;
    for (GLsizei k = 0; k < count; ++k) {
      GLint type = 0, length = 0;
      glGetShaderiv(stages[k], GL_SHADER_TYPE, &type);
      glGetShaderiv(stages[k], GL_SHADER_SOURCE_LENGTH, &length);
      std::string text(static_cast<size_t>(length), '\0');
      glGetShaderSource(stages[k], length, nullptr, text.data());
      text.pop_back();  // the terminator
      EXPECT_EQ(text.rfind("#version 410\n", 0), 0u) << index;
      // The validator takes the stage from the file suffix.
      const std::string path = folder.file(std::to_string(index) + "_" + std::to_string(k) +
                                           (type == GL_VERTEX_SHADER ? ".vert" : ".frag"));
      std::ofstream(path) << text;
      std::string output;
      EXPECT_EQ(validate(path, &output), 0) << path << ":\n" << output << text;
    }
  }
}

}  // namespace
