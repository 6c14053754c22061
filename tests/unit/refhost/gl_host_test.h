// Fixture for host tests that need GL: a host with a context attached. A GL test never skips:
// without a context it fails and says why; any GL error recorded during the test fails it too.
#pragma once

#include <gtest/gtest.h>

#include "refhost/host.h"

namespace refhost {

class GlHostTest : public ::testing::Test {
 protected:
  void SetUp() override {
    try {
      host.attachGl();
    } catch (const std::exception& error) {
      FAIL() << "no GL context: " << error.what();
    }
  }
  void TearDown() override {
    if (host.gl()) {
      for (const GlDebugMessage& error : host.gl()->errors()) ADD_FAILURE() << error.text;
    }
  }

  Host host;
};

}  // namespace refhost
