// LoadLibraryEx on the absolute path, so the DLLs it depends on are looked for beside it first.
#include <windows.h>

#include <filesystem>

#include "refhost/platform/shared_library.h"
#include "refhost/platform/text.h"

namespace refhost {

void* openSharedLibrary(const std::string& path, std::string& reason) {
  std::error_code error;
  const std::filesystem::path absolute =
      std::filesystem::absolute(std::filesystem::path(toWide(path)), error);
  HMODULE library = LoadLibraryExW(absolute.c_str(), nullptr, LOAD_WITH_ALTERED_SEARCH_PATH);
  if (!library) {
    const DWORD code = GetLastError();
    wchar_t* text = nullptr;
    FormatMessageW(
        FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS,
        nullptr, code, 0, reinterpret_cast<wchar_t*>(&text), 0, nullptr);
    reason = "Windows error " + std::to_string(code);
    if (text) {
      std::string message = toUtf8(text);
      while (!message.empty() && (message.back() == '\n' || message.back() == '\r'))
        message.pop_back();
      reason += ": " + message;
      LocalFree(text);
    }
  }
  return library;
}

void* findSymbol(void* library, const char* name) {
  return reinterpret_cast<void*>(GetProcAddress(static_cast<HMODULE>(library), name));
}

void closeSharedLibrary(void* library) { FreeLibrary(static_cast<HMODULE>(library)); }

std::string executablePath() {
  std::wstring path(MAX_PATH, L'\0');
  for (;;) {
    const DWORD length = GetModuleFileNameW(nullptr, path.data(), static_cast<DWORD>(path.size()));
    if (length == 0) return "";
    if (length < path.size()) return toUtf8(path.c_str(), length);
    path.resize(path.size() * 2);  // truncated: ask again with more room
  }
}

}  // namespace refhost
