// The effect's passes in bare GL: its shader computations written out again, static geometry
// uploaded once, and between the draws the effect's own state changes, nothing of a host's.
#include "floor_replica.h"

#include <GL/glew.h>

#include <cmath>
#include <stdexcept>
#include <string>

namespace veltrane_bench {
namespace {

const char kTexturedVertex[] = R"(#version 410 core
layout(location = 0) in vec4 position;
layout(location = 8) in vec2 texCoord;
out vec2 fragTexCoord;
uniform mat4 projectionMatrix;
uniform mat4 modelViewMatrix;
void main() {
  fragTexCoord = texCoord;
  gl_Position = projectionMatrix * modelViewMatrix * position;
}
)";

const char kSplitFragment[] = R"(#version 410 core
in vec2 fragTexCoord;
out vec4 colour;
uniform sampler2D sourceTexture;
uniform vec2 sourceExtent;
uniform vec3 tint;
uniform vec2 sampleOffset;
uniform float sampleRotation;
uniform float inverseScale;
uniform float aspectRatio;
void main() {
  float r = sampleRotation;
  vec2 p = (fragTexCoord - vec2(0.5) + sampleOffset) * inverseScale;
  p.x *= aspectRatio;
  p = mat2(cos(r), -sin(r), sin(r), cos(r)) * p;
  p.x /= aspectRatio;
  p += vec2(0.5);
  vec4 q = vec4(0.0);
  if (p.x >= 0.0 && p.x <= 1.0 && p.y >= 0.0 && p.y <= 1.0) q = texture(sourceTexture, p * sourceExtent);
  q.rgb *= tint;
  colour = q;
}
)";

const char kFieldVertex[] = R"(#version 410 core
layout(location = 0) in vec4 position;
out float value;
uniform mat4 projectionMatrix;
uniform mat4 modelViewMatrix;
void main() {
  value = position.z;
  gl_Position = projectionMatrix * modelViewMatrix * position;
  gl_Position.z = value * 2.0 - 1.0;
}
)";

const char kFieldFragment[] = R"(#version 410 core
in float value;
out vec4 colour;
void main() { colour = vec4(vec3(value), 1.0); }
)";

const char kCombineFragment[] = R"(#version 410 core
in vec2 fragTexCoord;
out vec4 colour;
uniform sampler2D sourceTexture;
uniform sampler2D distanceTexture;
uniform vec2 distanceScale;
uniform float borderHalfWidth;
uniform vec4 borderColour;
void main() {
  float h = borderHalfWidth;
  vec4 q = texture(sourceTexture, fragTexCoord);
  float d = texture(distanceTexture, fragTexCoord * distanceScale).r * (h + 1.0);
  float a = clamp(h - d + 0.5, 0.0, 1.0) * clamp(h, 0.0, 1.0);
  colour = mix(q, borderColour, a);
}
)";

GLuint compile(GLenum stage, const char* text) {
  GLuint shader = glCreateShader(stage);
  glShaderSource(shader, 1, &text, nullptr);
  glCompileShader(shader);
  GLint ok = 0;
  glGetShaderiv(shader, GL_COMPILE_STATUS, &ok);
  if (!ok) {
    char log[1024] = {};
    glGetShaderInfoLog(shader, sizeof log, nullptr, log);
    glDeleteShader(shader);
    throw std::runtime_error(std::string("floor replica: shader does not compile: ") + log);
  }
  return shader;
}

GLuint link(const char* vertex, const char* fragment) {
  GLuint stages[2] = {compile(GL_VERTEX_SHADER, vertex), compile(GL_FRAGMENT_SHADER, fragment)};
  GLuint program = glCreateProgram();
  for (GLuint stage : stages) glAttachShader(program, stage);
  glLinkProgram(program);
  for (GLuint stage : stages) glDeleteShader(stage);
  GLint ok = 0;
  glGetProgramiv(program, GL_LINK_STATUS, &ok);
  if (!ok) {
    glDeleteProgram(program);
    throw std::runtime_error("floor replica: program does not link");
  }
  return program;
}

GLuint makeTarget(int32_t width, int32_t height) {
  GLuint id = 0;
  glGenTextures(1, &id);
  glBindTexture(GL_TEXTURE_2D, id);
  glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA, width, height, 0, GL_RGBA, GL_UNSIGNED_BYTE, nullptr);
  return id;
}

// The effect's texture-unit operations: bind with clamp-to-edge (and linear filtering), and
// switch the bound texture to nearest filtering.
void bindUnit(GLenum unit, GLuint texture) {
  glActiveTexture(unit);
  glBindTexture(GL_TEXTURE_2D, texture);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_LINEAR);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_LINEAR);
}

void setUnitNearest(GLenum unit) {
  glActiveTexture(unit);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
}

