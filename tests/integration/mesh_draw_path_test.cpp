// Whether the border meshes are drawn with primitive restart (one indexed draw per mesh) or run
// by run depends on the extension list and on the graphics chip; both give the same image.
#include "refhost/gl/gl_overrides.h"
#include "render_fixture.h"
#include "support/instrumented_host.h"

namespace {

using refhost::ParamValue;

// Element buffers acquired during one render: one per mesh with restart, one per strip or fan
// without. Each cut has one strip and two cap fans.
size_t elementBuffers(testsupport::InstrumentedHost& host) {
  size_t count = 0;
  for (const std::string& line : host.callsTo("AcquireBuffer"))
    if (line.find(" 0x8893 ") != std::string::npos) ++count;
  return count;
}

TEST(MeshDrawPath, RestartFollowsTheExtensionListAndTheChip) {
  using Profile = refhost::GlProfile;
  // A chip named by its renderer, or a driver that hides the extension.
  auto chip = [](const char* renderer) {
    return refhost::GlOverrides{std::string("Intel"), std::string(renderer), {}};
  };
  const refhost::GlOverrides hidden{std::nullopt, std::nullopt, {"GL_NV_primitive_restart"}};
  const struct {
    const char* name;
    Profile profile;
    refhost::GlOverrides overrides;
    size_t expectedElementBuffers;
  } table[] = {{"compatibility profile lists the extension", Profile::Compatibility, {}, 2},
               {"Intel HD 4000", Profile::Compatibility, chip("Intel(R) HD Graphics 4000"), 9},
               {"Intel HD 4600", Profile::Compatibility, chip("Intel(R) HD Graphics 4600"), 2},
               {"extension hidden", Profile::Compatibility, hidden, 9},
               {"core profile lacks the extension", Profile::Core, {}, 9}};
  std::vector<uint8_t> reference;
  for (const auto& row : table) {
    SCOPED_TRACE(row.name);
    refhost::ScopedGlOverrides overrides(row.overrides);
    RenderFixture fixture(row.profile);
    testsupport::InstrumentedHost& host = fixture.host();
    host.setValue("numberOfCuts", ParamValue::ofInt(3));
    setCut(host, 0, 3.0f, -2.0f, 20.0f);
    setCut(host, 1, -10.0f, 5.0f, 100.0f);
    setCut(host, 2, 12.0f, 8.0f, -60.0f);
    host.setValue("borderWidth", ParamValue::ofFloat(5.0f));
    host.setValue("borderColor", ParamValue::ofColor(0.2f, 0.9f, 0.4f));
    host.clearCallLog();
    const std::vector<uint8_t> pixels = fixture.render({200, 30, 90, 255});
    EXPECT_EQ(elementBuffers(host), row.expectedElementBuffers);
    if (reference.empty()) reference = pixels;
    EXPECT_EQ(pixels, reference);
  }
}

}  // namespace
