// A reference host with the test instruments attached: every operation the plug-in calls is
// logged, and the failures a test asks for are injected.
#pragma once

#include <string>
#include <vector>

#include "refhost/core/host.h"
#include "refhost/core/instruments.h"

namespace testsupport {

class InstrumentedHost : public refhost::Host {
 public:
  InstrumentedHost() { attach(); }
  explicit InstrumentedHost(const refhost::Module& module) : Host(module) { attach(); }

  const std::vector<std::string>& callLog() const { return calls_.lines(); }
  std::vector<std::string> callsTo(const std::string& operation) const {
    return calls_.callsTo(operation);
  }
  void clearCallLog() { calls_.clear(); }
  // Every parameter's state in declaration order, to compare before and after bit for bit.
  std::vector<refhost::ParamState> paramStates() const {
    std::vector<refhost::ParamState> states;
    for (const refhost::Param& param : panel().params()) states.push_back(param.state);
    return states;
  }
  // The cursor shape asked for last; -1 when none was.
  int32_t lastCursor() const { return cursorShapes().empty() ? -1 : cursorShapes().back(); }

  // The k-th declaration call from now on, counted from 1, is refused; 0 refuses none.
  void failDeclarationCall(int k) {
    faults_.failDeclarationAt = k;
    faults_.declarationCalls = 0;
  }
  int declarationCallCount() const { return faults_.declarationCalls; }
  refhost::FaultPlan& faults() { return faults_; }

 private:
  void attach() { setInstruments({&calls_, &faults_}); }

  refhost::CallLog calls_;
  refhost::FaultPlan faults_;
};

}  // namespace testsupport
