// Everything around the picture: the menu bar (File, Edit, View, Presets), the side panel
// with the parameters and the undo history, and the bottom bar with the timeline and the
// status line. The chrome only reports what the person asked for; the window acts on it.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "viewer/panel_values.h"
#include "viewer/viewer_session.h"

namespace veltrane_viewer {

struct ViewerActions {
  bool save = false;
  bool saveAs = false;
  bool render = false;
  bool stopRender = false;
  bool quit = false;
  bool fit = false;
  bool actualPixels = false;
  bool undo = false;
  bool redo = false;
  bool togglePlay = false;
  int preset = -1;  // index into veltrane_cli::layouts()
  bool fitPictures = false;
  int undoSteps = 0;    // how many steps the history list asked to undo
  int redoSteps = 0;    // or to redo
  int32_t frame = -1;   // the frame the timeline moved to
  double uiScale = -1;  // the handle size chosen in the View menu; 0: the screen's own
};

// The chrome's size in window units (ImGui's), which fixes the picture area.
struct ChromeLayout {
  float menuHeight = 0;
  float panelWidth = 0;
  float bottomHeight = 0;
};

// A render running in the background, shown in the bottom bar.
struct RenderProgress {
  bool running = false;
  std::string output;
  int done = 0;
  int total = 0;
};

struct ChromeState {
  std::string title;  // the file Save writes, shown in the status line
  bool playing = false;
  double frameRate = 25;
  int32_t duration = 1;
  std::vector<LayerOption> layers;
  float uiScale = 1;               // the display's content scale: the chrome grows with it
  double handleScale = 1;          // the UI scale handed to the plug-in for its handles
  bool handleScaleChosen = false;  // chosen by the person rather than the screen's
  RenderProgress render;
};

// Draws the chrome into the current ImGui frame of a window of the given size and returns what
// was asked for; `layout` receives the chrome's size.
ViewerActions drawChrome(ViewerSession& session, const ChromeState& state, float windowWidth,
                         float windowHeight, ChromeLayout& layout);

// "00:01.24": minutes, seconds and hundredths of the frame's time.
std::string frameTimeText(int32_t frame, double frameRate);

}  // namespace veltrane_viewer
