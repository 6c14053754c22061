// The in-memory host of the unit tests: no module and no GL, its panel declared by the effect's
// own declaration, so every parameter reads and writes exactly as a real host serves it.
#pragma once

#include <string>

#include "refhost/core/host.h"
#include "support/instrumented_host.h"

namespace testsupport {

class InMemoryHost : public InstrumentedHost {
 public:
  explicit InMemoryHost(int32_t hostId = 0);
  // Fails the running test for every problem left: an unknown id or a kind mismatch is the
  // plug-in misusing its host.
  ~InMemoryHost();

  // Static values: floats and angles (degrees), ints, bools and choices, points.
  void set(const std::string& id, float value);
  void setInt(const std::string& id, int32_t value);
  void setPoint(const std::string& id, float x, float y);
  // Component `k` of a float, angle, point or colour value.
  float number(const std::string& id, int k = 0) const { return valueAt(id, 0).number[k]; }
  int32_t integer(const std::string& id) const { return valueAt(id, 0).integer; }
  tagWispAPI* record() { return &api(); }
};

}  // namespace testsupport
