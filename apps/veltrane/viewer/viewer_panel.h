// The parameter panel: the panel the plug-in declared, drawn with Dear ImGui as collapsible
// groups in declaration order, each parameter with its kind's widget and a keyframe toggle.
#pragma once

#include <vector>

#include "viewer/panel_values.h"
#include "viewer/viewer_session.h"

namespace veltrane_viewer {

// Draws the panel into the current ImGui window; edits go to the session as undo steps.
void drawParameterPanel(ViewerSession& session, const std::vector<LayerOption>& layers);

}  // namespace veltrane_viewer