void attach(GLuint texture, int32_t width, int32_t height) {
  glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, texture, 0);
  glViewport(0, 0, width, height);
}

// (x, y, value) vertices as the effect builds its border meshes: a fan of 32 sides around a
// segment end (0 at the end, 1 on the rim, its rim points turned step by step from (-r, 0)),
// and a strip of six along a segment (0 on it, 1 at distance r on both sides).
constexpr int kCapVertices = 35;

void appendCap(std::vector<float>& out, float x, float y, float r) {
  out.insert(out.end(), {x, y, 0});
  const float c = std::cos(0.19634955f), s = std::sin(0.19634955f);
  float px = -r, py = 0;
  for (int i = 0; i <= 32; ++i) {
    out.insert(out.end(), {x + px, y + py, 1});
    float turned = c * px - s * py;
    py = s * px + c * py;
    px = turned;
  }
  out.insert(out.end(), {x - r, y, 1});  // the fan closes on its first rim point
}

void appendStrip(std::vector<float>& out, const std::array<float, 4>& s, float r) {
  float dx = s[2] - s[0], dy = s[3] - s[1];
  float length = std::sqrt(dx * dx + dy * dy);
  float ox = length > 0 ? dy / length * r : 0, oy = length > 0 ? -dx / length * r : 0;
  out.insert(out.end(), {s[0] + ox, s[1] + oy, 1, s[2] + ox, s[3] + oy, 1, s[0], s[1], 0, s[2],
                         s[3], 0, s[0] - ox, s[1] - oy, 1, s[2] - ox, s[3] - oy, 1});
}

void setSampling(GLuint program, float aspect) {
  glUniform3f(glGetUniformLocation(program, "tint"), 1, 1, 1);
  glUniform2f(glGetUniformLocation(program, "sampleOffset"), 0, 0);
  glUniform1f(glGetUniformLocation(program, "sampleRotation"), 0);
  glUniform1f(glGetUniformLocation(program, "inverseScale"), 1);
  glUniform1f(glGetUniformLocation(program, "aspectRatio"), aspect);
}

void setSource(GLuint program, GLuint texture) {
  bindUnit(GL_TEXTURE0, texture);
  glUniform1i(glGetUniformLocation(program, "sourceTexture"), 0);
  glUniform2f(glGetUniformLocation(program, "sourceExtent"), 1, 1);
}

// The effect's textured draw, with the vertices already on the GL side: attributes 0 (x, y)
// and 8 (s, t), one draw, attributes off again.
void drawTextured(GLuint buffer, GLenum mode, GLint first, GLsizei count) {
  glBindBuffer(GL_ARRAY_BUFFER, buffer);
  glEnableVertexAttribArray(0);
  glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 16, nullptr);
  glEnableVertexAttribArray(8);
  glVertexAttribPointer(8, 2, GL_FLOAT, GL_FALSE, 16, reinterpret_cast<const void*>(8));
  glDrawArrays(mode, first, count);
  glDisableVertexAttribArray(0);
  glDisableVertexAttribArray(8);
  glBindBuffer(GL_ARRAY_BUFFER, 0);
}

}  // namespace

// Each Local cut's line, from the nearest crossing behind its position to the nearest ahead,
// where the frame's edges and the segments of earlier cuts count as crossings.
std::vector<std::array<float, 4>> cutSegments(int32_t width, int32_t height,
                                              const std::vector<std::array<float, 2>>& positions,
                                              const std::vector<float>& directions) {
  const float w = static_cast<float>(width) / 2, h = static_cast<float>(height) / 2;
  std::vector<std::array<float, 4>> segments;
  for (std::size_t i = 0; i < positions.size() && i < directions.size(); ++i) {
    const float radians = directions[i] * 3.1415927f / 180.0f;
    const float dx = std::sin(radians), dy = std::cos(radians);
    const float px = positions[i][0], py = positions[i][1];
    std::vector<std::array<float, 4>> edges = {
        {-w, h, w, h}, {-w, -h, w, -h}, {-w, -h, -w, h}, {w, -h, w, h}};
    edges.insert(edges.end(), segments.begin(), segments.end());
    float tmin = -3.4028235e38f, tmax = 3.4028235e38f;
    for (const auto& e : edges) {
      float ex = e[2] - e[0], ey = e[3] - e[1], u = 0, t = 0;
      if ((px == e[0] && py == e[1]) || (px == e[2] && py == e[3])) {
        tmin = std::fmax(tmin, 0);
        continue;
      }
      if (std::fabs(dx) > std::fabs(dy)) {
        float k = dy / dx, den = ey - ex * k;
        if (den == 0) continue;
        u = ((e[0] - px) * k + (py - e[1])) / den;
        t = (u * ex + e[0] - px) / dx;
      } else {
        float k = dx / dy, den = ex - ey * k;
        if (den == 0) continue;
        u = ((e[1] - py) * k + (px - e[0])) / den;
        t = (u * ey + e[1] - py) / dy;
      }
      if (u < 0 || u > 1) continue;
      if (t > 1.1920929e-7f)
        tmax = std::fmin(tmax, t);
      else
        tmin = std::fmax(tmin, t > 0 ? 0 : t);
    }
    segments.push_back({px + tmin * dx, py + tmin * dy, px + tmax * dx, py + tmax * dy});
  }
  return segments;
}

