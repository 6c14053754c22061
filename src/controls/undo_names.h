// Names of the host undo steps that bracket viewer drags. Cuts are numbered from 1 and inputs
// from 0, as the parameter panel labels them.
#pragma once

#include <string>

namespace veltrane {

constexpr const char* kInsertCutUndoName = "Inserting Cut";

std::string cutPositionUndoName(int cutIndex);
std::string cutDirectionUndoName(int cutIndex);
std::string inputRotationUndoName(int inputIndex);
std::string inputScaleUndoName(int inputIndex);
std::string inputMoveUndoName(int inputIndex);

}  // namespace veltrane
