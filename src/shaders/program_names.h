// Registry names of every GLSL program, and the index of the one the render selects by number.
#pragma once

namespace veltrane {
namespace programs {

inline constexpr char kSplitScreen[] = "splitScreen";
inline constexpr char kCombineBorder[] = "combineBorder";
inline constexpr char kDistanceField[] = "distanceField";
inline constexpr char kLayerAlignment[] = "layerAlignment";
inline constexpr char kClear[] = "glClear";
inline constexpr char kCopy[] = "glCopy";
inline constexpr char kCutPositionControl[] = "SplitScreenCutPositionControl";
inline constexpr char kCutMoveHandle[] = "SplitScreenCutMoveHandle";
inline constexpr char kRotationControl[] = "RotationControl";
inline constexpr char kMoveHandle[] = "MoveHandle";
inline constexpr char kCutHandle[] = "CutHandle";
inline constexpr char kQuadControl[] = "AAQuadControl";
inline constexpr char kDirectionScaleControl[] = "DirectionScaleControl";

// GL start-up builds "splitScreen" first, so the source copy can select it by index.
inline constexpr int kSplitScreenIndex = 0;

}  // namespace programs
}  // namespace veltrane
