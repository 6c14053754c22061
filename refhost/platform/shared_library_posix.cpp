// dlopen with the library's symbols kept local, so two modules never see each other's.
#include <dlfcn.h>

#include <filesystem>

#include "refhost/platform/shared_library.h"

namespace refhost {

void* openSharedLibrary(const std::string& path, std::string& reason) {
  // A bare file name would send dlopen through the library search path; name it as a path.
  const std::string openPath = path.find('/') == std::string::npos ? "./" + path : path;
  void* library = dlopen(openPath.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (!library) {
    const char* error = dlerror();
    reason = error ? error : "unknown loader error";
  }
  return library;
}

void* findSymbol(void* library, const char* name) {
  dlerror();
  return dlsym(library, name);
}

void closeSharedLibrary(void* library) { dlclose(library); }

std::string executablePath() {
  std::error_code error;
  const std::filesystem::path path = std::filesystem::read_symlink("/proc/self/exe", error);
  return error ? "" : path.string();
}

}  // namespace refhost
