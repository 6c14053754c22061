// Opening a dynamic library by its path and finding its exports: dlopen on POSIX, LoadLibrary on
// Windows. The path is opened as given, never looked up through the loader's search path.
#pragma once

#include <string>

namespace refhost {

// The library's handle, or null with the loader's reason in `reason`.
void* openSharedLibrary(const std::string& path, std::string& reason);
// The address of an exported symbol, or null.
void* findSymbol(void* library, const char* name);
void closeSharedLibrary(void* library);

// The running program's own file, or "" when the system does not say.
std::string executablePath();

}  // namespace refhost
