// The program registry on Mesa: build, link, failures and their printed logs, name order and
// deletion, and whose uniforms are looked up. (Attributes and uniform setting show in the draws.)
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "gl/effect_data.h"
#include "support/gl_host.h"

namespace {

using veltrane::EffectData;

const std::string kVertex =
    "#version 410\nin vec4 vertexPosition;\nin vec2 vertexTexCoord;\nout vec2 fragTexCoord;\n"
    "void main() { fragTexCoord = vertexTexCoord; gl_Position = vertexPosition; }\n";
// Compiles with a warning about the unknown extension.
const std::string kWarningVertex =
    "#version 410\n#extension GL_VELTRANE_no_such_extension : warn\nin vec4 vertexPosition;\n"
    "out vec2 fragTexCoord;\n"
    "void main() { fragTexCoord = vertexPosition.xy; gl_Position = vertexPosition; }\n";
const std::string kFragment =
    "#version 410\nin vec2 fragTexCoord;\nuniform vec4 onlyFirst;\n"
    "layout(location = 0) out vec4 colour;\n"
    "void main() { colour = onlyFirst + vec4(fragTexCoord, 0.0, 0.0); }\n";
const std::string kPlainFragment =
    "#version 410\nlayout(location = 0) out vec4 colour;\nvoid main() { colour = vec4(1.0); }\n";
const std::string kBrokenFragment =
    "#version 410\nlayout(location = 0) out vec4 colour;\nvoid main() { colour = vec4(1.0) +; }\n";
// Compiles, but the declared function has no body anywhere: the link fails.
const std::string kUnresolvedFragment =
    "#version 410\nlayout(location = 0) out vec4 colour;\nvec4 shade();\n"
    "void main() { colour = shade(); }\n";

std::string compileLog(GLenum type, const std::string& source) {
  GLuint shader = glCreateShader(type);
  const char* text = source.c_str();
  glShaderSource(shader, 1, &text, nullptr);
  glCompileShader(shader);
  char log[4096] = {};
  glGetShaderInfoLog(shader, sizeof log, nullptr, log);
  glDeleteShader(shader);
  return log;
}

using ProgramRegistry = testsupport::GlHostTest;

// A build prints the compile logs only when verbose, each once: a warning alone, or every log up
// to a failed compile, which throws type 0 and leaves the registry as it was. A failed link
// throws type 1 after the unlinked program was added with its log, which it prints.
TEST_F(ProgramRegistry, BuildsPrintLogsWhenVerboseAndThrowTheFailuresType) {
  const std::string warning = compileLog(GL_VERTEX_SHADER, kWarningVertex);
  const std::string broken = compileLog(GL_FRAGMENT_SHADER, kBrokenFragment);
  ASSERT_NE(warning.find("warning"), std::string::npos) << warning;
  using namespace Plugin::gl;
  const struct {
    const std::string &vertex, &fragment;
    bool verbose;
    std::string printed;
    int type;  // of the failure thrown; -1 for none
    const char* error;
  } cases[] = {
      {kWarningVertex, kFragment, true, warning, -1, ""},
      {kWarningVertex, kFragment, false, "", -1, ""},
      {kWarningVertex, kBrokenFragment, true, warning + "\n" + broken, GLSLErrorType_ShaderCompile,
       "GLSLErrorType_ShaderCompile - The Shader failed to compile."},
      {kVertex, kUnresolvedFragment, true, "", GLSLErrorType_ShaderLink,
       "GLSLErrorType_ShaderLink - The shader program failed to link."}};
  for (const auto& c : cases) {
    EffectData registry;
    registry.addProgram(kVertex, kFragment, false, "kept", true, true);
    testing::internal::CaptureStdout();
    int type = -1;
    std::string error;
    try {
      EXPECT_EQ(registry.addProgram(c.vertex, c.fragment, c.verbose, "added", true, true), 1);
    } catch (const FXGLSLexception& e) {
      type = e.type();
      error = e.what();
    }
    const std::string printed = testing::internal::GetCapturedStdout();
    EXPECT_EQ(type, c.type);
    EXPECT_EQ(error, c.error);
    // Only a failed compile adds nothing; a failed link adds its program with the log.
    const int count = c.type == GLSLErrorType_ShaderCompile ? 1 : 2;
    ASSERT_EQ(registry.programCount(), count) << c.error;
    EXPECT_EQ(registry.programNames().size(), static_cast<size_t>(count));
    const bool linked = c.type != GLSLErrorType_ShaderLink;
    EXPECT_EQ(registry.program(count - 1).linked, linked);
    EXPECT_EQ(registry.program(count - 1).log.empty(), linked);
    EXPECT_EQ(printed, linked ? c.printed : registry.program(count - 1).log) << c.error;
    EXPECT_FALSE(registry.linkProgram("no such program", false));
  }
  forgetCompileErrors(broken);
}

TEST_F(ProgramRegistry, NamesAreKeptInByteOrderLookedUpAndDeletedWithTheRegistry) {
  std::vector<GLuint> ids;
  {
    EffectData registry;
    // Only the first program has the uniform.
    for (const std::string name : {"b", "a", "B", "ab"})
      registry.addProgram(kVertex, name == "b" ? kFragment : kPlainFragment, false, name, true,
                          true);
    for (int index = 0; index < 4; ++index) ids.push_back(registry.program(index).id);
    const std::vector<std::pair<std::string, int>> expected = {
        {"B", 2}, {"a", 1}, {"ab", 3}, {"b", 0}};
    ASSERT_EQ(registry.programNames().size(), expected.size());
    for (size_t i = 0; i < expected.size(); ++i) {
      EXPECT_EQ(registry.programNames()[i].name, expected[i].first);
      EXPECT_EQ(registry.programNames()[i].index, expected[i].second);
      EXPECT_EQ(registry.programId(expected[i].first),
                static_cast<int32_t>(registry.program(expected[i].second).id));
    }
    EXPECT_EQ(registry.programId("c"), -1);

    EXPECT_EQ(registry.currentProgramIndex(), -1);
    EXPECT_NE(registry.uniformLocation("onlyFirst"), -1) << "none in use: program zero's";
    registry.useProgram("a");
    EXPECT_EQ(registry.uniformLocation("onlyFirst"), -1);
    registry.useProgram("c");
    registry.useProgramAt(4);
    EXPECT_EQ(registry.currentProgramIndex(), 1) << "unknown names and indices change nothing";
    registry.releaseProgram();
    EXPECT_EQ(registry.currentProgramIndex(), -1);
  }
  for (GLuint id : ids) EXPECT_FALSE(glIsProgram(id)) << id;
}

}  // namespace
