// Loading plug-in modules: clear errors for every way a path can be wrong.
#include "refhost/module.h"

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <link.h>

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

}  // namespace
}  // namespace refhost
