// The program registry on Mesa: build, link, failures and their printed logs, name order and
// deletion, uniform lookup and setting, attribute binding.
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
const std::string kOtherFragment =
    "#version 410\nuniform vec4 onlySecond;\nlayout(location = 0) out vec4 colour;\n"
    "void main() { colour = onlySecond; }\n";
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
       "GLSLErrorType_ShaderLink - The shader program failed to link."},
  };
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
    for (const char* name : {"b", "a", "B", "ab"}) {
      registry.addProgram(kVertex, kFragment, false, name, true, true);
    }
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
    registry.useProgram("a");
    registry.useProgram("c");
    registry.useProgramAt(4);
    EXPECT_EQ(registry.currentProgramIndex(), 1) << "unknown names and indices change nothing";
    registry.releaseProgram();
    EXPECT_EQ(registry.currentProgramIndex(), -1);
  }
  for (GLuint id : ids) EXPECT_FALSE(glIsProgram(id)) << id;
}

TEST_F(ProgramRegistry, UniformsOfAnUnregisteredProgramAreLookedUpInProgramZero) {
  EffectData registry;
  EXPECT_EQ(registry.uniformLocation("onlyFirst"), -1) << "empty registry";
  registry.addProgram(kVertex, kFragment, false, "first", true, true);
  registry.addProgram(kVertex, kOtherFragment, false, "second", true, true);
  EffectData outsider;
  outsider.addProgram(kVertex, kOtherFragment, false, "outside", true, true);

  outsider.useProgramAt(0);
  EXPECT_EQ(registry.uniformLocation("onlyFirst"),
            glGetUniformLocation(registry.program(0).id, "onlyFirst"));
  EXPECT_NE(registry.uniformLocation("onlyFirst"), -1);
  EXPECT_EQ(registry.uniformLocation("onlySecond"), -1);
  registry.useProgramAt(1);
  EXPECT_NE(registry.uniformLocation("onlySecond"), -1);
  EXPECT_EQ(registry.uniformLocation("onlyFirst"), -1);
  registry.releaseProgram();
}

TEST_F(ProgramRegistry, MatricesAreSetForDimensionsTwoToFourOnly) {
  EffectData registry;
  registry.addProgram(kVertex,
                      "#version 410\nuniform mat2 m2;\nuniform mat3 m3;\nuniform mat4 m4;\n"
                      "layout(location = 0) out vec4 colour;\n"
                      "void main() { colour = vec4(m2[0], m3[0].xy) + m4[0]; }\n",
                      false, "matrices", true, true);
  registry.useProgram("matrices");
  const float values[16] = {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16};
  const float zeros[16] = {};
  const struct {
    const char* uniform;
    int dimension;
    bool transpose;
    std::vector<float> expected;  // column-major read-back
  } cases[] = {
      {"m2", 2, false, {1, 2, 3, 4}},
      {"m3", 3, true, {1, 4, 7, 2, 5, 8, 3, 6, 9}},
      {"m4", 4, false, {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16}},
  };
  for (const auto& c : cases) {
    const GLint location = registry.uniformLocation(c.uniform);
    registry.setUniformMatrix(location, c.dimension, 1, c.transpose, values);
    registry.setUniformMatrix(location, 5, 1, false, zeros);  // sets nothing
    registry.setUniformMatrix(location, 1, 1, false, zeros);
    std::vector<float> read(c.expected.size());
    glGetUniformfv(registry.program(0).id, location, read.data());
    EXPECT_EQ(read, c.expected) << c.uniform;
  }
  registry.releaseProgram();
}

TEST_F(ProgramRegistry, AttributeLocationsFollowTheBuildOperation) {
  // One vertex stage per naming: every attribute role is declared and used.
  const auto vertex = [](const std::string& p) {
    return "#version 410\nin vec4 " + p + "Position;\nin vec2 " + p + "TexCoord;\nin vec2 " + p +
           "TexCoord0;\nin vec2 " + p + "TexCoord1;\nout vec2 fragTexCoord;\nvoid main() {\n" +
           "  fragTexCoord = " + p + "TexCoord + " + p + "TexCoord0 + " + p + "TexCoord1;\n" +
           "  gl_Position = " + p + "Position;\n}\n";
  };
  // The geometry case passes the texture coordinate on under its own name, so that it stays
  // active and keeps its location.
  const std::string geometry =
      "#version 410\nlayout(triangles) in;\nlayout(triangle_strip, max_vertices = 3) out;\n"
      "in vec2 fragTexCoord[];\nout vec2 passedTexCoord;\nvoid main() {\n"
      "  for (int i = 0; i < 3; ++i) {\n    passedTexCoord = fragTexCoord[i];\n"
      "    gl_Position = gl_in[i].gl_Position;\n    EmitVertex();\n  }\n}\n";
  const auto fragment = [](const char* input) {
    return std::string("#version 410\nin vec2 ") + input +
           ";\nlayout(location = 0) out vec4 colour;\nvoid main() { colour = vec4(" + input +
           ", 0.0, 1.0); }\n";
  };
  enum Build { WithTexCoord, WithoutTexCoord, Dual, Geometry };
  const int kFree = -2;  // any location the registry did not fix
  const struct {
    Build build;
    bool sourceNames;
    int position, texCoord, texCoord0, texCoord1;
  } cases[] = {
      {WithTexCoord, true, 0, 8, kFree, kFree},
      {WithoutTexCoord, true, 0, kFree, kFree, kFree},
      {WithTexCoord, false, 0, 8, kFree, kFree},
      {Dual, true, 0, kFree, 8, 9},
      {Dual, false, 0, kFree, 8, 9},
      {Geometry, false, 0, 8, kFree, kFree},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(testing::Message() << "build " << c.build << " source names " << c.sourceNames);
    EffectData registry;
    const std::string prefix = c.sourceNames ? "vertex" : "in_";
    const std::string source = vertex(prefix);
    const int built =
        c.build == Dual ? registry.addDualTexCoordProgram(source, fragment("fragTexCoord"), false,
                                                          "p", c.sourceNames)
        : c.build == Geometry
            ? registry.addGeometryProgram(source, geometry, fragment("passedTexCoord"), false, "p",
                                          c.sourceNames)
            : registry.addProgram(source, fragment("fragTexCoord"), false, "p", c.sourceNames,
                                  c.build == WithTexCoord);
    EXPECT_EQ(built, 1);
    const std::pair<const char*, int> roles[] = {{"Position", c.position},
                                                 {"TexCoord", c.texCoord},
                                                 {"TexCoord0", c.texCoord0},
                                                 {"TexCoord1", c.texCoord1}};
    for (const auto& [role, expected] : roles) {
      const int actual = glGetAttribLocation(registry.program(0).id, (prefix + role).c_str());
      if (expected == kFree) {
        EXPECT_TRUE(actual != 0 && actual != 8 && actual != 9) << role << " at " << actual;
      } else {
        EXPECT_EQ(actual, expected) << role;
      }
    }
  }
}

}  // namespace
