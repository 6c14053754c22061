// The module's only two exports: PluginInfo and Notify, with C linkage.
#include "host/wisp_api.h"
#include "plugin/dispatch.h"
#include "plugin/registration.h"

#ifdef _WIN32
#define VELTRANE_EXPORT extern "C" __declspec(dllexport)
#else
#define VELTRANE_EXPORT extern "C" __attribute__((visibility("default")))
#endif

VELTRANE_EXPORT void PluginInfo(void*, void*, PluginRegistration* record) {
  veltrane::fillRegistration(record);
}

VELTRANE_EXPORT int32_t Notify(WispHost* host, tagWispAPI* api, int32_t message) {
  return veltrane::dispatchMessage(host, api, message);
}
