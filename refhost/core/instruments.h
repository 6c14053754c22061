// What a test watches and breaks in a host: the log of every operation the plug-in called, and
// the failures it makes the host answer with. Neither is part of the host itself; a test (or a
// command asked for the log) hands them to the host or the engine, and a host given none formats
// no line and fails nothing.
#pragma once

#include <string>
#include <vector>

namespace refhost {

// One line per host operation the plug-in called, in order: the operation's name and its
// arguments (ids and GUIDs bare, display texts quoted, GL enums in hex, pointers to data as
// "data" or "null"), e.g. `SetParamEnabled cutPosition_global 0`.
class CallLog {
 public:
  void record(std::string line) { lines_.push_back(std::move(line)); }
  const std::vector<std::string>& lines() const { return lines_; }
  // The lines of one operation (the text before the first space equals `operation`).
  std::vector<std::string> callsTo(const std::string& operation) const;
  void clear() { lines_.clear(); }

 private:
  std::vector<std::string> lines_;
};

// Host answers a test turns into failures.
struct FaultPlan {
  // The k-th declaration call (BeginParamGroup, EndParamGroup, Add*Param) counted from 1 since
  // the plan was given answers 1 and declares nothing; 0 refuses none.
  int failDeclarationAt = 0;
  int declarationCalls = 0;  // counted by the host
  bool refuseSourceFrames = false;
  bool refuseLayerFrames = false;
  bool failLayerQueries = false;
  bool failTimeInfo = false;

  // Counts one declaration call; true when it is the one to refuse.
  bool refusesNextDeclaration() {
    ++declarationCalls;
    return failDeclarationAt > 0 && declarationCalls == failDeclarationAt;
  }
};

struct HostInstruments {
  CallLog* callLog = nullptr;
  FaultPlan* faults = nullptr;
};

}  // namespace refhost
