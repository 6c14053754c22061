// The in-memory host: the reference host with the effect's panel declared.
#include "support/in_memory_host.h"

#include <gtest/gtest.h>

#include "effect/param_declaration.h"

namespace testsupport {

InMemoryHost::InMemoryHost(int32_t hostId) {
  setHostId(hostId);
  veltrane::declareParameters(handle(), &api());
  clearCallLog();
}

InMemoryHost::~InMemoryHost() {
  for (const std::string& problem : problems()) ADD_FAILURE() << "host: " << problem;
}

void InMemoryHost::set(const std::string& id, float value) {
  setValue(id, refhost::ParamValue::ofFloat(value));
}

void InMemoryHost::setInt(const std::string& id, int32_t value) {
  setValue(id, refhost::ParamValue::ofInt(value));
}

void InMemoryHost::setPoint(const std::string& id, float x, float y) {
  setValue(id, refhost::ParamValue::ofPoint(x, y));
}

}  // namespace testsupport
