// A loaded plug-in module: the shared library, its two exports and its registration record.
#pragma once

#include <array>
#include <cstdint>
#include <string>

#include "host/wisp_api.h"

namespace refhost {

// The registration record as the host reads it, texts converted to UTF-8.
struct Registration {
  uint32_t kind = 0;
  std::array<uint8_t, 16> guid{};
  std::string name;
  std::string category;
  std::string vendor;
  std::string notice;
  std::array<uint32_t, 4> version{};
  uint32_t capabilityFlags = 0;
  uint32_t interfaceWord = 0;
  uint32_t interfaceRevision = 0;
  std::string identifier;

  // "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}": the first three groups read little-endian.
  std::string guidText() const;
  std::string versionText() const;  // "1.2.0.0"
};

// The module's two exports, where a program links the module in instead of loading it (a
// browser build, a static test).
struct ModuleEntryPoints {
  PluginInfoFunction pluginInfo = nullptr;
  NotifyFunction notify = nullptr;
};

// A loaded module owns the library handle; it stays loaded until the Module is destroyed, so
// every Host driving it must be destroyed first.
class Module {
 public:
  // Loads the shared library at `path` through the platform's loader. Throws
  // std::runtime_error naming the path and what was wrong: no such file, not a loadable shared
  // library (also a truncated one, or one for another machine), or an export missing.
  explicit Module(const std::string& path);
  // A module linked into the program: nothing is loaded or unloaded. `name` stands for the
  // path in messages. Throws std::invalid_argument when an entry point is missing.
  Module(const ModuleEntryPoints& entryPoints, std::string name);
  ~Module();
  Module(const Module&) = delete;
  Module& operator=(const Module&) = delete;

  const std::string& path() const { return path_; }

  // Calls PluginInfo with freshly allocated host buffers of the declared sizes and reads the
  // record back. Every call asks the module again.
  Registration readRegistration() const;
  // Calls PluginInfo with the caller's record and buffers, read back by the caller.
  void fillRegistration(PluginRegistration* record) const { pluginInfo_(nullptr, nullptr, record); }

  int32_t notify(WispHost* host, tagWispAPI* api, int32_t message) const {
    return notify_(host, api, message);
  }

 private:
  std::string path_;
  void* handle_ = nullptr;
  PluginInfoFunction pluginInfo_ = nullptr;
  NotifyFunction notify_ = nullptr;
};

}  // namespace refhost
