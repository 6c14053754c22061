// Undo steps: capture parameter states around a bracket of edits and swap them back.
#include "refhost/core/undo.h"

#include <algorithm>

namespace refhost {
namespace {

void restore(ParamPanel& panel, const std::vector<std::pair<std::string, ParamState>>& states) {
  for (const auto& [id, state] : states) {
    if (Param* param = panel.find(id)) param->state = state;
  }
}

}  // namespace

void UndoStack::begin(const std::string& name) {
  if (depth_++ == 0) open_ = Step{name, {}, {}};
}

bool UndoStack::end(const ParamPanel& panel) {
  if (depth_ == 0) return false;
  if (--depth_ > 0) return true;
  for (const auto& entry : open_.before) {
    const Param* param = panel.find(entry.first);
    open_.after.emplace_back(entry.first, param ? param->state : entry.second);
  }
  // A bracket that left every value as it found it (a click that moved nothing) is no step, as
  // in editors: the next undo then undoes something the user sees.
  const bool changed =
      !std::equal(open_.before.begin(), open_.before.end(), open_.after.begin(), open_.after.end());
  if (changed) {
    steps_.push_back(std::move(open_));
    undone_.clear();
  }
  open_ = Step{};
  return true;
}

void UndoStack::noteBefore(const Param& param) {
  if (depth_ == 0) return;
  bool seen = std::any_of(open_.before.begin(), open_.before.end(),
                          [&](const auto& entry) { return entry.first == param.id; });
  if (!seen) open_.before.emplace_back(param.id, param.state);
}

bool UndoStack::undo(ParamPanel& panel) {
  if (depth_ > 0 || steps_.empty()) return false;
  restore(panel, steps_.back().before);
  undone_.push_back(std::move(steps_.back()));
  steps_.pop_back();
  return true;
}

bool UndoStack::redo(ParamPanel& panel) {
  if (depth_ > 0 || undone_.empty()) return false;
  restore(panel, undone_.back().after);
  steps_.push_back(std::move(undone_.back()));
  undone_.pop_back();
  return true;
}

std::vector<std::string> UndoStack::stepNames() const {
  std::vector<std::string> names;
  for (const Step& step : steps_) names.push_back(step.name);
  return names;
}

std::vector<std::string> UndoStack::redoNames() const {
  std::vector<std::string> names;
  for (auto step = undone_.rbegin(); step != undone_.rend(); ++step) names.push_back(step->name);
  return names;
}

}  // namespace refhost
