// Fills the host's registration record: identity, names, category, version and capabilities.
#pragma once

#include "host/wisp_api.h"

namespace veltrane {

// The registered name: display name, space, and the short name in braces.
constexpr const wchar_t* kRegisteredName = L"Veltrane {split-screen}";
constexpr const wchar_t* kCategory = L"Generate";
constexpr const wchar_t* kVendor = L"Tavrix";
constexpr const char* kPluginIdentifier = "com.tavrix.wisp.veltrane";
constexpr uint32_t kCapabilityFlags = 69;
constexpr uint32_t kInterfaceWord = 144585159;
constexpr uint32_t kInterfaceRevision = 5;

void fillRegistration(PluginRegistration* record);

}  // namespace veltrane
