// Registration through five small setters, in the order the host expects them to be applied.
#include "plugin/registration.h"

#include <cstring>
#include <cwchar>

namespace veltrane {
namespace {

// The effect's fixed identity, {6F1C2A94-3B7E-4D05-9A61-C2E8F4B7D013}, in the usual GUID byte
// order: the first three groups little-endian, the last eight bytes as written.
constexpr uint8_t kPluginGuid[16] = {0x94, 0x2A, 0x1C, 0x6F, 0x7E, 0x3B, 0x05, 0x4D,
                                     0x9A, 0x61, 0xC2, 0xE8, 0xF4, 0xB7, 0xD0, 0x13};

constexpr const wchar_t* kNotice =
    L"Veltrane split-screen effect. Copyright (c) Tavrix. All rights reserved.";

// A bounded wide copy that zero-fills the rest of the buffer, as wcsncpy does.
void copyWide(wchar_t* destination, const wchar_t* source, std::size_t capacity) {
  if (destination) std::wcsncpy(destination, source, capacity);
}

void setKind(PluginRegistration* record, uint32_t kind) { record->kind = kind; }

void setGuid(PluginRegistration* record, const uint8_t (&guid)[16]) {
  std::memcpy(record->guid, guid, sizeof guid);
}

void setTexts(PluginRegistration* record, const wchar_t* name, const wchar_t* category,
              const wchar_t* vendor, const wchar_t* notice, const char* identifier) {
  copyWide(record->name, name, kRegistrationNameChars);
  copyWide(record->category, category, kRegistrationCategoryChars);
  copyWide(record->vendor, vendor, kRegistrationVendorChars);
  copyWide(record->notice, notice, kRegistrationNoticeChars);
  record->interfaceWord = kInterfaceWord;
  record->interfaceRevision = kInterfaceRevision;
  if (record->identifier && identifier)
    std::strncpy(record->identifier, identifier, kRegistrationIdentifierChars);
}

void setVersion(PluginRegistration* record, uint32_t major, uint32_t minor, uint32_t patch,
                uint32_t build) {
  record->version[0] = major;
  record->version[1] = minor;
  record->version[2] = patch;
  record->version[3] = build;
}

void setCapabilityFlags(PluginRegistration* record, uint32_t flags) {
  record->capabilityFlags = flags;
}

}  // namespace

void fillRegistration(PluginRegistration* record) {
  if (!record) return;
  setKind(record, 0);
  setGuid(record, kPluginGuid);
  setTexts(record, kRegisteredName, kCategory, kVendor, kNotice, kPluginIdentifier);
  setVersion(record, 1, 2, 0, 0);
  setCapabilityFlags(record, kCapabilityFlags);
}

}  // namespace veltrane
