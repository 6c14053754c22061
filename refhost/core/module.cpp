// Loading the plug-in module and reading its registration record.
#include "refhost/core/module.h"

#include <sys/stat.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <stdexcept>
#include <vector>

#include "refhost/platform/elf_check.h"
#include "refhost/platform/shared_library.h"
#include "refhost/platform/text.h"

namespace refhost {
namespace {

std::runtime_error loadError(const std::string& path, const std::string& what) {
  return std::runtime_error("cannot load plug-in module '" + path + "': " + what);
}

// Checks the path before loading so that a missing file is reported as such and not through the
// loader's library search, which would look elsewhere for a bare name; and, on ELF systems,
// checks the file's structure, since the loader maps segments without checking they exist in
// the file.
void checkFile(const std::string& path) {
  if (path.empty()) throw loadError(path, "the path is empty");
  struct stat info {};
  if (stat(path.c_str(), &info) != 0) throw loadError(path, std::strerror(errno));
  if (S_ISDIR(info.st_mode)) throw loadError(path, "it is a directory, not a shared library");
  if (!S_ISREG(info.st_mode)) throw loadError(path, "it is not a regular file");
#ifndef _WIN32
  if (std::string problem = elfModuleProblem(path); !problem.empty())
    throw loadError(path, "not a loadable shared library (" + problem + ")");
#endif
}

void* resolve(void* handle, const std::string& path, const char* symbol) {
  void* address = findSymbol(handle, symbol);
  if (!address) {
    throw loadError(path, std::string("it does not export ") + symbol +
                              " (not a plug-in module of this interface)");
  }
  return address;
}

}  // namespace

std::string Registration::guidText() const {
  char text[40];
  std::snprintf(text, sizeof text,
                "{%02X%02X%02X%02X-%02X%02X-%02X%02X-%02X%02X-%02X%02X%02X%02X%02X%02X}", guid[3],
                guid[2], guid[1], guid[0], guid[5], guid[4], guid[7], guid[6], guid[8], guid[9],
                guid[10], guid[11], guid[12], guid[13], guid[14], guid[15]);
  return text;
}

std::string Registration::versionText() const {
  return std::to_string(version[0]) + "." + std::to_string(version[1]) + "." +
         std::to_string(version[2]) + "." + std::to_string(version[3]);
}

Module::Module(const std::string& path) : path_(path) {
  checkFile(path);
  std::string reason;
  handle_ = openSharedLibrary(path, reason);
  if (!handle_) throw loadError(path, "not a loadable shared library (" + reason + ")");
  try {
    pluginInfo_ = reinterpret_cast<PluginInfoFunction>(resolve(handle_, path, "PluginInfo"));
    notify_ = reinterpret_cast<NotifyFunction>(resolve(handle_, path, "Notify"));
  } catch (...) {
    closeSharedLibrary(handle_);
    throw;
  }
}

Module::Module(const ModuleEntryPoints& entryPoints, std::string name)
    : path_(std::move(name)), pluginInfo_(entryPoints.pluginInfo), notify_(entryPoints.notify) {
  if (!pluginInfo_ || !notify_)
    throw std::invalid_argument("plug-in module '" + path_ +
                                "': PluginInfo and Notify are both needed");
}

Module::~Module() {
  if (handle_) closeSharedLibrary(handle_);
}

Registration Module::readRegistration() const {
  // The buffers have exactly the sizes the record promises; the module's bounded copies may
  // fill one without a terminator, so every read is bounded by the same size.
  std::vector<wchar_t> name(kRegistrationNameChars, 0);
  std::vector<wchar_t> category(kRegistrationCategoryChars, 0);
  std::vector<wchar_t> vendor(kRegistrationVendorChars, 0);
  std::vector<wchar_t> notice(kRegistrationNoticeChars, 0);
  std::vector<char> identifier(kRegistrationIdentifierChars, 0);
  PluginRegistration record{};
  record.name = name.data();
  record.category = category.data();
  record.vendor = vendor.data();
  record.notice = notice.data();
  record.identifier = identifier.data();
  pluginInfo_(nullptr, nullptr, &record);

  Registration out;
  out.kind = record.kind;
  std::memcpy(out.guid.data(), record.guid, out.guid.size());
  out.name = toUtf8(name.data(), name.size());
  out.category = toUtf8(category.data(), category.size());
  out.vendor = toUtf8(vendor.data(), vendor.size());
  out.notice = toUtf8(notice.data(), notice.size());
  for (std::size_t i = 0; i < out.version.size(); ++i) out.version[i] = record.version[i];
  out.capabilityFlags = record.capabilityFlags;
  out.interfaceWord = record.interfaceWord;
  out.interfaceRevision = record.interfaceRevision;
  out.identifier.assign(identifier.data(), strnlen(identifier.data(), identifier.size()));
  return out;
}

}  // namespace refhost
