// Menu bar, side panel (parameters and history), timeline and status line.
#include "viewer/viewer_chrome.h"

#include <imgui.h>

#include <algorithm>
#include <cmath>
#include <cstdio>

#include "layouts/layouts.h"
#include "viewer/viewer_panel.h"

namespace veltrane_viewer {
namespace {

constexpr float kPanelWidth = 400;
constexpr float kHistoryHeight = 170;
constexpr ImGuiWindowFlags kFixedWindow = ImGuiWindowFlags_NoMove | ImGuiWindowFlags_NoResize |
                                          ImGuiWindowFlags_NoCollapse |
                                          ImGuiWindowFlags_NoSavedSettings;
const ImVec4 kFailureText{1.0f, 0.45f, 0.4f, 1.0f};
const ImVec4 kUndoneText{0.55f, 0.55f, 0.55f, 1.0f};

// The handle sizes the View menu offers besides the screen's own.
constexpr double kHandleScales[] = {1, 1.5, 2, 3};

void menuBar(ViewerSession& session, const ChromeState& state, ViewerActions& actions,
             ChromeLayout& layout) {
  if (!ImGui::BeginMainMenuBar()) return;
  layout.menuHeight = ImGui::GetWindowSize().y;
  if (ImGui::BeginMenu("File")) {
    actions.save = ImGui::MenuItem("Save", "Ctrl+S") || actions.save;
    actions.saveAs = ImGui::MenuItem("Save As...", "Ctrl+Shift+S") || actions.saveAs;
    actions.render =
        ImGui::MenuItem("Render...", "Ctrl+R", false, !state.render.running) || actions.render;
    ImGui::Separator();
    actions.quit = ImGui::MenuItem("Quit", "Ctrl+Q") || actions.quit;
    ImGui::EndMenu();
  }
  if (ImGui::BeginMenu("Edit")) {
    bool canUndo = !session.engine().undoStepNames().empty();
    bool canRedo = !session.engine().redoStepNames().empty();
    actions.undo = ImGui::MenuItem("Undo", "Ctrl+Z", false, canUndo) || actions.undo;
    actions.redo = ImGui::MenuItem("Redo", "Ctrl+Shift+Z", false, canRedo) || actions.redo;
    ImGui::EndMenu();
  }
  if (ImGui::BeginMenu("View")) {
    actions.fit = ImGui::MenuItem("Fit", "F") || actions.fit;
    actions.actualPixels = ImGui::MenuItem("Actual Pixels", "1") || actions.actualPixels;
    if (ImGui::BeginMenu("Handle Size")) {
      if (ImGui::MenuItem("As the screen asks", nullptr, !state.handleScaleChosen))
        actions.uiScale = 0;
      for (double scale : kHandleScales) {
        char label[16];
        std::snprintf(label, sizeof label, "%gx", scale);
        if (ImGui::MenuItem(label, nullptr, state.handleScaleChosen && state.handleScale == scale))
          actions.uiScale = scale;
      }
      ImGui::EndMenu();
    }
    ImGui::EndMenu();
  }
  if (ImGui::BeginMenu("Presets")) {
    const std::vector<veltrane_cli::LayoutInfo>& presets = veltrane_cli::layouts();
    for (std::size_t i = 0; i < presets.size(); ++i) {
      if (ImGui::MenuItem(presets[i].menuName)) actions.preset = static_cast<int>(i);
    }
    ImGui::Separator();
    actions.fitPictures = ImGui::MenuItem("Fit pictures to regions") || actions.fitPictures;
    ImGui::EndMenu();
  }
  ImGui::EndMainMenuBar();
}

// The undo history: the scene as opened, the steps done (the last one current) and, greyed,
// the steps undone. A click goes back or forward to that step.
void historyList(ViewerSession& session, ViewerActions& actions) {
  std::vector<std::string> done = session.engine().undoStepNames();
  std::vector<std::string> undone = session.engine().redoStepNames();
  int count = static_cast<int>(done.size());
  if (ImGui::Selectable("(as opened)", done.empty())) actions.undoSteps = count;
  for (int i = 0; i < count; ++i) {
    ImGui::PushID(i);
    if (ImGui::Selectable(done[static_cast<std::size_t>(i)].c_str(), i == count - 1))
      actions.undoSteps = count - 1 - i;
    ImGui::PopID();
  }
  ImGui::PushStyleColor(ImGuiCol_Text, kUndoneText);
  for (std::size_t j = 0; j < undone.size(); ++j) {
    ImGui::PushID(count + static_cast<int>(j));
    if (ImGui::Selectable(undone[j].c_str(), false)) actions.redoSteps = static_cast<int>(j) + 1;
    ImGui::PopID();
  }
  ImGui::PopStyleColor();
}

void sidePanel(ViewerSession& session, const ChromeState& state, float top, float height,
               float windowWidth, ViewerActions& actions) {
  float width = kPanelWidth * state.uiScale;
  ImGui::SetNextWindowPos(ImVec2(windowWidth - width, top));
  ImGui::SetNextWindowSize(ImVec2(width, height));
  ImGui::Begin("Parameters", nullptr, kFixedWindow);
  float historyHeight = std::min(kHistoryHeight * state.uiScale, height * 0.4f);
  ImGui::BeginChild("params", ImVec2(0, -historyHeight));
  drawParameterPanel(session, state.layers);
  ImGui::EndChild();
  ImGui::Separator();
  ImGui::TextUnformatted("History");
  ImGui::BeginChild("history");
  historyList(session, actions);
  ImGui::EndChild();
  ImGui::End();
}

void bottomBar(ViewerSession& session, const ChromeState& state, float windowWidth,
               float windowHeight, ChromeLayout& layout, ViewerActions& actions) {
  const ImGuiStyle& style = ImGui::GetStyle();
  // The timeline, then the status line or a running render's progress bar.
  float rows = 2 * ImGui::GetFrameHeightWithSpacing();
  layout.bottomHeight = rows + 2 * style.WindowPadding.y;
  ImGui::SetNextWindowPos(ImVec2(0, windowHeight - layout.bottomHeight));
  ImGui::SetNextWindowSize(ImVec2(windowWidth - layout.panelWidth, layout.bottomHeight));
  ImGui::Begin("Timeline", nullptr, kFixedWindow | ImGuiWindowFlags_NoTitleBar);
  if (ImGui::Button(state.playing ? "Pause" : "Play", ImVec2(60 * state.uiScale, 0)))
    actions.togglePlay = true;
  ImGui::SameLine();
  std::string time = frameTimeText(session.frame(), state.frameRate);
  ImGui::SetNextItemWidth(std::max(100.0f, ImGui::GetContentRegionAvail().x - 220 * state.uiScale));
  int frame = session.frame();
  if (ImGui::SliderInt("##frame", &frame, 0, std::max(state.duration - 1, 0), "frame %d"))
    actions.frame = frame;
  ImGui::SameLine();
  ImGui::Text("%s  (%d of %d, %g fps)", time.c_str(), session.frame() + 1, state.duration,
              state.frameRate);
  // A note (such as where the scene was saved) holds until the next edit; a failure until the
  // next note. The title bar says the same: modified or not.
  const bool modified = session.modified();
  if (state.render.running) {
    const float share =
        state.render.total > 0 ? static_cast<float>(state.render.done) / state.render.total : 0;
    char text[64];
    std::snprintf(text, sizeof text, "%d/%d", state.render.done, state.render.total);
    if (ImGui::SmallButton("Stop")) actions.stopRender = true;
    ImGui::SameLine();
    ImGui::Text("rendering %s", state.render.output.c_str());
    ImGui::SameLine();
    ImGui::ProgressBar(share, ImVec2(-1, 0), text);
  } else if (!session.status().empty() && (session.statusIsFailure() || !modified)) {
    if (session.statusIsFailure()) ImGui::PushStyleColor(ImGuiCol_Text, kFailureText);
    ImGui::TextUnformatted(session.status().c_str());
    if (session.statusIsFailure()) ImGui::PopStyleColor();
  } else {
    ImGui::Text("%s%s", state.title.c_str(), modified ? " (modified)" : "");
  }
  ImGui::End();
}

}  // namespace

std::string frameTimeText(int32_t frame, double frameRate) {
  double seconds = frameRate > 0 ? frame / frameRate : 0;
  auto hundredths = static_cast<long long>(std::floor(seconds * 100 + 1e-6));
  char text[32];
  std::snprintf(text, sizeof text, "%02lld:%02lld.%02lld", hundredths / 6000, hundredths / 100 % 60,
                hundredths % 100);
  return text;
}

ViewerActions drawChrome(ViewerSession& session, const ChromeState& state, float windowWidth,
                         float windowHeight, ChromeLayout& layout) {
  ViewerActions actions;
  layout.panelWidth = kPanelWidth * state.uiScale;
  menuBar(session, state, actions, layout);
  bottomBar(session, state, windowWidth, windowHeight, layout, actions);
  sidePanel(session, state, layout.menuHeight, windowHeight - layout.menuHeight, windowWidth,
            actions);
  return actions;
}

}  // namespace veltrane_viewer
