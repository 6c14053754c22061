// Undo step names: the host lists them in its undo menu.
#include "controls/undo_names.h"

namespace veltrane {

std::string cutPositionUndoName(int cutIndex) {
  return "Split Screen Cut " + std::to_string(cutIndex + 1) + " Position";
}

std::string cutDirectionUndoName(int cutIndex) {
  return "Split Screen Cut " + std::to_string(cutIndex + 1) + " Direction";
}

std::string inputRotationUndoName(int inputIndex) {
  return "Split Screen Input " + std::to_string(inputIndex) + " Rotation";
}

std::string inputScaleUndoName(int inputIndex) {
  return "Split Screen Input " + std::to_string(inputIndex) + " Scale";
}

std::string inputMoveUndoName(int inputIndex) {
  return "Moved Split Screen Input " + std::to_string(inputIndex);
}

}  // namespace veltrane
