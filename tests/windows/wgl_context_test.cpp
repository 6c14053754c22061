// The host's WGL context: a 4.1-or-later debug context of the asked profile, current after
// construction, whose debug callback records GL errors.
#include <GL/glew.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <memory>

#include "refhost/gl/headless_context.h"

namespace {

TEST(WglContext, MakesADebugContextOfEachProfileThatRecordsErrors) {
  for (const auto profile : {refhost::GlProfile::Core, refhost::GlProfile::Compatibility}) {
    std::unique_ptr<refhost::GlContext> made = refhost::makeHeadlessContext(profile);
    refhost::GlContext& context = *made;
    int major = 0, minor = 0;
    std::sscanf(context.versionString().c_str(), "%d.%d", &major, &minor);
    EXPECT_GE(major * 10 + minor, 41) << context.versionString();
    GLint profileMask = 0, flags = 0;
    glGetIntegerv(GL_CONTEXT_PROFILE_MASK, &profileMask);
    glGetIntegerv(GL_CONTEXT_FLAGS, &flags);
    EXPECT_EQ(profileMask, profile == refhost::GlProfile::Core
                               ? GL_CONTEXT_CORE_PROFILE_BIT
                               : GL_CONTEXT_COMPATIBILITY_PROFILE_BIT);
    EXPECT_TRUE(flags & GL_CONTEXT_FLAG_DEBUG_BIT);
    EXPECT_TRUE(context.errors().empty());
    glEnable(0xFFFF);  // not a capability: GL_INVALID_ENUM
    EXPECT_EQ(context.errors().size(), 1u);
  }
}

}  // namespace
