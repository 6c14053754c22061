// Loading plug-in modules: clear errors for every way a path can be wrong, and the
// registration and message round trip of the built module.
#include "refhost/module.h"

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <link.h>

#include "refhost/host.h"

namespace refhost {
namespace {

// The path of a system library that is loadable but is no plug-in.
std::string mathLibraryPath() {
  void* handle = dlopen("libm.so.6", RTLD_NOW);
  link_map* map = nullptr;
  if (!handle || dlinfo(handle, RTLD_DI_LINKMAP, &map) != 0 || !map) return "";
  std::string path = map->l_name;
  dlclose(handle);
  return path;
}

std::string loadError(const std::string& path) {
  try {
    Module module(path);
  } catch (const std::runtime_error& error) {
    return error.what();
  }
  return "";
}

TEST(ModuleLoading, ErrorsNameThePathAndTheFault) {
  const std::string libm = mathLibraryPath();
  ASSERT_FALSE(libm.empty());
  struct Case {
    std::string path;
    std::string fault;
  };
  const Case cases[] = {
      {"/nonexistent/veltrane.so", "No such file or directory"},
      {"", "the path is empty"},
      {VELTRANE_SOURCE_DIR, "it is a directory"},
      {std::string(VELTRANE_SOURCE_DIR) + "/CMakeLists.txt", "not a loadable shared library"},
      {libm, "does not export PluginInfo"},
  };
  for (const Case& c : cases) {
    std::string message = loadError(c.path);
    EXPECT_NE(message.find("'" + c.path + "'"), std::string::npos) << message;
    EXPECT_NE(message.find(c.fault), std::string::npos) << message;
  }
}

TEST(ModuleLoading, ReadsTheRegistrationOfTheBuiltModule) {
  Module module(VELTRANE_MODULE_PATH);
  Registration first = module.readRegistration();
  EXPECT_EQ(first.name, "Veltrane {split-screen}");
  EXPECT_EQ(first.category, "Generate");
  EXPECT_EQ(first.vendor, "Tavrix");
  EXPECT_EQ(first.versionText(), "1.2.0.0");
  EXPECT_EQ(first.capabilityFlags, 69u);
  EXPECT_EQ(first.interfaceWord, 144585159u);
  EXPECT_EQ(first.interfaceRevision, 5u);
  Registration second = module.readRegistration();
  EXPECT_EQ(second.guidText(), first.guidText());
  EXPECT_EQ(second.identifier, first.identifier);
}

TEST(ModuleLoading, HostDrivesTheModuleThroughItsLifecycle) {
  Module module(VELTRANE_MODULE_PATH);
  Host host(module);
  for (int32_t message : {0, 2, 3, 4, 1}) EXPECT_EQ(host.send(message), 1) << message;
  EXPECT_EQ(host.panel().params().size(), 69u);
  EXPECT_EQ(host.panel().groups().size(), 20u);
  EXPECT_EQ(host.panel().openGroupDepth(), 0);
  ASSERT_EQ(host.messageHistory().size(), 5u);
  EXPECT_EQ(host.messageHistory()[1].message, 2);
  EXPECT_EQ(host.api().pluginData, nullptr);
  EXPECT_EQ(host.api().instanceData, nullptr);
  EXPECT_TRUE(host.problems().empty()) << host.problems()[0];
}

}  // namespace
}  // namespace refhost