FloorReplica::FloorReplica(const FloorLayout& layout, uint32_t source, uint32_t output)
    : layout_(layout), source_(source), output_(output) {
  const float w = static_cast<float>(layout.width), h = static_cast<float>(layout.height);
  projection_ = {2 / w, 0, 0, 0, 0, 2 / h, 0, 0, 0, 0, -1, 0, -1, -1, 0, 1};
  split_.id = link(kTexturedVertex, kSplitFragment);
  field_.id = link(kFieldVertex, kFieldFragment);
  combine_.id = link(kTexturedVertex, kCombineFragment);
  for (Program* program : {&split_, &field_, &combine_}) {
    program->projection = glGetUniformLocation(program->id, "projectionMatrix");
    program->modelView = glGetUniformLocation(program->id, "modelViewMatrix");
  }
  composition_ = makeTarget(layout.width, layout.height);
  distance_ = makeTarget(layout.width, layout.height);
  glGenFramebuffers(1, &framebuffer_);
  glGenVertexArrays(1, &vertexArray_);

  // The frame quad in pixels, then the regions: vertical strips in centred coordinates that
  // together cover the frame once, as the effect's regions do.
  std::vector<float> textured = {0, 0, 0, 0, w, 0, 1, 0, 0, h, 0, 1, w, h, 1, 1};
  regionFirst_ = 4;
  for (int i = 0; i < layout.regions; ++i) {
    float s0 = static_cast<float>(i) / layout.regions,
          s1 = static_cast<float>(i + 1) / layout.regions;
    float x0 = (s0 - 0.5f) * w, x1 = (s1 - 0.5f) * w;
    textured.insert(textured.end(), {x0, -h / 2, s0, 0, x1, -h / 2, s1, 0, x0, h / 2, s0, 1});
    textured.insert(textured.end(), {x0, h / 2, s0, 1, x1, -h / 2, s1, 0, x1, h / 2, s1, 1});
  }
  std::vector<float> mesh;
  for (const auto& s : layout.segments) {
    appendCap(mesh, s[0], s[1], layout.borderRadius);
    appendCap(mesh, s[2], s[3], layout.borderRadius);
  }
  for (const auto& s : layout.segments) appendStrip(mesh, s, layout.borderRadius);

  glGenBuffers(1, &texturedBuffer_);
  glBindBuffer(GL_ARRAY_BUFFER, texturedBuffer_);
  glBufferData(GL_ARRAY_BUFFER, static_cast<GLsizeiptr>(textured.size() * sizeof(float)),
               textured.data(), GL_STATIC_DRAW);
  glGenBuffers(1, &meshBuffer_);
  glBindBuffer(GL_ARRAY_BUFFER, meshBuffer_);
  glBufferData(GL_ARRAY_BUFFER, static_cast<GLsizeiptr>(mesh.size() * sizeof(float)), mesh.data(),
               GL_STATIC_DRAW);
  glBindBuffer(GL_ARRAY_BUFFER, 0);
}

FloorReplica::~FloorReplica() {
  for (const Program* program : {&split_, &field_, &combine_}) glDeleteProgram(program->id);
  GLuint textures[2] = {composition_, distance_};
  glDeleteTextures(2, textures);
  GLuint buffers[2] = {texturedBuffer_, meshBuffer_};
  glDeleteBuffers(2, buffers);
  glDeleteVertexArrays(1, &vertexArray_);
  glDeleteFramebuffers(1, &framebuffer_);
}

void FloorReplica::setMatrices(const Program& program, const float* modelView,
                               bool transpose) const {
  glUniformMatrix4fv(program.projection, 1, GL_FALSE, projection_.data());
  glUniformMatrix4fv(program.modelView, 1, transpose ? GL_TRUE : GL_FALSE, modelView);
}

void FloorReplica::render() {
  GLfloat savedClear[4];
  glGetFloatv(GL_COLOR_CLEAR_VALUE, savedClear);
  glBindFramebuffer(GL_FRAMEBUFFER, framebuffer_);
  glBindVertexArray(vertexArray_);
  drawComposition();
  drawDistance();
  drawCombine();
  glBindVertexArray(0);
  glClearColor(savedClear[0], savedClear[1], savedClear[2], savedClear[3]);
}

