// The host's undo stack: named steps, each holding the exact state of every parameter it
// changed before and after, so that undo and redo restore values and keyframes bit for bit.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "refhost/core/params.h"

namespace refhost {

class UndoStack {
 public:
  struct Step {
    std::string name;
    // Parameter id with its state before the step's first edit and after its last, in the
    // order the parameters were first edited.
    std::vector<std::pair<std::string, ParamState>> before;
    std::vector<std::pair<std::string, ParamState>> after;
  };

  // Opens a step. A begin inside an open step only deepens the nesting: the edits join the
  // outer step, whose name stands.
  void begin(const std::string& name);
  // Closes the innermost bracket; the outermost closes the step and pushes it, dropping the
  // steps that could have been redone, unless it changed no value (then it is dropped and the
  // redo steps stay). False when no step is open.
  bool end(const ParamPanel& panel);
  bool isOpen() const { return depth_ > 0; }
  // The name the open step was begun with (meaningful while isOpen()).
  const std::string& openStepName() const { return open_.name; }

  // Called before a parameter edit while a step is open; keeps only the first state per id.
  void noteBefore(const Param& param);

  // Restore the panel to before the last step / after the next undone step. False when there
  // is nothing to undo or redo (or a step is open).
  bool undo(ParamPanel& panel);
  bool redo(ParamPanel& panel);

  const std::vector<Step>& steps() const { return steps_; }  // done steps, oldest first
  std::vector<std::string> stepNames() const;
  std::vector<std::string> redoNames() const;  // next redo first

 private:
  std::vector<Step> steps_;
  std::vector<Step> undone_;  // most recently undone last
  Step open_;
  int depth_ = 0;
};

}  // namespace refhost
