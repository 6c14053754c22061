// What the parameter panel makes of a declared parameter: which widget edits it, within what
// range and with what display format, which layers a layer parameter can name, how keyframes
// are toggled at a frame, and the names of the undo steps its edits make.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "refhost/core/params.h"
#include "refhost/engine/composition.h"

namespace veltrane_viewer {

enum class Widget { Slider, Drag, Checkbox, Choice, Colour, Point, Angle, Layer };

// Numbers get a slider when the declared range spans at most this many units, else a drag
// field clamped to the range (a slider over 110,000 frames could not hit a single one).
constexpr double kLongestSliderRange = 1000;

struct NumberWidget {
  Widget widget = Widget::Drag;
  double minimum = 0;  // the declared range; unbounded kinds use the float limits
  double maximum = 0;
  double dragSpeed = 1;  // units per pointer pixel for drag fields
  std::string format;    // printf style, as the widget shows the value ("%.1f px", "%d")
};

Widget widgetFor(const refhost::Param& param);
// For float, int, point and angle parameters.
NumberWidget numberWidget(const refhost::Param& param);
// The value brought into the declared range; NaN becomes the minimum. Kinds without a range
// come back unchanged.
double clampToRange(const refhost::Param& param, double value);
// A choice index that names one of the declared choices (0 when out of range).
int32_t validChoice(const refhost::Param& param, int32_t index);

struct LayerOption {
  std::string guid;
  std::string label;
};
// What a layer parameter can name: no layer (the effect's own input), the own layer and every
// other layer of the composition, in host order.
std::vector<LayerOption> layerOptions(const refhost::Composition& composition);
// The option holding `guid`, or -1.
int layerOptionIndex(const std::vector<LayerOption>& options, const std::string& guid);

enum class KeyState { Static, Animated, KeyHere };
KeyState keyState(const refhost::Param& param, int32_t time);
// The state after a panel edit at `time`: a keyframe there for an animated parameter, a new
// static value otherwise (as the host stores the plug-in's own edits).
refhost::ParamState stateAfterEdit(const refhost::Param& param, int32_t time,
                                   const refhost::ParamValue& value);
// The state after the keyframe toggle at `time`: a static parameter becomes animated with one
// key holding its value; a key at `time` is removed (the last one leaves its value static);
// otherwise a key with the value shown at `time` is added.
refhost::ParamState stateAfterKeyToggle(const refhost::Param& param, int32_t time);

// "Width (Border)": the display name and the group it sits in, as undo steps name it.
std::string paramLabel(const refhost::ParamPanel& panel, const refhost::Param& param);
std::string editStepName(const refhost::ParamPanel& panel, const refhost::Param& param);
std::string keyToggleStepName(const refhost::ParamPanel& panel, const refhost::Param& param,
                              int32_t time);

}  // namespace veltrane_viewer
