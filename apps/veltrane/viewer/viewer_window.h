// The viewer window: a GLFW window whose OpenGL context the reference host adopts, the picture
// and the plug-in's overlay on a zoomable canvas, the Dear ImGui chrome around it, and the
// event loop that turns the person's pointer and keys into viewer messages.
#pragma once

#include <cstdint>
#include <string>

#include "refhost/gl/gl_context.h"
#include "scene/scene_document.h"

namespace veltrane_viewer {

struct ViewOptions {
  std::string modulePath;
  refhost::GlProfile profile = refhost::GlProfile::Core;
  int32_t frame = 0;
  std::string savePath;  // where Ctrl+S writes: the scene file itself unless given
  bool stats = false;    // print frame and render counts when the window closes
  double uiScale = 0;    // the handles' size factor; 0: from the screen's density
};

// Opens the window on the scene and runs until it is closed. Throws std::runtime_error when no
// window can be opened (no display: the message says so and suggests xvfb-run) and what the
// scene's set-up throws for bad parameter values.
void runViewer(const veltrane_cli::Scene& scene, const ViewOptions& options);

}  // namespace veltrane_viewer
