// The GL host fixture: host start-up and the checks every GL test ends with.
#include "support/gl_host.h"

#include <cstdlib>

#include "refhost/gl/headless_context.h"
#include "render/gl_startup.h"
#include "support/instrumented_host.h"

namespace testsupport {

bool GlHostTest::startHost(refhost::GlProfile profile, int width, int height) {
  // Mesa keeps compiled shaders on disk and, on a hit, skips the compile and its info log; the
  // tests of printed logs need every compile to speak. Read when the driver starts.
  setenv("MESA_SHADER_CACHE_DISABLE", "true", 1);
  host_ = std::make_unique<InstrumentedHost>();
  try {
    host_->attachGl(refhost::makeHeadlessContext(profile));
  } catch (const std::exception& e) {
    ADD_FAILURE() << "no OpenGL context: " << e.what();
    return false;
  }
  glGenFramebuffers(1, &framebuffer_);
  glBindFramebuffer(GL_FRAMEBUFFER, framebuffer_);
  context_ = WispRenderContext{};
  context_.width = width;
  context_.height = height;
  context_.output.format = GL_RGBA;
  context_.output.pixelType = GL_UNSIGNED_BYTE;
  context_.output.imageWidth = width;
  context_.output.imageHeight = height;
  // Column-major: corner-space pixels onto the viewport.
  const float projection[16] = {2.0f / width, 0,  0, 0, 0, 2.0f / height, 0, 0, 0, 0, -1, 0,
                                -1,           -1, 0, 1};
  std::copy(projection, projection + 16, context_.projection);
  host_->setRenderContext(&context_);
  return true;
}

void GlHostTest::finishHost() {
  if (!host_ || !host_->gl()) return;
  registry_.reset();
  for (GLuint id : textures_) glDeleteTextures(1, &id);
  textures_.clear();
  glDeleteFramebuffers(1, &framebuffer_);
  for (const auto& error : host_->gl()->errors()) ADD_FAILURE() << "GL error: " << error.text;
  for (const auto& problem : host_->problems()) ADD_FAILURE() << "host problem: " << problem;
  EXPECT_EQ(host_->outstandingTextures(), 0);
  EXPECT_EQ(host_->outstandingBuffers(), 0);
  host_.reset();
}

void GlHostTest::buildPrograms() {
  registry_ = std::make_unique<veltrane::EffectData>();
  api()->pluginData = registry_.get();
  veltrane::prepareGl(handle(), api());
}

TextureRecord GlHostTest::makeTexture(int imageWidth, int imageHeight, int allocatedWidth,
                                      int allocatedHeight, GLenum internalFormat,
                                      const std::vector<float>& rgba) {
  GLuint id = 0;
  glGenTextures(1, &id);
  glBindTexture(GL_TEXTURE_2D, id);
  glTexImage2D(GL_TEXTURE_2D, 0, static_cast<GLint>(internalFormat), allocatedWidth,
               allocatedHeight, 0, GL_RGBA, GL_FLOAT, rgba.data());
  glBindTexture(GL_TEXTURE_2D, 0);
  textures_.push_back(id);
  TextureRecord record{};
  record.id = id;
  record.format = internalFormat;
  record.allocatedWidth = allocatedWidth;
  record.allocatedHeight = allocatedHeight;
  record.imageWidth = imageWidth;
  record.imageHeight = imageHeight;
  record.s1 = static_cast<float>(imageWidth) / static_cast<float>(allocatedWidth);
  record.t1 = static_cast<float>(imageHeight) / static_cast<float>(allocatedHeight);
  return record;
}

std::vector<float> GlHostTest::readImage(const TextureRecord& texture) {
  glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, texture.id, 0);
  std::vector<float> pixels(static_cast<size_t>(texture.imageWidth * texture.imageHeight * 4));
  glReadPixels(0, 0, texture.imageWidth, texture.imageHeight, GL_RGBA, GL_FLOAT, pixels.data());
  return pixels;
}

void GlHostTest::forgetCompileErrors(const std::string& compileLog) {
  std::vector<refhost::GlDebugMessage> others;
  for (const auto& error : host_->gl()->errors()) {
    if (compileLog.find(error.text) == std::string::npos) others.push_back(error);
  }
  host_->gl()->clearErrors();
  for (const auto& error : others) ADD_FAILURE() << "GL error: " << error.text;
}

}  // namespace testsupport
