// GL start-up builds every program the draws select, a stage the driver refuses leaves by the
// compile exception, and every stage is valid GLSL 4.10 for the reference compiler.
#include "render/gl_startup.h"

#include <gtest/gtest.h>

#include <string>

#include "common/glsl_exception.h"
#include "plugin/dispatch.h"
#include "refhost/gl/gl_overrides.h"
#include "shaders/program_names.h"
#include "shaders/shader_identifiers.h"
#include "support/files.h"
#include "support/gl_host.h"
#include "support/temp_paths.h"

namespace {

namespace programs = veltrane::programs;

using GlStartup = testsupport::GlHostTest;

// Every program built, the ones the draws select among them, is linked and found by its name.
TEST_F(GlStartup, BuildsEveryProgramLinkedAndFoundByName) {
  testing::internal::CaptureStdout();
  buildPrograms();
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "") << "silent unless verbose";
  EXPECT_TRUE(veltrane::programsBuilt(registry_.get()));
  for (const veltrane::ProgramName& named : registry_->programNames()) {
    const auto& program = registry_->program(named.index);
    EXPECT_TRUE(program.linked) << named.name;
    EXPECT_EQ(registry_->programId(named.name), static_cast<int32_t>(program.id)) << named.name;
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

// The stages are read back from the built programs, so that none is left out; the validator
// takes each stage from its file's suffix.
TEST_F(GlStartup, EveryStageIsValidGlsl410ForTheReferenceCompiler) {
  buildPrograms();
  testsupport::ScratchDirectory folder;
  std::string files;
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
      const std::string path = folder.file(std::to_string(index) + "_" + std::to_string(k) +
                                           (type == GL_VERTEX_SHADER ? ".vert" : ".frag"));
      testsupport::writeText(path, text);
      files += " " + path;
    }
  }
  const std::string output =
      testsupport::commandOutput("glslangValidator" + files + " 2>&1 || echo INVALID");
  EXPECT_EQ(output.find("INVALID"), std::string::npos) << output;
}

}  // namespace
