// GL start-up builds every program the render and the overlay select, each linked and found
// by name; a stage the driver will not compile leaves by the compile exception, which Notify
// answers as such; and every stage is valid GLSL 4.10 for the reference compiler as well.
#include "render/gl_startup.h"

#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cstdio>
#include <fstream>
#include <string>

#include "common/glsl_exception.h"
#include "plugin/dispatch.h"
#include "refhost/gl/gl_overrides.h"
#include "shaders/program_names.h"
#include "shaders/shader_identifiers.h"
#include "support/gl_host.h"
#include "support/temp_paths.h"

namespace {

namespace programs = veltrane::programs;

using GlStartup = testsupport::GlHostTest;

// Every program a draw selects by name.
const char* const kDrawnPrograms[] = {
    programs::kSplitScreen,          programs::kCombineBorder, programs::kDistanceField,
    programs::kLayerAlignment,       programs::kClear,         programs::kCopy,
    programs::kCutPositionControl,   programs::kCutMoveHandle, programs::kRotationControl,
    programs::kMoveHandle,           programs::kCutHandle,     programs::kQuadControl,
    programs::kDirectionScaleControl};

TEST_F(GlStartup, BuildsEveryDrawnProgramLinkedAndFoundByName) {
  testing::internal::CaptureStdout();
  buildPrograms();
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "") << "silent unless verbose";
  EXPECT_TRUE(veltrane::programsBuilt(registry_.get()));
  for (const char* name : kDrawnPrograms) {
    const int index = registry_->programIndex(name);
    ASSERT_GE(index, 0) << name;
    EXPECT_TRUE(registry_->program(index).linked) << name;
    EXPECT_EQ(registry_->programId(name), static_cast<int32_t>(registry_->program(index).id));
  }
  // The source copy selects its program by index rather than by name.
  EXPECT_EQ(registry_->programIndex(programs::kSplitScreen), programs::kSplitScreenIndex);
  // The meshes feed the distance field through the position location alone.
  EXPECT_EQ(glGetAttribLocation(registry_->programId(programs::kDistanceField),
                                veltrane::shader_ids::kVertexPosition),
            veltrane::shader_ids::kPositionLocation);

  // A second start-up, verbose, prints only the banner (the driver has nothing to say about
  // these sources) and builds every program again but the two helpers, which it keeps.
  host().setVerbose(true);
  const int before = registry_->programCount();
  const int32_t clearId = registry_->programId(programs::kClear);
  testing::internal::CaptureStdout();
  EXPECT_EQ(veltrane::prepareGl(handle(), api()), 1);
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "Veltrane Plugin\n");
  EXPECT_EQ(registry_->programCount(), 2 * before - 2);
  EXPECT_EQ(registry_->programId(programs::kClear), clearId);
}

TEST_F(GlStartup, AShaderTheDriverRefusesLeavesByTheCompileException) {
  refhost::GlOverrides refusing;
  refusing.refuseShaderCompiles = true;
  refhost::ScopedGlOverrides overrides(refusing);
  registry_ = std::make_unique<veltrane::EffectData>();
  api()->pluginData = registry_.get();
  EXPECT_THROW(veltrane::prepareGl(handle(), api()), Plugin::gl::FXGLSLexception);
  EXPECT_EQ(registry_->programCount(), 0) << "a failed compile adds nothing";
  EXPECT_FALSE(veltrane::programsBuilt(registry_.get())) << "so nothing will draw";
  EXPECT_EQ(veltrane::dispatchMessage(handle(), api(), kMessagePrepareGl), kResultException);
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