// The source copied into the composition, then every region; before each region the effect
// attaches the output and puts the source on unit 0 at nearest filtering while it fetches the
// region's input, and llvmpipe charges those switches, so the replica makes them too.
void FloorReplica::drawComposition() {
  static const float identity[16] = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
  const float centring[16] = {
      1, 0, 0, layout_.width / 2.0f, 0, 1, 0, layout_.height / 2.0f, 0, 0, 1, 0, 0, 0, 0, 1};
  const float aspect = static_cast<float>(layout_.width) / static_cast<float>(layout_.height);
  glClearColor(0, 0, 0, 0);
  attach(composition_, layout_.width, layout_.height);
  glUseProgram(split_.id);
  glClear(GL_COLOR_BUFFER_BIT);
  setMatrices(split_, identity, true);
  setSource(split_.id, source_);
  setSampling(split_.id, 1);
  drawTextured(texturedBuffer_, GL_TRIANGLE_STRIP, 0, 4);
  setMatrices(split_, centring, true);
  for (int i = 0; i < layout_.regions; ++i) {
    attach(output_, layout_.width, layout_.height);
    bindUnit(GL_TEXTURE0, source_);
    setUnitNearest(GL_TEXTURE0);
    glUseProgram(0);
    attach(composition_, layout_.width, layout_.height);
    glUseProgram(split_.id);
    setMatrices(split_, centring, true);
    setSource(split_.id, source_);
    setSampling(split_.id, aspect);
    drawTextured(texturedBuffer_, GL_TRIANGLES, regionFirst_ + 6 * i, 6);
  }
}

// Caps, then strips, each a mesh drawn one primitive at a time (as the core profile draws
// them, without primitive restart) and flushed.
void FloorReplica::drawDistance() {
  const float centring[16] = {
      1, 0, 0, layout_.width / 2.0f, 0, 1, 0, layout_.height / 2.0f, 0, 0, 1, 0, 0, 0, 0, 1};
  const auto segments = static_cast<GLint>(layout_.segments.size());
  attach(distance_, layout_.width, layout_.height);
  glClearColor(1, 1, 1, 0);
  glClear(GL_COLOR_BUFFER_BIT);
  glEnable(GL_BLEND);
  glBlendEquation(GL_MIN);
  glBlendFunc(GL_ONE, GL_ONE);
  glBindBuffer(GL_ARRAY_BUFFER, meshBuffer_);
  for (bool caps : {true, false}) {
    glUseProgram(field_.id);
    setMatrices(field_, centring, true);
    glEnableVertexAttribArray(0);
    glVertexAttribPointer(0, 3, GL_FLOAT, GL_FALSE, 12, nullptr);
    for (GLint i = 0; i < (caps ? 2 * segments : segments); ++i) {
      if (caps)
        glDrawArrays(GL_TRIANGLE_FAN, kCapVertices * i, kCapVertices);
      else
        glDrawArrays(GL_TRIANGLE_STRIP, 2 * kCapVertices * segments + 6 * i, 6);
    }
    glDisableVertexAttribArray(0);
    glFlush();
    glUseProgram(0);
  }
  glBindBuffer(GL_ARRAY_BUFFER, 0);
  glBlendEquation(GL_FUNC_ADD);
  glBlendFunc(GL_ONE, GL_ONE);
  glDisable(GL_BLEND);
  glClearColor(0, 0, 0, 0);
}

void FloorReplica::drawCombine() {
  static const float identity[16] = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
  attach(output_, layout_.width, layout_.height);
  glClear(GL_COLOR_BUFFER_BIT);
  glUseProgram(combine_.id);
  setMatrices(combine_, identity, false);
  bindUnit(GL_TEXTURE0, composition_);
  glUniform1i(glGetUniformLocation(combine_.id, "sourceTexture"), 0);
  bindUnit(GL_TEXTURE1, distance_);
  glUniform1i(glGetUniformLocation(combine_.id, "distanceTexture"), 1);
  glUniform2f(glGetUniformLocation(combine_.id, "distanceScale"), 1, 1);
  glUniform1f(glGetUniformLocation(combine_.id, "borderHalfWidth"), layout_.borderRadius - 1);
  glUniform4f(glGetUniformLocation(combine_.id, "borderColour"), 0, 0, 0, 1);
  drawTextured(texturedBuffer_, GL_TRIANGLE_STRIP, 0, 4);
  setUnitNearest(GL_TEXTURE1);
  glBindTexture(GL_TEXTURE_2D, 0);
  setUnitNearest(GL_TEXTURE0);
  bindUnit(GL_TEXTURE0, source_);
  setUnitNearest(GL_TEXTURE0);
  glUseProgram(0);
}

}  // namespace veltrane_bench
