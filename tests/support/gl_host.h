// The GL host of the unit tests: the reference host with a headless context and a small frame;
// a test fails without a context, and on any GL error, host problem or resource not given back.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "gl/effect_data.h"
#include "refhost/core/host.h"
#include "support/instrumented_host.h"

namespace testsupport {

class GlHostTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(startHost(refhost::GlProfile::Core, 64, 36)); }
  void TearDown() override { finishHost(); }

  // A fresh host with a context of `profile` and a frame of width x height.
  bool startHost(refhost::GlProfile profile, int width, int height);
  // Checks the GL errors and the host's problems and balance, then drops registry and host.
  void finishHost();
  // Builds every program into a registry held in the host record.
  void buildPrograms();
  // A test texture of allocated size with its image in the lower-left corner; RGBA float
  // texels row by row from the bottom. Deleted by finishHost.
  TextureRecord makeTexture(int imageWidth, int imageHeight, int allocatedWidth,
                            int allocatedHeight, GLenum internalFormat,
                            const std::vector<float>& rgba);
  // The image part of `texture` as RGBA floats, rows from the bottom.
  std::vector<float> readImage(const TextureRecord& texture);
  // Mesa reports a failed compile as a GL error whose text is the compile log; a test that
  // fails a compile on purpose forgets exactly those.
  void forgetCompileErrors(const std::string& compileLog);

  InstrumentedHost& host() { return *host_; }
  tagWispAPI* api() { return &host_->api(); }
  WispHost* handle() { return host_->handle(); }

  std::unique_ptr<InstrumentedHost> host_;
  std::unique_ptr<veltrane::EffectData> registry_;
  WispRenderContext context_{};
  GLuint framebuffer_ = 0;
  std::vector<GLuint> textures_;
};

}  // namespace testsupport
