// The MLT module: registers the transition and the filter named "veltrane" and the metadata
// that editors read to list them, and guards the start of the encoder they render with.
#include <framework/mlt.h>

#include <string>

#include "consumer_start_guard.h"
#include "mlt_services.h"

namespace {

void* transition(mlt_profile, mlt_service_type, const char*, const void* argument) {
  return veltrane_mlt::makeTransition(static_cast<const char*>(argument));
}

void* filter(mlt_profile, mlt_service_type, const char*, const void* argument) {
  return veltrane_mlt::makeFilter(static_cast<const char*>(argument));
}

// The YAML descriptions are installed in MLT's data folder, under veltrane/.
mlt_properties metadata(mlt_service_type, const char*, void* fileName) {
  const char* data = mlt_environment("MLT_DATA");
  std::string path =
      std::string(data ? data : ".") + "/veltrane/" + static_cast<const char*>(fileName);
  return mlt_properties_parse_yaml(path.c_str());
}

}  // namespace

extern "C" __attribute__((visibility("default"))) MLT_REPOSITORY {
  using veltrane_mlt::kServiceName;
  MLT_REGISTER(mlt_service_transition_type, kServiceName, transition);
  MLT_REGISTER(mlt_service_filter_type, kServiceName, filter);
  MLT_REGISTER_METADATA(mlt_service_transition_type, kServiceName, metadata,
                        const_cast<char*>("transition_veltrane.yml"));
  MLT_REGISTER_METADATA(mlt_service_filter_type, kServiceName, metadata,
                        const_cast<char*>("filter_veltrane.yml"));
  // MLT loads every module of its repository when it starts, so this guards every melt job, and
  // every render of an editor, in a process that has the module installed.
  veltrane_mlt::guardEncoderStarts();
}
